#include "git/merged_commits.h"

#include <algorithm>
#include <set>

#include "git/git_call.h"
#include "git/shown_text.h"

namespace vexel_yaml {

std::string WriteVersion(const std::string& commit, const std::string& name, const std::string& asset,
                         ScratchFolder& scratch) {
  const ProgramResult version = GitQuietly({"cat-file", "--filters", commit + ":" + asset});
  return version.status == 0 ? scratch.Write(name, version.output) : std::string();
}

namespace {

std::map<std::string, std::string> Renamed(const std::string& from, const std::string& to) {
  const std::vector<std::string> fields = Pieces(
      Answer(GitCall({"diff", "-z", "-M", "--diff-filter=R", "--name-status", "--no-relative", from, to})),
      '\0');
  std::map<std::string, std::string> renamed;
  // How much is the same, the old name and the new one, three by three.
  for (size_t i = 0; i + 2 < fields.size(); i += 3) renamed.emplace(fields[i + 2], fields[i + 1]);
  return renamed;
}

// What a side calls a file of base.
std::string NewName(const std::map<std::string, std::string>& renamed, const std::string& name) {
  const auto found = std::ranges::find(renamed, name, [](const auto& names) { return names.second; });
  return found == renamed.end() ? name : found->first;
}

// By base's names.
std::set<std::string> ChangedBy(const MergedCommits& merged, const std::string& side,
                                const std::vector<std::string>& paths) {
  std::set<std::string> changed;
  for (const std::string& path : ChangedPaths(merged.base, side, paths))
    changed.insert(OldName(merged, path));
  return changed;
}

}  // namespace

std::string OldName(const MergedCommits& merged, const std::string& name) {
  for (const auto* renamed : {&merged.renamed_by_ours, &merged.renamed_by_theirs}) {
    const auto found = renamed->find(name);
    if (found != renamed->end()) return found->second;
  }
  return name;
}

std::string FindCommit(const std::string& name) {
  const ProgramResult found =
      Git({"rev-parse", "--verify", "--quiet", "--end-of-options", name + "^{commit}"});
  if (found.status != 0) throw CommandError("'" + name + "' is not a commit");
  return Line(found);
}

MergedCommits FindMerged(const std::string& name) {
  MergedCommits merged = {FindCommit(name), {}, {}, {}};
  const std::vector<std::string> parents =
      Pieces(Line(Git({"rev-list", "--parents", "-n", "1", merged.commit})), ' ');
  if (parents.size() != 3) throw CommandError(merged.commit + " is not a merge of two commits");
  merged.ours = parents[1];
  merged.theirs = parents[2];
  const ProgramResult base = Git({"merge-base", merged.ours, merged.theirs});
  if (base.status != 0) throw CommandError("the parents of " + merged.commit + " have no common ancestor");
  merged.base = Line(base);
  FindRenamed(merged);
  return merged;
}

void FindRenamed(MergedCommits& merged) {
  merged.renamed_by_ours = Renamed(merged.base, merged.ours);
  merged.renamed_by_theirs = Renamed(merged.base, merged.theirs);
}

std::vector<std::string> ChangedPaths(const std::string& from, const std::string& to,
                                      const std::vector<std::string>& paths) {
  ProgramCall call = GitCall({"diff", "-z", "--name-only", "--no-relative", "--no-renames", from});
  if (!to.empty()) call.arguments.push_back(to);
  call.arguments.emplace_back("--");
  call.arguments.insert(call.arguments.end(), paths.begin(), paths.end());
  call.with = {"GIT_LITERAL_PATHSPECS=1"};
  std::vector<std::string> changed = Pieces(Answer(call), '\0');
  std::ranges::sort(changed);
  return changed;
}

std::vector<std::string> ChangedOnBothSides(const MergedCommits& merged,
                                            const std::vector<std::string>& paths) {
  const std::set<std::string> ours = ChangedBy(merged, merged.ours, {});
  const std::set<std::string> theirs = ChangedBy(merged, merged.theirs, {});
  std::set<std::string> named = ChangedBy(merged, merged.ours, paths);
  if (!paths.empty()) named.merge(ChangedBy(merged, merged.theirs, paths));
  std::vector<std::string> both;
  for (const std::string& name : named) {
    if (!ours.contains(name) || !theirs.contains(name)) continue;
    const std::string by_ours = NewName(merged.renamed_by_ours, name);
    both.push_back(by_ours == name ? NewName(merged.renamed_by_theirs, name) : by_ours);
  }
  return both;
}

bool WriteVersions(const MergedCommits& merged, const std::string& asset, ScratchFolder& scratch,
                   AssetVersions& versions) {
  scratch.Clear();
  const std::string name = OldName(merged, asset);
  const std::string theirs = NewName(merged.renamed_by_theirs, name);
  const std::string ours = NewName(merged.renamed_by_ours, name);
  versions = {asset, WriteVersion(merged.base, "base " + ShortHash(merged.base), name, scratch),
              WriteVersion(merged.theirs, "left " + ShortHash(merged.theirs), theirs, scratch),
              WriteVersion(merged.ours, "right " + ShortHash(merged.ours), ours, scratch)};
  return !versions.base.empty() && !versions.left.empty() && !versions.right.empty();
}

std::vector<std::string> Authors(const std::string& range, const std::vector<std::string>& paths) {
  std::vector<std::string> arguments = {"--literal-pathspecs", "log", "-z", "--format=%an", range, "--"};
  arguments.insert(arguments.end(), paths.begin(), paths.end());
  std::vector<std::string> authors;
  for (std::string& name : Pieces(Git(std::move(arguments)).output, '\0')) {
    if (std::ranges::find(authors, name) == authors.end()) authors.push_back(std::move(name));
  }
  return authors;
}

std::string ShortHash(const std::string& commit) { return Line(Git({"rev-parse", "--short", commit})); }

}  // namespace vexel_yaml
