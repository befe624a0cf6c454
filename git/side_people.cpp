#include "git/side_people.h"

#include <algorithm>
#include <vector>

#include "git/git_call.h"
#include "git/work_files.h"

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

}  // namespace

SideNames WithPeople(SideNames names, const Repository& repository, const std::string& asset) {
  if (names.ours.empty())
    names.ours = Line(RunProgram(QuietCall({"symbolic-ref", "--quiet", "--short", "HEAD"})));
  if (!IsFile(repository.Path("MERGE_HEAD"))) return names;
  return {WithAuthors("HEAD", "MERGE_HEAD", asset, names.theirs),
          WithAuthors("MERGE_HEAD", "HEAD", asset, names.ours)};
}

SideNames PeopleBehind(const MergedCommits& merged, const std::string& asset) {
  return {WithAuthors(merged.ours, merged.theirs, asset, ShortHash(merged.theirs)),
          WithAuthors(merged.theirs, merged.ours, asset, ShortHash(merged.ours))};
}

}  // namespace vexel_yaml
