#include "report/readable_headers.h"

#include <new>
#include <optional>

#include "report/object_names.h"
#include "report/value_text.h"
#include "yaml/asset_text.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

std::string Quoted(const std::string& name) { return '"' + OnOneLine(name) + '"'; }

// The line without its end, rewritten where it is an object's header.
std::string ReadableHeader(std::string_view line, const ObjectNames& names) {
  constexpr std::string_view kStripped = " stripped";
  const size_t mark = line.find(" &");
  if (mark == std::string_view::npos) return std::string(line);
  const std::string_view file_id = line.substr(mark + 2, line.find(' ', mark + 2) - mark - 2);
  const YAMLScalar* object = YAMLScalar::Lookup(file_id);
  const std::string class_name = OnOneLine(names.GetClass(object));
  if (class_name.empty()) return std::string(line);
  std::string header = "--- " + class_name + " &" + std::string(file_id);
  if (const std::string own = names.GetOwnName(object); !own.empty()) {
    header += " " + Quoted(own);
  } else if (const std::string owner = names.GetOwnerName(object); !owner.empty()) {
    header += " of " + Quoted(owner);
  }
  if (line.ends_with(kStripped)) header += kStripped;
  return header;
}

// The text with the names; nothing where it is no asset.
std::optional<std::string> WithReadableHeaders(const std::string& text) {
  try {
    VexelObjects objects;
    // The parser could not even start.
    if (!ParseYAMLString(text, objects)) throw std::bad_alloc();
    const ObjectNames names({&objects});
    const AssetText asset(text);
    std::string result(asset.GetHeader());
    for (const std::string_view document : asset.GetDocuments()) {
      const std::string_view line = document.substr(0, document.find_first_of("\r\n"));
      result += ReadableHeader(line, names);
      result += document.substr(line.size());
    }
    return result;
  } catch (const YAMLError&) {
    return std::nullopt;
  }
}

}  // namespace

void WriteWithReadableHeaders(std::ostream& out, const std::string& text) {
  const std::optional<std::string> readable = WithReadableHeaders(text);
  out << (readable ? *readable : text);
}

}  // namespace vexel_yaml
