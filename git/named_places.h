#pragma once

#include <string>
#include <vector>

namespace vexel_yaml {

/// Where a conflict is, as records and as people say it.
struct NamedPlace {
  std::string place;  ///< Such as "12.Light.m_Intensity".
  std::string name;   ///< Such as "Level01/Lamp Post > Light > m_Intensity".

  /// The name at the beginning of a conflict's line.
  static std::string NameIn(const std::string& line);
};

/// Whether somebody means this place: by a pattern for it, its name or the end of that, or by an object that
/// it is in.
bool IsMeant(const NamedPlace& place, const std::string& wanted);

/// What somebody may have meant who has named none of these places, as a question; where nothing is near,
/// what there is.
std::string SuggestionFor(const std::string& wanted, const std::vector<NamedPlace>& places);

}  // namespace vexel_yaml
