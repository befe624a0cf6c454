#include "git/side_people.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include "git/git_call.h"
#include "git/work_files.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

// The authors of what happened from one commit to another, the latest first.
std::string WithAuthors(const std::string& from, const std::string& to, const std::string& asset,
                        const std::string& name) {
  constexpr size_t kMostAuthors = 2;
  const std::vector<std::string> authors = Authors(from + ".." + to, {asset});
  std::string text;
  for (size_t i = 0; i < std::min(authors.size(), kMostAuthors); ++i) text += authors[i] + ", ";
  if (authors.size() > kMostAuthors) text += "..., ";
  return text + name;
}

std::vector<std::string> AnswerLines(std::vector<std::string> arguments) {
  return Pieces(RunProgram(QuietCall(std::move(arguments))).output, '\n');
}

// The branches that match, the one that has stood still for longest first: it has the least besides.
std::vector<std::string> Branches(std::vector<std::string> conditions) {
  std::vector<std::string> call = {"for-each-ref", "--sort=committerdate", "--format=%(refname)"};
  call.insert(call.end(), conditions.begin(), conditions.end());
  call.insert(call.end(), {"refs/heads", "refs/remotes"});
  std::vector<std::string> branches = AnswerLines(std::move(call));
  // A name for another one of them.
  std::erase_if(branches, [](const std::string& branch) { return branch.ends_with("/HEAD"); });
  return branches;
}

std::string ShortBranch(std::string_view branch) {
  for (const std::string_view folder : {"refs/heads/", "refs/remotes/"}) {
    if (branch.starts_with(folder)) branch.remove_prefix(folder.size());
  }
  return OnOneLine(branch);
}

std::string BranchMerged(const MergedCommits& merged) {
  const auto branches = Branches({"--contains=" + merged.theirs, "--no-contains=" + merged.commit});
  return branches.empty() ? std::string() : ShortBranch(branches.front());
}

// The branch that the merge was made on: only its first parents lead there. Others may have begun there
// since.
std::string BranchMergedInto(const MergedCommits& merged) {
  constexpr size_t kMostToAsk = 4;
  std::vector<std::string> branches = AnswerLines({"symbolic-ref", "--quiet", "HEAD"});
  const std::vector<std::string> others = Branches({"--contains=" + merged.commit});
  branches.insert(branches.end(), others.begin(), others.end());
  branches.resize(std::min(branches.size(), kMostToAsk));
  const auto found = std::ranges::find_if(branches, [&](const std::string& branch) {
    const auto names =
        AnswerLines({"name-rev", "--name-only", "--no-undefined", "--refs=" + branch, merged.commit});
    return !names.empty() && names.front().find('^') == std::string::npos;
  });
  return found == branches.end() ? std::string() : ShortBranch(*found);
}

}  // namespace

SideNames WithPeople(SideNames names, const Repository& repository, const std::string& asset) {
  if (names.ours.empty())
    names.ours = Line(RunProgram(QuietCall({"symbolic-ref", "--quiet", "--short", "HEAD"})));
  if (!IsFile(repository.Path("MERGE_HEAD"))) return names;
  return {WithAuthors("HEAD", "MERGE_HEAD", asset, names.theirs),
          WithAuthors("MERGE_HEAD", "HEAD", asset, names.ours)};
}

SideNames BranchesOf(const MergedCommits& merged) {
  const std::string message =
      Line(RunProgram(QuietCall({"show", "--no-patch", "--format=%s", merged.commit})));
  SideNames names = NamesInMessage(message);
  // That one was named by its hash, or counted from another one.
  if (message.starts_with("Merge commit ")) names.theirs.clear();
  if (names.theirs.empty()) names.theirs = BranchMerged(merged);
  if (names.theirs.empty()) names.theirs = ShortHash(merged.theirs);
  if (names.ours.empty()) names.ours = BranchMergedInto(merged);
  if (names.ours.empty()) names.ours = ShortHash(merged.ours);
  return names;
}

SideNames PeopleBehind(const MergedCommits& merged, const SideNames& branches, const std::string& asset) {
  return {WithAuthors(merged.ours, merged.theirs, asset, branches.theirs),
          WithAuthors(merged.theirs, merged.ours, asset, branches.ours)};
}

}  // namespace vexel_yaml
