#include "report/list_order.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace vexel_yaml {

namespace {

constexpr std::string_view kOthers = "\u2026";
constexpr size_t kMostInOrder = 6;

// The place in the changed list from which on, and that before which, something stands elsewhere than before.
std::pair<size_t, size_t> ChangedPart(const std::vector<uint32_t>& origins, size_t from_size,
                                      size_t to_size) {
  size_t begin = 0;
  while (begin < to_size && origins[begin] == begin) ++begin;
  size_t end = to_size;
  while (end > begin && from_size + end >= to_size && origins[end - 1] == from_size + end - 1 - to_size)
    --end;
  return {begin, end};
}

}  // namespace

std::vector<uint32_t> Origins(const YAMLSequenceRemapper* remapper, size_t from_size, size_t to_size) {
  std::vector<uint32_t> origins(std::max(from_size, to_size), YAMLSequenceRemapper::kDropped);
  if (remapper == nullptr) {
    for (size_t i = 0; i < from_size; ++i) origins[i] = static_cast<uint32_t>(i);
    return origins;
  }
  const std::vector<uint32_t>& mapping = remapper->GetMapping();
  for (size_t i = 0; i < mapping.size(); ++i) {
    if (mapping[i] < origins.size()) origins[mapping[i]] = static_cast<uint32_t>(i);
  }
  return origins;
}

// All but a longest row of elements that have kept their order.
std::set<size_t> FindMoved(const std::vector<uint32_t>& origins, size_t to_size) {
  std::set<size_t> moved;
  // For each length, the place at which the best row of this length ends.
  std::vector<size_t> ends;
  std::vector<size_t> before(to_size, to_size);
  for (size_t i = 0; i < to_size; ++i) {
    if (origins[i] == YAMLSequenceRemapper::kDropped) continue;
    moved.insert(i);
    const auto end = std::ranges::lower_bound(ends, origins[i], {}, [&](size_t at) { return origins[at]; });
    if (end != ends.begin()) before[i] = *std::prev(end);
    if (end == ends.end()) {
      ends.push_back(i);
    } else {
      *end = i;
    }
  }
  for (size_t at = ends.empty() ? to_size : ends.back(); at < to_size; at = before[at]) moved.erase(at);
  return moved;
}

std::string Elided(const std::vector<std::string>& list, const std::set<size_t>& shown) {
  std::string text;
  bool is_elided = false;
  for (size_t i = 0; i < list.size(); ++i) {
    const bool was_elided = std::exchange(is_elided, !shown.contains(i));
    if (is_elided && was_elided) continue;
    text.append(text.empty() ? "" : ", ").append(is_elided ? kOthers : list[i]);
  }
  return text;
}

std::string OrderText(const std::vector<std::string>& list, const std::vector<uint32_t>& origins,
                      size_t from_size) {
  const auto [begin, end] = ChangedPart(origins, from_size, list.size());
  if (end - begin > kMostInOrder) {
    std::set<size_t> shown;
    for (const size_t place : FindMoved(origins, list.size())) {
      if (place > 0) shown.insert(place - 1);
      shown.insert({place, place + 1});
    }
    return Elided(list, shown);
  }
  std::string text = begin > 0 ? std::string(kOthers) : std::string();
  for (size_t i = begin; i < end; ++i) text += (text.empty() ? "" : ", ") + list[i];
  return end < list.size() ? text + ", " + std::string(kOthers) : text;
}

}  // namespace vexel_yaml
