#include "yaml/emit_yaml.h"

#include <yaml.h>

#include <new>

#include "yaml/write_written_style.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_mapping.h"
#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// No exception may pass libyaml, which would lose its own storage: 0 makes it fail.
int StringOutputHandler(void* data, unsigned char* buffer, size_t size) try {
  static_cast<std::string*>(data)->append(reinterpret_cast<const char*>(buffer), size);
  return 1;
} catch (const std::exception&) {
  return 0;
}

// What libyaml is given it can write, so its functions return 0 only where there is no storage.
int CheckedId(int result) {
  if (result == 0) throw std::bad_alloc();
  return result;
}

// Holds libyaml's objects over exceptions.
class Emission {
 public:
  Emission() {
    if (yaml_document_initialize(&document_, nullptr, nullptr, nullptr, 1, 1) == 0 ||
        yaml_emitter_initialize(&emitter_) == 0) {
      throw std::bad_alloc();
    }
  }
  Emission(const Emission&) = delete;
  Emission& operator=(const Emission&) = delete;
  ~Emission() {
    yaml_emitter_delete(&emitter_);
    if (!dumped_) yaml_document_delete(&document_);
  }

  std::string Emit(const YAMLNode& node) {
    std::string text;
    yaml_emitter_set_output(&emitter_, StringOutputHandler, &text);
    node.PopulateDocument(&document_);
    dumped_ = true;  // Dumping deletes the document, also when it fails.
    if (yaml_emitter_dump(&emitter_, &document_) == 0 || yaml_emitter_flush(&emitter_) == 0) {
      if (emitter_.error == YAML_MEMORY_ERROR || emitter_.error == YAML_WRITER_ERROR) throw std::bad_alloc();
      throw YAMLError(emitter_.problem == nullptr ? "unknown problem" : emitter_.problem);
    }
    return text;
  }

 private:
  yaml_document_t document_ = {};
  yaml_emitter_t emitter_ = {};
  bool dumped_ = false;
};

void RemoveLast(std::string& text, char character) {
  if (!text.empty() && text.back() == character) text.pop_back();
}

}  // namespace

std::string EmitWithLibyaml(const YAMLNode& node) {
  std::string text = Emission().Emit(node);
  RemoveLast(text, '\n');
  RemoveLast(text, '\r');
  return text;
}

std::string YAMLNode::GetYAMLString() const {
  std::string text;
  return WriteInWrittenStyle(*this, text) ? text : EmitWithLibyaml(*this);
}

int YAMLScalar::PopulateDocument(yaml_document_s* document) const {
  CheckWritable();
  const auto* bytes = reinterpret_cast<const yaml_char_t*>(text_.data());
  return CheckedId(yaml_document_add_scalar(document, nullptr, bytes, static_cast<int>(text_.size()),
                                            YAML_ANY_SCALAR_STYLE));
}

int YAMLMapping::PopulateDocument(yaml_document_s* document) const {
  Unfold();
  const int id = CheckedId(
      yaml_document_add_mapping(document, nullptr, flow_ ? YAML_FLOW_MAPPING_STYLE : YAML_ANY_MAPPING_STYLE));
  const auto append = [&](const Slot& slot) {
    const int key = slot.key->PopulateDocument(document);
    const int value = slot.value->PopulateDocument(document);
    CheckedId(yaml_document_append_mapping_pair(document, id, key, value));
  };
  if (duplicates_) {
    for (const Slot& slot : *duplicates_) append(slot);
  } else {
    for (const Slot& slot : *this) append(slot);
  }
  return id;
}

int YAMLSequence::PopulateDocument(yaml_document_s* document) const {
  const int id = CheckedId(yaml_document_add_sequence(
      document, nullptr, flow_ ? YAML_FLOW_SEQUENCE_STYLE : YAML_BLOCK_SEQUENCE_STYLE));
  for (const YAMLNode* item : items_) {
    // The engine's lists know no empty elements: a slot that no edit has filled is not part of the list.
    if (item == nullptr) continue;
    const int item_id = item->PopulateDocument(document);
    CheckedId(yaml_document_append_sequence_item(document, id, item_id));
  }
  return id;
}

}  // namespace vexel_yaml
