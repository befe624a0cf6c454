#include "fixups/state_machine_transitions.h"

#include "fixups/engine_keys.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// Calls `convert` with the body of every state machine and its object's document.
template <typename Convert>
void ForEachStateMachine(YAMLMapping& root, Convert convert) {
  for (const auto& [file_id, value] : root) {
    YAMLMapping* object = value->AsMapping();
    if (object == nullptr) continue;
    if (YAMLMapping* body = GetSubmapping(*object, AnimatorStateMachineKey())) convert(*object, *body);
  }
}

YAMLMapping* ToMapping(YAMLSequence& transitions) {
  // Merging has edited the elements; a stale hash could make two different pairs look equal.
  transitions.RebuildHash(false);
  auto* mapping = YAMLAlloc<YAMLMapping>::create(transitions.IsFlow());
  for (const YAMLNode* item : transitions.GetItems()) {
    if (item == nullptr) continue;
    const YAMLMapping* pair = item->AsMapping();
    if (pair == nullptr || pair->Size() != 1) {
      throw YAMLError("Expected size of one for key: " + StateMachineTransitionsKey()->GetText());
    }
    mapping->Append(pair->FirstKey(), pair->First()->Clone());
  }
  return mapping;
}

}  // namespace

void TransitionsToSequences(YAMLMapping& root) {
  const YAMLScalar* key = StateMachineTransitionsKey();
  ForEachStateMachine(root, [&](YAMLMapping& object, YAMLMapping& body) {
    const YAMLNode* value = body.Get(key);
    const YAMLMapping* transitions = value == nullptr ? nullptr : value->AsMapping();
    if (transitions == nullptr) throw YAMLError("Expected key to point to yaml mapping: " + key->GetText());
    body.Change(key, transitions->ToSequence())->Free();
    object.RebuildHash(false);
  });
}

void TransitionsToMappings(YAMLMapping& root) {
  const YAMLScalar* key = StateMachineTransitionsKey();
  ForEachStateMachine(root, [&](YAMLMapping& /*object*/, YAMLMapping& body) {
    YAMLNode* value = body.Get(key);
    // Stripping may have left nothing of them.
    if (value == nullptr) return;
    YAMLSequence* transitions = value->AsSequence();
    if (transitions == nullptr) throw YAMLError("Expected key to point to yaml sequence: " + key->GetText());
    body.Change(key, ToMapping(*transitions))->Free();
  });
}

}  // namespace vexel_yaml
