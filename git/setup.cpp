#include "git/setup.h"

#include <unistd.h>

#include <cstdlib>
#include <sstream>

#include "git/git_call.h"
#include "git/repository.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

// To be raised with each change of what textconv prints: git keeps that, and tells old from new by the
// command alone.
constexpr std::string_view kTextconvFormat = "1";

// The last one is the file that git's own script opens at the end, which has them all in a variable.
constexpr std::string_view kMergetoolArguments =
    " mergetool \"$BASE\" \"$LOCAL\" \"$REMOTE\" \"$MERGED\" \"$(printf %s \"$files\" | tail -n 1)\"";

std::string Variable(const char* name) {
  const char* value = std::getenv(name);
  return value == nullptr ? std::string() : std::string(value);
}

std::string UserFolder() {
  const std::string folder = Variable("XDG_CONFIG_HOME");
  return (folder.empty() ? GetUserHomeDir() + "/.config" : folder) + "/git";
}

// Where a shell would find the program of this name; empty where it wouldn't.
std::string InPath(const std::string& name) {
  for (const std::string& folder : Pieces(Variable("PATH"), ':')) {
    std::string path = (folder.empty() ? "." : folder) + "/" + name;
    if (IsFile(path) && access(path.c_str(), X_OK) == 0) return path;
  }
  return {};
}

// In a driver, git replaces what follows a percent sign.
std::string Doubled(std::string text) {
  for (size_t at = 0; (at = text.find('%', at)) != std::string::npos; at += 2) text.insert(at, 1, '%');
  return text;
}

// Without the program, git would take ours as the result, without a marker. A graphical client has a short
// PATH, and programs are moved and removed. A shell that can't run one gives 126 or 127.
std::string DriverCommand(const std::string& call, const std::string& option) {
  const std::string program = Doubled(call);
  return "f() { if command -v " + program + " >/dev/null 2>&1; then " + program + " merge-driver " + option +
         "\"$@\"; s=$?; [ $s = 126 ] || [ $s = 127 ] || exit $s; fi; echo " +
         Doubled(ShellQuoted("error: " + call + " is not found or cannot be run: merged as text")) +
         " >&2; git merge-file -q --marker-size=\"$4\" -L ours -L base -L theirs \"$2\" \"$1\" \"$3\" || "
         "exit 1; }; "
         "f %O %A %B %L %P";
}

std::string Between(const std::string& text, std::string_view before, std::string_view after) {
  const size_t end = text.find(after);
  if (!text.starts_with(before) || end == std::string::npos || end < before.size()) return {};
  return text.substr(before.size(), end - before.size());
}

std::string Halved(std::string text) {
  for (size_t at = 0; (at = text.find("%%", at)) != std::string::npos; ++at) text.erase(at, 1);
  return text;
}

}  // namespace

SetupPlaces SetupPlaces::Find(bool is_global) {
  if (!is_global) {
    GoToTop();
    const Repository repository;
    return {false, "--local", ".gitattributes", repository.CommonPath("config"),
            SetupState(repository.CommonPath("vexel-merge"))};
  }
  if (GetUserHomeDir().empty()) throw CommandError("HOME is not set");
  const SetupState state(UserFolder() + "/vexel-merge");
  const std::optional<std::string> attributes = state.Recall("attributes.path");
  std::string config = Variable("GIT_CONFIG_GLOBAL");
  if (config.empty()) config = GetUserHomeDir() + "/.gitconfig";
  if (!FileExists(config) && FileExists(UserFolder() + "/config")) config = UserFolder() + "/config";
  return {true, "--global", attributes ? *attributes : UserAttributes(), config, state};
}

std::string UserAttributes() {
  if (GetUserHomeDir().empty()) return {};
  const ProgramResult set =
      Git({"config", "--global", "--includes", "--type=path", "--get", "core.attributesFile"});
  return set.status == 0 ? Line(set) : UserFolder() + "/attributes";
}

// The running one may be that with the page, which stands beside it.
std::string OurProgram() { return TargetOf(GetDataFilesDir() + "vexel-merge-git"); }

std::string CommandForGit() {
  const std::string name = "vexel-merge-git";
  const std::string found = InPath(name);
  const std::string program = OurProgram();
  return !found.empty() && TargetOf(found) == program ? name : ShellQuoted(program);
}

// hideResolved would hand the merge tool files that git has half merged already, as text. Without the
// function, git could show no difference at all once the program is gone.
std::vector<std::pair<std::string, std::string>> WantedConfiguration() {
  const std::string call = CommandForGit();
  // Git keeps what textconv made in a commit of its own: without a name for its author, every diff would
  // fail.
  const bool has_author = GitQuietly({"var", "GIT_COMMITTER_IDENT"}).status == 0;
  return {{"merge.vexel.name", "structural merge of scenes and prefabs"},
          {"merge.vexel.driver", DriverCommand(call, "")},
          {"merge.vexel.recursive", "vexel-ancestor"},
          {"merge.vexel-ancestor.name", "structural merge of common ancestors"},
          {"merge.vexel-ancestor.driver", DriverCommand(call, "--ancestor ")},
          {"diff.vexel.textconv", "f() { " + call + " textconv --format=" + std::string(kTextconvFormat) +
                                      " \"$1\" 2>/dev/null || cat -- \"$1\"; }; f"},
          {"diff.vexel.cachetextconv", has_author ? "true" : "false"},
          {"diff.vexel.xfuncname", "^--- (.*)$"},
          {"mergetool.vexel.cmd", call + std::string(kMergetoolArguments)},
          {"mergetool.vexel.trustExitCode", "true"},
          {"mergetool.vexel.hideResolved", "false"}};
}

std::string CommandIn(const std::string& value) {
  if (value.find("vexel-merge-git") == std::string::npos) return {};
  for (const auto& [before, after] :
       {std::pair("f() { if command -v ", " >/dev/null"), std::pair("", " merge-driver ")}) {
    if (const std::string call = Between(value, before, after); !call.empty()) return Halved(call);
  }
  for (const auto& [before, after] : {std::pair("f() { ", " textconv "), std::pair("", " mergetool ")}) {
    if (std::string call = Between(value, before, after); !call.empty()) return call;
  }
  return value;
}

std::vector<std::string> GivenPatterns(const std::string& path) {
  std::vector<std::string> patterns;
  for (const std::string& line : Pieces(TextOf(path), '\n')) {
    std::istringstream words(line);
    std::string pattern;
    std::string attribute;
    if (line.starts_with('#') || !(words >> pattern)) continue;
    while (words >> attribute) {
      if (attribute != "merge=vexel") continue;
      patterns.push_back(pattern);
      break;
    }
  }
  return patterns;
}

std::string Joined(const std::vector<std::string>& texts) {
  std::string joined;
  for (const std::string& text : texts) joined += (joined.empty() ? "" : " ") + text;
  return joined;
}

}  // namespace vexel_yaml
