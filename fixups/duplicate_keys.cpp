#include "fixups/duplicate_keys.h"

#include "fixups/engine_keys.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

bool HoldsDuplicateKeys(const YAMLNode* node) {
  if (node == nullptr) return false;
  if (const YAMLMapping* mapping = node->AsMapping()) {
    if (mapping->HasDuplicateKeys()) return true;
    for (const auto& [key, value] : *mapping) {
      if (HoldsDuplicateKeys(value)) return true;
    }
  } else if (const YAMLSequence* sequence = node->AsSequence()) {
    for (const YAMLNode* item : sequence->GetItems()) {
      if (HoldsDuplicateKeys(item)) return true;
    }
  }
  return false;
}

// The transitions themselves may repeat keys, their values may not.
bool TransitionsHoldDuplicateKeys(const YAMLNode* node) {
  const YAMLMapping* transitions = node->AsMapping();
  if (transitions == nullptr || !transitions->HasDuplicateKeys()) return HoldsDuplicateKeys(node);
  for (const auto& [key, value] : transitions->GetDuplicatePairs()) {
    if (HoldsDuplicateKeys(value)) return true;
  }
  return false;
}

bool ObjectHoldsDuplicateKeys(const YAMLMapping& object) {
  if (object.HasDuplicateKeys()) return true;
  const YAMLMapping* state_machine = GetSubmapping(object, AnimatorStateMachineKey());
  if (state_machine == nullptr || state_machine->HasDuplicateKeys()) return HoldsDuplicateKeys(&object);
  for (const auto& [key, value] : *state_machine) {
    if (key == StateMachineTransitionsKey() ? TransitionsHoldDuplicateKeys(value)
                                            : HoldsDuplicateKeys(value)) {
      return true;
    }
  }
  for (const auto& [key, value] : object) {
    if (value != state_machine && HoldsDuplicateKeys(value)) return true;
  }
  return false;
}

}  // namespace

void ThrowDuplicateKeys(const std::string& path, const YAMLScalar* object) {
  throw YAMLError("Cannot perform this operation on a YAML file with duplicate keys: file '" + path +
                  "', object " + object->GetText());
}

void RefuseDuplicateKeys(const VexelObjects& objects, const std::string& path) {
  for (const YAMLScalar* file_id : objects.GetObjectsWithDuplicateKeys()) {
    const YAMLMapping* object = GetSubmapping(objects, file_id);
    if (object == nullptr || !ObjectHoldsDuplicateKeys(*object)) continue;
    ThrowDuplicateKeys(path, file_id);
  }
}

}  // namespace vexel_yaml
