#include "yaml/vexel_objects.h"

#include "yaml/folded_object.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

std::string_view TextOf(const YAMLNode* value) {
  const YAMLScalar* scalar = value == nullptr ? nullptr : value->AsScalar();
  return scalar == nullptr ? std::string_view() : std::string_view(scalar->GetText());
}

// Without complete headers the object could not be read again.
void CheckHeader(const YAMLMapping::Slot& slot, VexelObjects::Headers headers) {
  const YAMLMapping* object = slot.value->AsMapping();
  if (object == nullptr)
    throw YAMLError("Cannot write an object that is not a mapping: " + slot.key->GetText());
  if (headers == VexelObjects::Headers::kComplete &&
      (TextOf(object->Get(YAMLScalar::fileIDPlaceHolderName)).empty() ||
       TextOf(object->Get(YAMLScalar::classIDPlaceHolderName)).empty())) {
    throw YAMLError("Cannot write an object without class ID or file ID: '" + slot.key->GetText() + "'");
  }
}

// Takes the pseudo keys out of an object and puts them back at its end, also when it can't be written.
struct TakenPseudoKeys {
  explicit TakenPseudoKeys(YAMLMapping& from)
      : object(from),
        file_id(object.Steal(YAMLScalar::fileIDPlaceHolderName)),
        class_id(object.Steal(YAMLScalar::classIDPlaceHolderName)),
        stripped(object.Steal(YAMLScalar::strippedPrefabPlaceHolderName)) {}
  TakenPseudoKeys(const TakenPseudoKeys&) = delete;
  TakenPseudoKeys& operator=(const TakenPseudoKeys&) = delete;
  ~TakenPseudoKeys() {
    PutBack(YAMLScalar::fileIDPlaceHolderName, file_id);
    PutBack(YAMLScalar::classIDPlaceHolderName, class_id);
    PutBack(YAMLScalar::strippedPrefabPlaceHolderName, stripped);
  }

  void PutBack(const YAMLScalar* key, YAMLNode* value) {
    if (value != nullptr) object.Append(key, value);
  }

  YAMLMapping& object;
  YAMLNode* file_id;
  YAMLNode* class_id;
  YAMLNode* stripped;
};

}  // namespace

void VexelObjects::OutputObject(std::ostream& out, const Slot& slot, Headers headers) try {
  CheckHeader(slot, headers);
  YAMLMapping* object = slot.value->AsMapping();
  if (const FoldedObject* folded = object->GetFolded()) {
    out << folded->text;
    return;
  }
  const TakenPseudoKeys taken(*object);
  out << "--- !v!" << TextOf(taken.class_id) << " &" << TextOf(taken.file_id);
  if (taken.stripped != nullptr) out << " stripped";
  out << '\n' << object->GetYAMLString() << '\n';
} catch (const YAMLError& error) {
  throw YAMLError(error.what(), "see object " + slot.key->GetText());
}

void VexelObjects::OutputHeader(std::ostream& out) const {
  out << "%YAML 1.1\n%TAG !v! " << tag_prefix_ << '\n';
}

void VexelObjects::Output(std::ostream& out, Headers headers) {
  OutputHeader(out);
  for (const Slot& slot : *this) OutputObject(out, slot, headers);
  out.flush();
}

VexelObjects* VexelObjects::Clone() const {
  auto* clone = new VexelObjects;
  CopyTo(*clone);
  return clone;
}

void VexelObjects::CopyTo(VexelObjects& target) const {
  CloneInto(target);
  target.tag_prefix_ = tag_prefix_;
  target.texts_ = texts_;
}

}  // namespace vexel_yaml
