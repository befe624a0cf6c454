#include "scene_plan.h"

#include <array>
#include <cstddef>

namespace {

// Ten groups form a cluster as a level designer would build one, six levels deep. The clusters hang on
// one another's last group, five on each, which gives a scene of a million objects about 40 levels.
constexpr uint64_t kClusterSize = 10;
constexpr uint64_t kClusterFanOut = 5;
constexpr std::array<uint64_t, kClusterSize> kParentInCluster = {0, 0, 0, 1, 1, 3, 3, 5, 5, 7};
constexpr std::array<bool, kClusterSize> kIsLeafInCluster = {false, false, true,  false, true,
                                                             false, true,  false, true,  false};

// How the edited share is spent, so that it comes out near what was asked for: a removed group takes six
// documents away, an added one brings four, and both change the list of children of the group above.
constexpr double kChangedDocuments = 0.8;
constexpr double kRemovedLeafGroups = 0.25;
constexpr double kAddedGroups = 0.15;
constexpr double kChangedByBoth = 0.02;
constexpr uint64_t kTailGroups = 3;

enum Question : uint64_t { kChanged = 1'000'000, kShared, kField, kRemoved, kAdded };

uint64_t Mix(uint64_t value) {
  value += 0x9E3779B97F4A7C15;
  value = (value ^ (value >> 30)) * 0xBF58476D1CE4E5B9;
  value = (value ^ (value >> 27)) * 0x94D049BB133111EB;
  return value ^ (value >> 31);
}

// Left takes the lowest part of the range, right the next one: never the same element.
bool IsDrawnBy(Version version, double drawn, double share) {
  switch (version) {
    case Version::kBase:
      return false;
    case Version::kLeft:
      return drawn < share;
    case Version::kRight:
      return drawn >= share && drawn < 2 * share;
  }
  return false;
}

}  // namespace

ScenePlan::ScenePlan(uint64_t objects, double edited_share, uint64_t seed)
    : objects_(objects),
      edited_share_(edited_share == 1 ? 0 : edited_share),
      is_all_edited_(edited_share == 1),
      seed_(Mix(seed)) {}

uint64_t ScenePlan::TailCount(Version version) const {
  return version == Version::kBase || edited_share_ == 0 ? 0 : kTailGroups;
}

uint64_t ScenePlan::AddedSlot(Version version, uint64_t group, uint64_t document) {
  return (static_cast<uint64_t>(version) << 40) + Slot(group, document);
}

std::string ScenePlan::FileID(uint64_t slot) {
  constexpr uint64_t kOddFactor = 0x5851F42D4C957F2D;  // odd, so that no two slots share a remainder
  const uint64_t scattered = (slot + 1) * kOddFactor;
  const bool is_small = slot < (uint64_t{1} << 31) && (slot / kGroupSize) % 8 != 3;
  if (is_small) return std::to_string(scattered % (uint64_t{1} << 31));
  const std::string digits = std::to_string(scattered % (uint64_t{1} << 59) + (uint64_t{1} << 60));
  return slot % 2 == 0 ? digits : "-" + digits;
}

std::optional<uint64_t> ScenePlan::ParentOf(uint64_t group) const {
  const uint64_t cluster = group / kClusterSize;
  const uint64_t place = group % kClusterSize;
  if (place != 0) return cluster * kClusterSize + kParentInCluster[place];
  if (cluster == 0) return std::nullopt;
  return (cluster - 1) / kClusterFanOut * kClusterSize + kClusterSize - 1;
}

std::vector<uint64_t> ScenePlan::ChildrenOf(uint64_t group) const {
  std::vector<uint64_t> children;
  const auto add_if_present = [&](uint64_t child) {
    if (child < group_count()) children.push_back(child);
  };
  const uint64_t cluster = group / kClusterSize;
  const uint64_t place = group % kClusterSize;
  for (size_t i = 1; i < kClusterSize; ++i) {
    if (kParentInCluster[i] == place) add_if_present(cluster * kClusterSize + i);
  }
  if (place != kClusterSize - 1) return children;
  for (uint64_t i = 1; i <= kClusterFanOut; ++i) {
    add_if_present((cluster * kClusterFanOut + i) * kClusterSize);
  }
  return children;
}

bool ScenePlan::IsRemoved(uint64_t group, Version version) const {
  if (!kIsLeafInCluster[group % kClusterSize]) return false;
  return IsDrawnBy(version, Chance(Slot(group, 0), kRemoved), kRemovedLeafGroups * edited_share_);
}

bool ScenePlan::IsRemovedByAnySide(uint64_t group) const {
  return IsRemoved(group, Version::kLeft) || IsRemoved(group, Version::kRight);
}

bool ScenePlan::AddsChild(uint64_t group, Version version) const {
  if (IsRemovedByAnySide(group)) return false;
  return IsDrawnBy(version, Chance(Slot(group, 0), kAdded), kAddedGroups * edited_share_);
}

int ScenePlan::EditOf(uint64_t slot, Version version) const {
  if (version == Version::kBase || slot >= objects_) return 0;
  const double drawn = Chance(slot, kChanged);
  const double share = kChangedDocuments * edited_share_;
  const bool is_edited = is_all_edited_ || (drawn < 2 * share && !IsRemovedByAnySide(slot / kGroupSize));
  if (!is_edited) return 0;
  const uint64_t field = Random(slot, kField);
  if (is_all_edited_ || Chance(slot, kShared) < kChangedByBoth) {
    return static_cast<int>(field % 2) + (version == Version::kLeft ? 1 : 3);
  }
  return IsDrawnBy(version, drawn, share) ? static_cast<int>(field % 4) + 1 : 0;
}

uint64_t ScenePlan::Random(uint64_t slot, uint64_t field) const {
  return Mix(seed_ ^ Mix(slot * 0x100000001B3 + field));
}

double ScenePlan::Chance(uint64_t slot, uint64_t question) const {
  constexpr double kRange = 9007199254740992.0;  // 2 to the power 53: what a double holds exactly
  return static_cast<double>(Random(slot, question) >> 11) / kRange;
}
