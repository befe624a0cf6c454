#include "git/side_names.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include "git/git_call.h"
#include "git/work_files.h"
#include "report/value_text.h"

#ifdef __APPLE__
extern char** environ;
#endif

namespace vexel_yaml {

namespace {

constexpr size_t kMostOfName = 60;

bool IsHash(std::string_view text) {
  return text.size() >= 40 && text.find_first_not_of("0123456789abcdef") == std::string_view::npos;
}

// Git names a commit that was given by its hash by that.
std::string Readable(std::string_view name) {
  return IsHash(name) ? std::string(name.substr(0, 10)) : Shortened(OnOneLine(name), kMostOfName);
}

std::string FirstLine(const std::string& path) {
  const std::string text = TextOf(path);
  return text.substr(0, text.find('\n'));
}

std::string WithoutPrefix(const std::string& name, std::string_view prefix) {
  return name.starts_with(prefix) ? name.substr(prefix.size()) : name;
}

// The branch whose tip a commit is, or else the commit.
std::string BranchAt(const std::string& commit) {
  if (commit.empty()) return {};
  const ProgramResult branches = GitQuietly({"for-each-ref", "--count=1", "--format=%(refname:short)",
                                             "--points-at=" + commit, "refs/heads", "refs/remotes"});
  const std::string branch = Line(branches);
  return Readable(branch.empty() ? commit : branch);
}

// A line of a list of steps: a word, a commit, and its subject, before which newer versions of git put "# ".
struct Step {
  std::string word;
  std::string commit;
  std::string subject;
};

Step StepIn(const std::string& line) {
  const size_t word = std::min(line.find(' '), line.size());
  const size_t commit = std::min(line.find(' ', word + 1), line.size());
  if (commit <= word) return {line, {}, {}};
  const std::string subject = commit < line.size() ? line.substr(commit + 1) : std::string();
  return {line.substr(0, word), line.substr(word + 1, commit - word - 1), WithoutPrefix(subject, "# ")};
}

std::string Quoted(const std::string& subject) {
  return '"' + Shortened(OnOneLine(subject), kMostOfName) + '"';
}

std::string MergedHead() {
  constexpr std::string_view kVariable = "GITHEAD_";
  std::string name;
  for (char** variable = environ; *variable != nullptr; ++variable) {
    const std::string_view text = *variable;
    if (!text.starts_with(kVariable)) continue;
    if (!name.empty()) return {};
    name = Readable(text.substr(std::min(text.find('=') + 1, text.size())));
  }
  return name;
}

SideNames InRebase(const Repository& repository, const std::string& folder) {
  const std::string branch =
      Readable(WithoutPrefix(FirstLine(repository.Path(folder + "/head-name")), "refs/heads/"));
  const std::vector<std::string> done = Pieces(TextOf(repository.Path(folder + "/done")), '\n');
  const std::string subject = done.empty() ? std::string() : StepIn(done.back()).subject;
  return {(subject.empty() ? "a commit" : Quoted(subject)) + " of " + branch + ", which is rebased",
          BranchAt(FirstLine(repository.Path(folder + "/onto"))) + ", its new base"};
}

std::string Picked(const Step& step) {
  const std::string commit = step.subject.empty() ? Readable(step.commit) : Quoted(step.subject);
  return step.word == "revert" ? "without " + commit : commit;
}

}  // namespace

SideNames FindSideNames(const Repository& repository) {
  if (const std::string head = MergedHead(); !head.empty()) return {head, {}};
  for (const char* folder : {"rebase-merge", "rebase-apply"}) {
    if (IsFile(repository.Path(std::string(folder) + "/head-name"))) return InRebase(repository, folder);
  }
  if (const std::string step = FirstLine(repository.Path("sequencer/todo")); !step.empty())
    return {Picked(StepIn(step)), {}};
  // Once a merge has stopped.
  if (const std::string head = FirstLine(repository.Path("MERGE_HEAD")); !head.empty())
    return {BranchAt(head), {}};
  for (const auto& [file, word] :
       {std::pair("CHERRY_PICK_HEAD", "pick"), std::pair("REVERT_HEAD", "revert")}) {
    const std::string head = FirstLine(repository.Path(file));
    if (!head.empty()) return {Picked({word, head, {}}), {}};
  }
  return {};
}

}  // namespace vexel_yaml
