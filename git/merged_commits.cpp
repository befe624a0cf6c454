#include "git/merged_commits.h"

#include <algorithm>
#include <iterator>

#include "git/git_call.h"
#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

// The path of the file; empty where the commit has none.
std::string WriteVersion(const std::string& commit, const std::string& name, const std::string& asset,
                         ScratchFolder& scratch) {
  const ProgramResult version = GitQuietly({"cat-file", "--filters", commit + ":" + asset});
  return version.status == 0 ? scratch.Write(name, version.output) : std::string();
}

}  // namespace

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
  return merged;
}

std::vector<std::string> ChangedPaths(const std::string& from, const std::string& to,
                                      const std::vector<std::string>& paths) {
  ProgramCall call = GitCall({"diff", "-z", "--name-only", "--no-relative", "--no-renames", from, to, "--"});
  call.arguments.insert(call.arguments.end(), paths.begin(), paths.end());
  call.with = {"GIT_LITERAL_PATHSPECS=1"};
  std::vector<std::string> changed = Pieces(RunProgram(call).output, '\0');
  std::ranges::sort(changed);
  return changed;
}

std::vector<std::string> ChangedOnBothSides(const MergedCommits& merged,
                                            const std::vector<std::string>& paths) {
  std::vector<std::string> both;
  std::ranges::set_intersection(ChangedPaths(merged.base, merged.ours, paths),
                                ChangedPaths(merged.base, merged.theirs, paths), std::back_inserter(both));
  return both;
}

bool WriteVersions(const MergedCommits& merged, const std::string& asset, ScratchFolder& scratch,
                   AssetVersions& versions) {
  scratch.Clear();
  versions = {asset, WriteVersion(merged.base, "base " + ShortHash(merged.base), asset, scratch),
              WriteVersion(merged.theirs, "left " + ShortHash(merged.theirs), asset, scratch),
              WriteVersion(merged.ours, "right " + ShortHash(merged.ours), asset, scratch)};
  return !versions.base.empty() && !versions.left.empty() && !versions.right.empty();
}

std::string ShortHash(const std::string& commit) { return Line(Git({"rev-parse", "--short", commit})); }

}  // namespace vexel_yaml
