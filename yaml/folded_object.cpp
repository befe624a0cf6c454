#include "yaml/folded_object.h"

#include <functional>
#include <utility>

#include "yaml/pseudo_keys.h"
#include "yaml/written_object.h"
#include "yaml/written_style.h"

namespace vexel_yaml {

const YAMLScalar* FoldedObject::GetPseudoValue(const YAMLScalar* key) const {
  if (key == YAMLScalar::fileIDPlaceHolderName) return file_id;
  if (key == YAMLScalar::classIDPlaceHolderName) return class_id;
  return stripped && key == YAMLScalar::strippedPrefabPlaceHolderName ? YAMLScalar::one : nullptr;
}

YAMLMapping* FoldedObject::Read() const {
  YAMLMapping* object = ReadWrittenObject(text);
  AppendPseudoKeys(*object, file_id, class_id, stripped, 1);
  return object;
}

bool HaveSameText(const YAMLNode& a, const YAMLNode& b) {
  const FoldedObject* folded_a = GetFolded(&a);
  const FoldedObject* folded_b = GetFolded(&b);
  if (folded_a == nullptr || folded_b == nullptr) return false;
  return folded_a == folded_b || folded_a->text == folded_b->text;
}

ObjectFolder::ObjectFolder(std::string_view header) : is_written_header_(IsWrittenHeader(header)) {}

const FoldedObject* ObjectFolder::Fold(std::string_view document) {
  WrittenDocument written;
  if (!is_written_header_ || !IsInWrittenStyle(document, written)) return nullptr;
  std::string_view text = document;
  if (!written.transcript.empty()) text = transcripts_.emplace_back(std::move(written.transcript));
  const auto* father = written.father.empty() ? nullptr : YAMLScalar::Lookup(written.father);
  objects_.push_back({text, YAMLScalar::Lookup(written.file_id), YAMLScalar::Lookup(written.class_id),
                      YAMLScalar::Lookup(written.body_key), father, written.stripped,
                      written.refers_to_prefab});
  return &objects_.back();
}

bool ObjectFolder::CopyTextsFrom(std::string_view file) {
  const auto lies_in_file = [&](const FoldedObject& object) {
    return !std::less<>()(object.text.data(), file.data()) &&
           std::less<>()(object.text.data(), file.data() + file.size());
  };
  size_t size = 0;
  for (const FoldedObject& object : objects_) size += lies_in_file(object) ? object.text.size() : 0;
  if (size > file.size() / 4) return false;
  copies_.reserve(size);
  for (FoldedObject& object : objects_) {
    if (!lies_in_file(object)) continue;
    copies_ += object.text;
    object.text = std::string_view(copies_).substr(copies_.size() - object.text.size());
  }
  return true;
}

}  // namespace vexel_yaml
