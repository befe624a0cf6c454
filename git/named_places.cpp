#include "git/named_places.h"

#include <algorithm>
#include <cctype>

#include "git/decided_lines.h"
#include "git/shown_text.h"
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

// The letters and digits alone, in lower case.
std::string Bare(const std::string& name) {
  std::string bare;
  for (const char c : name) {
    if (std::isalnum(static_cast<unsigned char>(c)) != 0)
      bare += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  }
  return bare;
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
  // A label of the page, or a part of a name, says as much as a name that is nearly the same.
  std::vector<std::string> with_it;
  std::string nearest;
  size_t distance = std::max<size_t>(wanted.size() / 2, 3);
  for (const NamedPlace& place : places) {
    std::vector<std::string> names = NamesOf(place);
    names.push_back(place.place);
    std::string shortest;
    for (const std::string& name : names) {
      const bool is_shorter = shortest.empty() || name.size() < shortest.size();
      if (is_shorter && Bare(name).find(Bare(wanted)) != std::string::npos) shortest = name;
      const size_t found = EditDistance(wanted, name);
      if (found >= distance) continue;
      distance = found;
      nearest = name;
    }
    const bool is_new = std::ranges::find(with_it, shortest) == with_it.end();
    if (!shortest.empty() && is_new) with_it.push_back(shortest);
  }
  if (nearest.empty() && with_it.size() == 1) nearest = with_it.front();
  if (!nearest.empty()) return "; did you mean '" + nearest + "'?";
  std::vector<std::string> all;
  for (const NamedPlace& place : places) all.push_back(place.name);
  if (all.empty()) return {};
  return with_it.empty() ? "; in conflict: " + ListOf(all)
                         : "; did you mean one of these? " + ListOf(with_it);
}

}  // namespace vexel_yaml
