#pragma once

#include <cstdint>
#include <string_view>

#include "yaml/yaml_mapping.h"

namespace vexel_yaml {

/// Where every object in the written style starts, counted from the directives on, as libyaml does.
inline constexpr uint32_t kLineOfWrittenObject = 2;

/// The object whose text is `document`, for which `IsInWrittenStyle` must have held and which holds no blank
/// behind the colon of an empty value; without its pseudo keys, owned by the caller. The very tree, with
/// hashes and lines, that libyaml's nodes would be turned into, in a tenth of the time.
YAMLMapping* ReadWrittenObject(std::string_view document);

}  // namespace vexel_yaml
