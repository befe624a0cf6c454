#include "git/named_places.h"

#include <algorithm>

#include "git/decided_lines.h"
#include "platform/edit_distance.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kBetween = " > ";

// The name, the objects that the place is in, and the field, as far as the name has them.
std::vector<std::string> NamesOf(const NamedPlace& place) {
  std::string name = place.name;
  std::vector<std::string> names = {name};
  // What tells two of one name apart.
  const std::string suffix = " (" + place.place + ")";
  if (name.ends_with(suffix)) names.push_back(name = name.substr(0, name.size() - suffix.size()));
  for (size_t at = name.find(kBetween); at != std::string::npos; at = name.find(kBetween, at + 1)) {
    names.push_back(name.substr(0, at));
    names.push_back(name.substr(at + kBetween.size()));
  }
  const std::string object = name.substr(0, name.find(kBetween));
  names.push_back(object.substr(object.rfind('/') + 1));
  return names;
}

}  // namespace

std::string NamedPlace::NameIn(const std::string& line) {
  return line.substr(0, std::min({line.find(": was "), line.find(": theirs"), line.size()}));
}

bool IsMeant(const NamedPlace& place, const std::string& wanted) {
  if (wanted.empty() || FitsPattern(place.place, wanted)) return true;
  return std::ranges::count(NamesOf(place), wanted) > 0;
}

std::string SuggestionFor(const std::string& wanted, const std::vector<NamedPlace>& places) {
  std::string nearest;
  size_t distance = std::max<size_t>(wanted.size() / 2, 3);
  for (const NamedPlace& place : places) {
    std::vector<std::string> names = NamesOf(place);
    names.push_back(place.place);
    for (const std::string& name : names) {
      const size_t found = EditDistance(wanted, name);
      if (found >= distance) continue;
      distance = found;
      nearest = name;
    }
  }
  return nearest.empty() ? nearest : "; did you mean '" + nearest + "'?";
}

}  // namespace vexel_yaml
