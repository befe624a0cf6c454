#include "git/git_call.h"

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>

#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

constexpr int kNotRun = 127;

}  // namespace

ProgramCall GitCall(std::vector<std::string> arguments) {
  arguments.insert(arguments.begin(), "git");
  return {.arguments = std::move(arguments)};
}

ProgramCall QuietCall(std::vector<std::string> arguments) {
  ProgramCall call = GitCall(std::move(arguments));
  call.errors = ProgramCall::Errors::kDropped;
  return call;
}

ProgramResult Answered(ProgramResult result) {
  if (result.status == kNotRun) throw CommandError("git cannot be run, or its answer not be read");
  return result;
}

ProgramResult Ask(const ProgramCall& call) { return Answered(RunProgram(call)); }

std::string Answer(const ProgramCall& call) {
  ProgramResult result = Ask(call);
  if (result.status != 0) throw Refusal();
  return std::move(result.output);
}

ProgramResult Git(std::vector<std::string> arguments) { return Ask(GitCall(std::move(arguments))); }

ProgramResult GitQuietly(std::vector<std::string> arguments) { return Ask(QuietCall(std::move(arguments))); }

std::string Line(const ProgramResult& result) {
  return result.output.ends_with('\n') ? result.output.substr(0, result.output.size() - 1) : result.output;
}

std::vector<std::string> Pieces(std::string_view text, char end) {
  std::vector<std::string> pieces;
  while (!text.empty()) {
    const size_t at = std::min(text.find(end), text.size());
    pieces.emplace_back(text.substr(0, at));
    text.remove_prefix(std::min(at + 1, text.size()));
  }
  return pieces;
}

std::optional<std::vector<std::string>> UnmergedBelow(const std::vector<std::string>& pathspecs,
                                                      bool in_users_index) {
  ProgramCall call = GitCall({"ls-files", "-z", "--unmerged", "--full-name", "--"});
  call.arguments.insert(call.arguments.end(), pathspecs.begin(), pathspecs.end());
  if (!in_users_index) call.without = {kIndexVariable};
  const ProgramResult result = Ask(call);
  if (result.status != 0) return std::nullopt;
  std::vector<std::string> paths;
  for (const std::string& entry : Pieces(result.output, '\0')) {
    // Mode, blob and stage stand before a tab.
    paths.push_back(entry.substr(entry.find('\t') + 1));
  }
  std::ranges::sort(paths);
  paths.erase(std::unique(paths.begin(), paths.end()), paths.end());
  return paths;
}

std::vector<std::string> OursAmong(const std::vector<std::string>& paths, const std::string& top) {
  if (paths.empty()) return {};
  ProgramCall call = GitCall({"-C", top, "check-attr", "-z", "--stdin", "merge"});
  call.input.emplace();
  for (const std::string& path : paths) call.input->append(path).push_back('\0');
  const std::vector<std::string> fields = Pieces(Answer(call), '\0');
  std::vector<std::string> ours;
  // Path, attribute and value, three by three.
  for (size_t i = 0; i + 2 < fields.size(); i += 3) {
    if (fields[i + 2] == "vexel") ours.push_back(fields[i]);
  }
  return ours;
}

std::string TopFolder() {
  const ProgramResult result = Git({"rev-parse", "--show-toplevel"});
  if (result.status != 0) throw Refusal();
  return Line(result);
}

void GoToTop() {
  const std::string top = TopFolder();
  // From there, relative ones would lead to another repository.
  for (const char* name : {"GIT_DIR", "GIT_COMMON_DIR", "GIT_WORK_TREE"}) {
    const char* path = std::getenv(name);
    if (path != nullptr && *path != '\0' && *path != '/') {
      setenv(name, std::filesystem::absolute(path).c_str(), 1);
    }
  }
  if (chdir(top.c_str()) != 0) throw CommandError("cannot go to " + top);
}

ProgramCall HashCall(const std::string& path, std::string text) {
  ProgramCall call = QuietCall({"hash-object", "--path=" + path, "--stdin"});
  call.input = std::move(text);
  return call;
}

CommandError Refusal() { return CommandError("", kGitRefused); }

std::string HashIn(const ProgramResult& result) { return result.status == 0 ? Line(result) : std::string(); }

}  // namespace vexel_yaml
