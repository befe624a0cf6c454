#include <gtest/gtest.h>

#include <cstdlib>

#include "app/lost_edits.h"
#include "app/random_scenes.h"
#include "diff/yaml_mapping_diff.h"
#include "scene/settle_values.h"
#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

constexpr const char* kRules = R"([arrays]
set *.GameObject.m_Component *.fileID
set *.Transform.m_Children fileID
plain *.GameObject.m_Tags
[exclusions]
exclude *.MonoBehaviour.targets
)";

bool IsNobodysPlace(const FieldPath& /*path*/) { return false; }

YAMLMapping* ObjectOf(VexelObjects& scene, const YAMLScalar* file_id) {
  YAMLNode* object = scene.Get(file_id);
  return object == nullptr ? nullptr : object->AsMapping();
}

std::unique_ptr<VexelObjects> Copy(const VexelObjects& scene) {
  return std::unique_ptr<VexelObjects>(scene.Clone());
}

// Settles copies of three versions, object by object, and merges them.
std::unique_ptr<VexelObjects> Merged(const VexelObjects& base, const VexelObjects& left,
                                     const VexelObjects& right, RecordingConflictResolver& resolver) {
  const auto b = Copy(base), l = Copy(left), r = Copy(right);
  SceneVersions versions = {*b, *l, *r};
  for (const auto& [file_id, object] : left) {
    YAMLMapping *in_base = ObjectOf(*b, file_id), *in_right = ObjectOf(*r, file_id);
    if (in_right == nullptr) continue;
    const ResolverPathStep step(resolver, file_id);
    if (in_base == nullptr) {
      SettleAddedObject(versions, file_id, IsNobodysPlace, resolver);
    } else {
      SettleValues(*in_base, *ObjectOf(*l, file_id), *in_right, IsNobodysPlace, resolver);
    }
  }
  YAMLMappingDiff::Merge(*YAMLMappingDiff::Diff(*b, *l), *YAMLMappingDiff::Diff(*b, *r), resolver)->Apply(*b);
  return Copy(*b);
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
    const auto merged = Merged(base, left, right, resolver);
    size_t excused = 0;
    EXPECT_FALSE(IsAnythingLost(base, left, right, *merged, resolver, &excused));
    EXPECT_FALSE(IsAnythingLost(base, right, left, *merged, resolver, &excused));
    EXPECT_EQ(excused, 0U);
    const auto same = Merged(base, left, left, equal);
    EXPECT_FALSE(equal.HasPendingConflicts());
    EXPECT_EQ(Content(same.get()), Content(&left));
    for (const auto& [file_id, object] : left) EXPECT_TRUE(same->Get(file_id)->HasSameContent(*object));
    if (HasFailure()) return;
  }
}

}  // namespace
}  // namespace vexel_yaml
