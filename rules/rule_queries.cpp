#include <algorithm>

#include "rules/yaml_sequence_remapper.h"

namespace vexel_yaml {

namespace {

// The entry of a rule table that counts for `path`: the first in file order.
template <typename Info>
const Info* FindRule(const std::vector<Info>& rules, const FieldPath& path) {
  const auto found =
      std::ranges::find_if(rules, [&](const Info& rule) { return MatchesPattern(rule.path, path); });
  return found == rules.end() ? nullptr : &*found;
}

}  // namespace

bool MatchesPattern(const FieldPath& pattern, const FieldPath& path) {
  return std::ranges::equal(pattern, path, [](const YAMLScalar* expected, const YAMLScalar* component) {
    return expected == YAMLScalar::star || expected == component;
  });
}

const std::vector<FieldPath>& YAMLSequenceRemapper::ChooseKeyPaths(const FieldPath& path) {
  if (path.size() == 1 && path[0] == YAMLScalar::underscore) return defaultDirectPath;
  const SequenceInfo* rule = FindRule(s_ArrayUniqueKeyMap, path);
  if (rule == nullptr) return defaultPath;
  return rule->type == SequenceType::Plain ? noPaths : rule->keys;
}

bool YAMLSequenceRemapper::IsMergeablePath(const FieldPath& path) {
  const ExclusionPathInfo* rule = FindExclusion(path);
  return rule == nullptr || rule->mergeable;
}

bool YAMLSequenceRemapper::IsMergeablePath(const FieldPath& path, const YAMLNode* node, bool& matched) {
  const auto holds_scalar = [&](const FieldPath& key) {
    const YAMLNode* value = GetYAMLNodeFieldByPath(node, key);
    return value != nullptr && value->AsScalar() != nullptr;
  };
  const auto rule = std::ranges::find_if(s_DiffExclusionFieldPaths, [&](const ExclusionInfo& candidate) {
    return MatchesPattern(candidate.path, path) && std::ranges::all_of(candidate.keys, holds_scalar);
  });
  matched = rule != s_DiffExclusionFieldPaths.end();
  return !matched || rule->mergeable;
}

const ComparisonInfo* YAMLSequenceRemapper::FindComparison(const FieldPath& path) {
  return FindRule(s_ComparisonFieldPaths, path);
}

const ExclusionPathInfo* YAMLSequenceRemapper::FindExclusion(const FieldPath& path) {
  return FindRule(s_ExclusionFieldPaths, path);
}

}  // namespace vexel_yaml
