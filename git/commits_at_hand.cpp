#include "git/commits_at_hand.h"

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

CommitsAtHand::CommitsAtHand(const Repository& repository, const std::string& path) {
  for (const std::string& commit : Commits(repository)) {
    if (!commit.empty()) objects_.emplace_back(commit).append(":").append(path);
  }
  if (path.find('\n') != std::string::npos) return;
  ProgramCall call = GitCall({"cat-file", "--batch-check=%(objecttype)"});
  call.errors = ProgramCall::Errors::kDropped;
  call.input.emplace();
  for (const std::string& object : objects_) call.input->append(object).push_back('\n');
  list_.emplace(call);
}

bool CommitsAtHand::HaveIt() {
  if (!list_) {
    return std::ranges::any_of(objects_, [](const std::string& object) {
      return GitQuietly({"cat-file", "-e", object}).status == 0;
    });
  }
  // Of what isn't there, git repeats the name.
  return std::ranges::any_of(Pieces(list_->Wait().output, '\n'), [](const std::string& line) {
    return line == "blob" || line == "tree" || line == "commit";
  });
}

}  // namespace vexel_yaml
