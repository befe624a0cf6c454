#include "yaml/document_limits.h"

#include <yaml.h>

#include <functional>
#include <string>
#include <unordered_map>
#include <vector>

#include "platform/text_hash.h"
#include "yaml/convert_document.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostAnchors = 10'000;
constexpr size_t kMostExpandedNodes = 10'000'000;
// libyaml looks for an alias's anchor from the document's first one on.
constexpr size_t kMostAnchorsLookedAt = 100'000'000;
// libyaml looks at every open bracket again with every token. Few brackets don't matter, so that a file of
// any size may be written in them; what stands deeper is counted, and 100,000 values in 1,000 brackets are
// enough.
constexpr size_t kFewBrackets = 32;
constexpr size_t kMostBracketsLookedAt = 100'000'000;

// An upper bound of how many brackets are open. A text outside of brackets may hold any, which leaves it too
// high or at none. Where one could hide in a quoted text, a comment or a tag within brackets, no bracket is
// taken for closed any more.
class OpenBrackets {
 public:
  void Add(char c) {
    if (c == '[' || c == '{') {
      if (++open_ > most_) most_ = open_;
    } else if (c == ']' || c == '}') {
      if (open_ != 0 && !any_may_hide_) --open_;
    } else if (c == '"' || c == '\'' || c == '#' || c == '!') {
      any_may_hide_ = any_may_hide_ || open_ != 0;
    }
  }

  size_t GetMost() const { return most_; }

 private:
  size_t open_ = 0;
  size_t most_ = 0;
  bool any_may_hide_ = false;
};

// Whether one pass over a document's bytes shows that nothing is near a limit. Of the nesting depth it makes
// an upper bound: every flow collection has its opening bracket, and of block collections at most two start
// at one column, a list level with its key. The one anchor that counts for nothing is the object's file ID.
bool IsSurelyHarmless(std::string_view document) {
  OpenBrackets brackets;
  size_t widest_indent = 0;
  size_t indent = 0;
  bool at_line_start = true;
  const size_t file_id = document.substr(0, document.find_first_of("\r\n")).find('&');
  for (size_t i = 0; i < document.size(); ++i) {
    const char c = document[i];
    if (c == '\n' || c == '\r') {
      indent = 0;
      at_line_start = true;
    } else if (at_line_start && (c == ' ' || c == '-' || c == '?' || c == ':' || c == '\t')) {
      if (++indent > widest_indent) widest_indent = indent;
    } else {
      at_line_start = false;
      brackets.Add(c);
      if (c == '&' && i != file_id) return false;
    }
  }
  return brackets.GetMost() <= kFewBrackets &&
         kFewBrackets + 2 * widest_indent + 2 < DocumentConverter::kDeepest;
}

// Counts what loading a document would make, without making it.
class DocumentCount {
 public:
  explicit DocumentCount(DocumentLimits& limits) : limits_(limits) {}

  void Add(const yaml_event_t& event) {
    AddBracketsLookedAt();
    if (event.type == YAML_MAPPING_START_EVENT) {
      const auto& start = event.data.mapping_start;
      StartCollection(start.anchor, start.style == YAML_FLOW_MAPPING_STYLE);
    } else if (event.type == YAML_SEQUENCE_START_EVENT) {
      const auto& start = event.data.sequence_start;
      StartCollection(start.anchor, start.style == YAML_FLOW_SEQUENCE_STYLE);
    } else if (event.type == YAML_MAPPING_END_EVENT || event.type == YAML_SEQUENCE_END_EVENT) {
      EndCollection();
    } else if (event.type == YAML_SCALAR_EVENT) {
      if (Anchor* anchor = TakeAnchor(event.data.scalar.anchor)) anchor->size = 1;
      AddNodes(1);
    } else if (event.type == YAML_ALIAS_EVENT) {
      AddAlias(event.data.alias.anchor);
    }
  }

 private:
  struct Anchor {
    // How many anchors stand before it in the document.
    size_t position;
    // Of the node below it, aliases expanded; 0 while the node is open.
    size_t size;
  };

  struct Collection {
    Anchor* anchor;
    size_t size;
    // The brackets around it, its own among them.
    size_t brackets;
  };

  void AddBracketsLookedAt() {
    if (open_.empty() || open_.back().brackets <= kFewBrackets) return;
    limits_.brackets_looked_at += open_.back().brackets;
    if (limits_.brackets_looked_at > kMostBracketsLookedAt) {
      throw YAMLError("YAML nests too many values in brackets");
    }
  }

  void StartCollection(const yaml_char_t* anchor, bool in_brackets) {
    if (open_.size() == DocumentConverter::kDeepest) {
      throw YAMLError("YAML nesting is deeper than 1000 levels");
    }
    // The first anchor of all is the object's file ID.
    const size_t brackets = (open_.empty() ? 0 : open_.back().brackets) + (in_brackets ? 1 : 0);
    open_.push_back({open_.empty() ? nullptr : TakeAnchor(anchor), 1, brackets});
  }

  void EndCollection() {
    const Collection collection = open_.back();
    open_.pop_back();
    if (collection.anchor != nullptr) collection.anchor->size = collection.size;
    AddNodes(collection.size);
  }

  Anchor* TakeAnchor(const yaml_char_t* name) {
    if (name == nullptr) return nullptr;
    if (++limits_.anchors > kMostAnchors) throw YAMLError("YAML file holds more than 10000 anchors");
    return &anchors_.emplace(reinterpret_cast<const char*>(name), Anchor{anchors_.size() + 1, 0})
                .first->second;
  }

  void AddAlias(const yaml_char_t* name) {
    const auto found = anchors_.find(std::string_view(reinterpret_cast<const char*>(name)));
    if (found == anchors_.end()) return;
    limits_.anchors_looked_at += found->second.position;
    limits_.expanded_nodes += found->second.size;
    if (limits_.anchors_looked_at > kMostAnchorsLookedAt) {
      throw YAMLError("YAML aliases refer to too many anchors");
    }
    if (limits_.expanded_nodes > kMostExpandedNodes) {
      throw YAMLError("YAML aliases expand to more than 10000000 nodes");
    }
    AddNodes(found->second.size);
  }

  void AddNodes(size_t count) {
    if (!open_.empty()) open_.back().size += count;
  }

  DocumentLimits& limits_;
  std::vector<Collection> open_;
  // An address in it stays valid.
  std::unordered_map<std::string, Anchor, TextHash, std::equal_to<>> anchors_;
};

// Reads the events of a document; holds libyaml's objects over exceptions.
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

void CheckDocumentLimits(std::string_view chunk, size_t document_start, DocumentLimits& limits) {
  if (IsSurelyHarmless(chunk.substr(document_start))) return;
  EventReader reader(chunk);
  DocumentCount count(limits);
  while (const yaml_event_t* event = reader.Next()) count.Add(*event);
}

}  // namespace vexel_yaml
