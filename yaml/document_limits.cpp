#include "yaml/document_limits.h"

#include <yaml.h>

#include <string>
#include <unordered_map>
#include <vector>

#include "yaml/convert_document.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostAnchors = 10'000;

// Whether one pass over the bytes shows that nothing is near a limit. Of the nesting depth it makes an upper
// bound: every flow collection has its opening bracket, and of block collections at most two start at one
// column, a list level with its key. The one anchor is the object's file ID.
bool IsSurelyHarmless(std::string_view text) {
  size_t brackets = 0;
  size_t anchors = 0;
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
      anchors += c == '&' ? 1 : 0;
    }
  }
  return anchors <= 1 && brackets + 2 * widest_indent + 2 < DocumentConverter::kDeepest;
}

// Counts what loading a document would make, without making it.
class DocumentCount {
 public:
  void StartCollection(const yaml_char_t* anchor) {
    if (open_.size() == DocumentConverter::kDeepest) {
      throw YAMLError("YAML nesting is deeper than 1000 levels");
    }
    open_.push_back({TakeAnchor(anchor), 1});
  }

  void EndCollection() {
    const Node node = open_.back();
    open_.pop_back();
    Add(node);
  }

  void AddScalar(const yaml_char_t* anchor) { Add({TakeAnchor(anchor), 1}); }

  void AddAlias(const yaml_char_t* anchor) {
    const auto found = sizes_.find(reinterpret_cast<const char*>(anchor));
    Add({"", found == sizes_.end() ? 1 : found->second});
  }

 private:
  struct Node {
    std::string anchor;
    size_t size;
  };

  std::string TakeAnchor(const yaml_char_t* anchor) {
    if (anchor == nullptr) return {};
    if (++anchors_ > kMostAnchors) throw YAMLError("YAML document holds more than 10000 anchors");
    return reinterpret_cast<const char*>(anchor);
  }

  void Add(const Node& node) {
    if (!node.anchor.empty()) sizes_[node.anchor] = node.size;
    if (open_.empty()) return;
    open_.back().size += node.size;
    if (open_.back().size > DocumentConverter::kMostNodes) {
      throw YAMLError("YAML aliases expand to more than 10000000 nodes");
    }
  }

  std::vector<Node> open_;
  std::unordered_map<std::string, size_t> sizes_;
  size_t anchors_ = 0;
};

// Reads the events of a text; holds libyaml's objects over exceptions.
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
    yaml_event_delete(&event_);
    if (initialized_) yaml_parser_delete(&parser_);
  }

  // The next event of the document, null at its end and where the text is wrong.
  const yaml_event_t* Next() {
    yaml_event_delete(&event_);
    if (!initialized_ || yaml_parser_parse(&parser_, &event_) == 0) return nullptr;
    const bool ended = event_.type == YAML_STREAM_END_EVENT || event_.type == YAML_DOCUMENT_END_EVENT;
    return ended ? nullptr : &event_;
  }

 private:
  yaml_parser_t parser_ = {};
  yaml_event_t event_ = {};
  bool initialized_ = false;
};

}  // namespace

void CheckDocumentLimits(std::string_view text) {
  if (IsSurelyHarmless(text)) return;
  EventReader reader(text);
  DocumentCount count;
  while (const yaml_event_t* event = reader.Next()) {
    if (event->type == YAML_MAPPING_START_EVENT) {
      count.StartCollection(event->data.mapping_start.anchor);
    } else if (event->type == YAML_SEQUENCE_START_EVENT) {
      count.StartCollection(event->data.sequence_start.anchor);
    } else if (event->type == YAML_MAPPING_END_EVENT || event->type == YAML_SEQUENCE_END_EVENT) {
      count.EndCollection();
    } else if (event->type == YAML_SCALAR_EVENT) {
      count.AddScalar(event->data.scalar.anchor);
    } else if (event->type == YAML_ALIAS_EVENT) {
      count.AddAlias(event->data.alias.anchor);
    }
  }
}

}  // namespace vexel_yaml
