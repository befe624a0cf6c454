#include "git/name_in_use.h"

#include <unistd.h>

#include <algorithm>
#include <string_view>

#include "git/git_call.h"
#include "git/work_files.h"

#ifdef __APPLE__
extern char** environ;
#endif

namespace vexel_yaml {

namespace {

// The letters of a hash that `text` begins with.
std::string HashAt(std::string_view text) {
  return std::string(text.substr(0, std::min(text.find_first_not_of("0123456789abcdef"), text.size())));
}

ProgramCall Quiet(std::vector<std::string> arguments) {
  ProgramCall call = QuietCall(std::move(arguments));
  // A command of the user may be at work on another index.
  call.without = {kIndexVariable};
  return call;
}

std::vector<std::string> Commits(const Repository& repository) {
  std::vector<std::string> commits = {"MERGE_HEAD", "CHERRY_PICK_HEAD", "REVERT_HEAD", "REBASE_HEAD"};
  constexpr std::string_view kVariable = "GITHEAD_";
  for (char** variable = environ; *variable != nullptr; ++variable) {
    const std::string_view text = *variable;
    if (text.starts_with(kVariable)) commits.push_back(HashAt(text.substr(kVariable.size())));
  }
  // Its last line is the one that is being done: a word and a commit.
  const std::vector<std::string> done = Pieces(TextOf(repository.Path("rebase-merge/done")), '\n');
  if (!done.empty()) commits.push_back(HashAt(done.back().substr(done.back().find(' ') + 1)));
  return commits;
}

}  // namespace

NameInUse::NameInUse(const Repository& repository, const std::string& path) {
  // The index has files, in four stages, and no folders.
  for (const char* place : {"HEAD:", ":0:", ":1:", ":2:", ":3:"}) objects_.push_back(place + path);
  for (const std::string& commit : Commits(repository)) {
    if (!commit.empty()) objects_.emplace_back(commit).append(":").append(path);
  }
  if (path.find('\n') != std::string::npos) return;
  ProgramCall call = Quiet({"cat-file", "--batch-check=%(objecttype)"});
  call.input.emplace();
  for (const std::string& object : objects_) call.input->append(object).push_back('\n');
  list_.emplace(call);
}

bool NameInUse::Get() {
  if (!list_) {
    return std::ranges::any_of(objects_, [](const std::string& object) {
      return Ask(Quiet({"cat-file", "-e", object})).status == 0;
    });
  }
  const std::vector<std::string> types = Pieces(Answered(list_->Wait()).output, '\n');
  // A file of the last commit that is no longer in the index is none of the repository's.
  if (!types.empty() && types.front() == "tree") return true;
  return std::any_of(types.begin() + (types.empty() ? 0 : 1), types.end(), [](const std::string& type) {
    // Of what isn't there, git repeats the name.
    return type == "blob" || type == "tree" || type == "commit";
  });
}

}  // namespace vexel_yaml
