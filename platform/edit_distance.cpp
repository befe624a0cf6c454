#include "platform/edit_distance.h"

#include <algorithm>
#include <cctype>
#include <numeric>
#include <utility>
#include <vector>

namespace vexel_yaml {

size_t EditDistance(std::string_view a, std::string_view b) {
  const auto same = [](char x, char y) {
    return std::tolower(static_cast<unsigned char>(x)) == std::tolower(static_cast<unsigned char>(y));
  };
  // distances[j]: from the part of `a` gone through so far to the first j characters of `b`.
  std::vector<size_t> distances(b.size() + 1);
  std::iota(distances.begin(), distances.end(), size_t{0});
  for (size_t i = 0; i < a.size(); ++i) {
    size_t diagonal = std::exchange(distances[0], i + 1);
    for (size_t j = 0; j < b.size(); ++j) {
      const size_t replaced = diagonal + (same(a[i], b[j]) ? 0 : 1);
      diagonal = distances[j + 1];
      distances[j + 1] = std::min({replaced, diagonal + 1, distances[j] + 1});
    }
  }
  return distances[b.size()];
}

}  // namespace vexel_yaml
