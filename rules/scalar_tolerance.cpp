#include "rules/scalar_tolerance.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace vexel_yaml {

namespace {

bool IsWithinTolerance(const ComparisonInfo& rule, float a, float b) {
  if (!(rule.relativeTolerance > 0) || !(rule.absoluteTolerance > 0)) return false;
  if (a == b) return true;
  const float magnitude = std::min(std::abs(a) + std::abs(b), std::numeric_limits<float>::max());
  return std::abs(a - b) < std::max(rule.absoluteTolerance, rule.relativeTolerance * magnitude);
}

}  // namespace

bool AreSameScalars(const FieldPath& path, const YAMLScalar& a, const YAMLScalar& b) {
  if (a.Equals(&b)) return true;
  const ComparisonInfo* rule = YAMLSequenceRemapper::FindComparison(path);
  return rule != nullptr && IsWithinTolerance(*rule, a.GetFloatValue(), b.GetFloatValue());
}

}  // namespace vexel_yaml
