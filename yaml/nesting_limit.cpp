#include "yaml/nesting_limit.h"

#include <yaml.h>

#include "yaml/convert_document.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

// An upper bound of the nesting depth that costs one pass over the bytes: every flow collection has its
// opening bracket, and of block collections at most two start at one column, a list level with its key.
bool IsSurelyShallow(std::string_view text) {
  size_t brackets = 0;
  size_t widest_indent = 0;
  size_t indent = 0;
  bool at_line_start = true;
  for (const char c : text) {
    if (c == '\n' || c == '\r') {
      indent = 0;
      at_line_start = true;
    } else if (at_line_start && (c == ' ' || c == '-' || c == '?' || c == ':' || c == '\t')) {
      if (++indent > widest_indent) widest_indent = indent;
    } else {
      at_line_start = false;
      brackets += c == '[' || c == '{' ? 1 : 0;
    }
  }
  return brackets + 2 * widest_indent + 2 < DocumentConverter::kDeepest;
}

class EventReader {
 public:
  explicit EventReader(std::string_view text) {
    initialized_ = yaml_parser_initialize(&parser_) != 0;
    if (!initialized_) return;
    yaml_parser_set_input_string(&parser_, reinterpret_cast<const unsigned char*>(text.data()), text.size());
  }
  EventReader(const EventReader&) = delete;
  EventReader& operator=(const EventReader&) = delete;
  ~EventReader() {
    if (initialized_) yaml_parser_delete(&parser_);
  }

  // The next event's kind; the end of the stream also where the text is wrong.
  yaml_event_type_t Next() {
    yaml_event_t event;
    if (!initialized_ || yaml_parser_parse(&parser_, &event) == 0) return YAML_STREAM_END_EVENT;
    const yaml_event_type_t type = event.type;
    yaml_event_delete(&event);
    return type;
  }

 private:
  yaml_parser_t parser_ = {};
  bool initialized_ = false;
};

}  // namespace

void CheckNestingDepth(std::string_view text) {
  if (IsSurelyShallow(text)) return;
  EventReader reader(text);
  size_t depth = 0;
  for (yaml_event_type_t type = reader.Next();
       type != YAML_STREAM_END_EVENT && type != YAML_DOCUMENT_END_EVENT; type = reader.Next()) {
    if (type == YAML_MAPPING_START_EVENT || type == YAML_SEQUENCE_START_EVENT) {
      if (++depth > DocumentConverter::kDeepest) throw YAMLError("YAML nesting is deeper than 1000 levels");
    } else if (type == YAML_MAPPING_END_EVENT || type == YAML_SEQUENCE_END_EVENT) {
      --depth;
    }
  }
}

}  // namespace vexel_yaml
