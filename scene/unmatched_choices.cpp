#include "scene/unmatched_choices.h"

#include <algorithm>

#include "platform/edit_distance.h"
#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

namespace {

// A file of old choices must not take longer than the merge.
constexpr size_t kMostNamed = 10;

std::vector<std::string> ExistingPaths(const RecordingConflictResolver& resolver,
                                       const VexelObjects& merged) {
  std::vector<std::string> paths;
  for (const RecordingConflictResolver::Record& record : resolver.GetRecords()) {
    paths.push_back(PathToString(record.path));
  }
  for (const YAMLMapping::Slot& slot : merged) paths.push_back(slot.key->GetText());
  return paths;
}

// Null where none is nearer than a path of other words.
const std::string* FindNearest(const std::string& path, const std::vector<std::string>& existing) {
  const std::string* nearest = nullptr;
  // Of a short file ID one digit may be wrong.
  size_t distance = std::max<size_t>(path.size() / 2, 2);
  for (const std::string& candidate : existing) {
    const auto [shorter, longer] = std::minmax({candidate.size(), path.size()});
    if (longer - shorter >= distance) continue;
    const size_t found = EditDistance(path, candidate);
    if (found >= distance) continue;
    distance = found;
    nearest = &candidate;
  }
  return nearest;
}

}  // namespace

std::vector<std::string> DescribeUnmatchedChoices(const RecordingConflictResolver& resolver,
                                                  const VexelObjects& merged) {
  std::vector<FieldPath> unmatched = resolver.FindUnmatchedPatterns();
  std::erase_if(unmatched, [](const FieldPath& pattern) {
    return std::ranges::all_of(pattern, [](const YAMLScalar* key) { return key == YAMLScalar::star; });
  });
  if (unmatched.empty()) return {};
  const std::vector<std::string> existing = ExistingPaths(resolver, merged);
  std::vector<std::string> lines;
  for (const FieldPath& pattern : unmatched) {
    if (lines.size() == kMostNamed) {
      lines.push_back("Warning: " + std::to_string(unmatched.size() - kMostNamed) +
                      " more choices match nothing");
      break;
    }
    const std::string path = PathToString(pattern);
    const std::string* nearest = FindNearest(path, existing);
    lines.push_back("Warning: the choice for '" + path + "' matches nothing" +
                    (nearest == nullptr ? "" : "; did you mean '" + *nearest + "'?"));
  }
  return lines;
}

}  // namespace vexel_yaml
