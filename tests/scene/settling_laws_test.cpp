#include <gtest/gtest.h>

#include <cstdlib>

#include "app/lost_edits.h"
#include "app/random_scenes.h"
#include "diff/yaml_mapping_diff.h"
#include "scene/settle_values.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

constexpr const char* kRules =
    "[arrays]\nset *.GameObject.m_Component *.fileID\nplain *.GameObject.m_Tags\n"
    "[exclusions]\nexclude *.MonoBehaviour.targets\n";

bool IsNobodysPlace(const FieldPath& /*path*/) { return false; }

using Scene = std::unique_ptr<VexelObjects>;

// Settles copies of three versions, object by object, and merges them.
Scene Merged(const VexelObjects& base, const VexelObjects& left, const VexelObjects& right,
             RecordingConflictResolver& resolver) {
  Scene b(base.Clone());
  const Scene l(left.Clone()), r(right.Clone());
  SceneVersions versions = {*b, *l, *r};
  for (const auto& [file_id, object] : left) {
    if (!right.HasKey(file_id)) continue;
    const ResolverPathStep step(resolver, file_id);
    if (!base.HasKey(file_id)) {
      SettleAddedObject(versions, file_id, IsNobodysPlace, resolver);
    } else {
      SettleValues(*b->Get(file_id)->AsMapping(), *l->Get(file_id)->AsMapping(),
                   *r->Get(file_id)->AsMapping(), IsNobodysPlace, resolver);
    }
  }
  YAMLMappingDiff::Merge(*YAMLMappingDiff::Diff(*b, *l), *YAMLMappingDiff::Diff(*b, *r), resolver)->Apply(*b);
  return b;
}

TEST(SettlingLaws, NoEditIsLostAndEqualSidesGiveThatSide) {
  const ScopedRules rules(kRules);
  const char* count = std::getenv("VEXEL_SETTLED_TRIPLES");
  const uint32_t triples = count == nullptr ? 400 : static_cast<uint32_t>(std::atoi(count));
  for (uint32_t seed = 0; seed < triples; ++seed) {
    SCOPED_TRACE(seed);
    const SceneTriple triple = RandomTriple(seed);
    const VexelObjects &base = *triple.base, &left = *triple.left, &right = *triple.right;
    RecordingConflictResolver resolver(MergeResolve::kBase), equal(MergeResolve::kBase);
    const Scene merged = Merged(base, left, right, resolver);
    size_t excused = 0;
    EXPECT_FALSE(IsAnythingLost(base, left, right, *merged, resolver, &excused));
    EXPECT_FALSE(IsAnythingLost(base, right, left, *merged, resolver, &excused));
    EXPECT_EQ(excused, 0U);
    const Scene same = Merged(base, left, left, equal);
    EXPECT_FALSE(equal.HasPendingConflicts());
    EXPECT_EQ(Content(same.get()), Content(&left));
    for (const auto& [file_id, object] : left) EXPECT_TRUE(same->Get(file_id)->HasSameContent(*object));
    if (HasFailure()) return;
  }
}

}  // namespace
}  // namespace vexel_yaml
