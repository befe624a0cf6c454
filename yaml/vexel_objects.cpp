#include "yaml/vexel_objects.h"

#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

void AppendPresent(YAMLMapping& object, const YAMLScalar* key, YAMLNode* value) {
  if (value != nullptr) object.Append(key, value);
}

std::string_view TextOf(const YAMLNode* value) {
  const YAMLScalar* scalar = value == nullptr ? nullptr : value->AsScalar();
  return scalar == nullptr ? std::string_view() : std::string_view(scalar->GetText());
}

}  // namespace

void VexelObjects::OutputObject(std::ostream& out, const Slot& slot, Headers headers) {
  YAMLMapping* object = slot.value->AsMapping();
  if (object == nullptr)
    throw YAMLError("Cannot write an object that is not a mapping: " + slot.key->GetText());
  // Its header line could not be read again.
  if (headers == Headers::kComplete && (TextOf(object->Get(YAMLScalar::fileIDPlaceHolderName)).empty() ||
                                        TextOf(object->Get(YAMLScalar::classIDPlaceHolderName)).empty())) {
    throw YAMLError("Cannot write an object without class ID or file ID: '" + slot.key->GetText() + "'");
  }
  YAMLNode* file_id = object->Steal(YAMLScalar::fileIDPlaceHolderName);
  YAMLNode* class_id = object->Steal(YAMLScalar::classIDPlaceHolderName);
  YAMLNode* stripped = object->Steal(YAMLScalar::strippedPrefabPlaceHolderName);
  out << "--- !v!" << TextOf(class_id) << " &" << TextOf(file_id);
  if (stripped != nullptr) out << " stripped";
  out << '\n' << object->GetYAMLString() << '\n';
  AppendPresent(*object, YAMLScalar::fileIDPlaceHolderName, file_id);
  AppendPresent(*object, YAMLScalar::classIDPlaceHolderName, class_id);
  AppendPresent(*object, YAMLScalar::strippedPrefabPlaceHolderName, stripped);
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
  CloneInto(*clone);
  clone->tag_prefix_ = tag_prefix_;
  return clone;
}

}  // namespace vexel_yaml
