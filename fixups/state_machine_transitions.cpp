#include "fixups/state_machine_transitions.h"

#include <vector>

#include "fixups/engine_keys.h"
#include "yaml/yaml_alloc.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// Walks down to the bodies of state machines, which stand right below their objects, and to nothing else. A
// body that repeats a key is one value for diff and strip, and no merge takes it.
class StateMachineVisitor : public YAMLNodeVisitor {
 public:
  void Visit(const YAMLScalar& /*scalar*/) override {}
  void Visit(YAMLSequence& /*sequence*/) override {}

  void Visit(YAMLMapping& mapping) override {
    switch (path_.size()) {
      case 0:
        for (const auto& [file_id, object] : mapping) VisitObject(file_id, *object);
        return;
      case 1:
        if (YAMLMapping* body = GetSubmapping(mapping, AnimatorStateMachineKey())) {
          VisitAt(AnimatorStateMachineKey(), *body);
        }
        return;
      default:
        if (!mapping.HasDuplicateKeys()) Convert(mapping);
    }
  }

 protected:
  ~StateMachineVisitor() = default;

  virtual void VisitObject(const YAMLScalar* file_id, YAMLNode& object) { VisitAt(file_id, object); }
  virtual void Convert(YAMLMapping& state_machine) = 0;

  void VisitAt(const YAMLScalar* key, YAMLNode& value) {
    path_.push_back(key);
    value.Accept(*this);
    path_.pop_back();
  }

 private:
  std::vector<const YAMLScalar*> path_;
};

class PreProcessInvalidMappingsVisitor final : public StateMachineVisitor {
 private:
  void VisitObject(const YAMLScalar* file_id, YAMLNode& object) override {
    changed_ = false;
    VisitAt(file_id, object);
    if (changed_) object.RebuildHash(false);
  }

  void Convert(YAMLMapping& state_machine) override {
    const YAMLScalar* key = StateMachineTransitionsKey();
    const YAMLNode* value = state_machine.Get(key);
    const YAMLMapping* transitions = value == nullptr ? nullptr : value->AsMapping();
    if (transitions == nullptr) throw YAMLError("Expected key to point to yaml mapping: " + key->GetText());
    state_machine.Change(key, transitions->ToSequence())->Free();
    changed_ = true;
  }

  bool changed_ = false;
};

class PostProcessInvalidMappingsVisitor final : public StateMachineVisitor {
 public:
  explicit PostProcessInvalidMappingsVisitor(bool is_stripped) : is_stripped_(is_stripped) {}

 private:
  void Convert(YAMLMapping& state_machine) override {
    const YAMLScalar* key = StateMachineTransitionsKey();
    YAMLNode* value = state_machine.Get(key);
    if (value == nullptr && is_stripped_) return;
    YAMLSequence* transitions = value == nullptr ? nullptr : value->AsSequence();
    if (transitions == nullptr) throw YAMLError("Expected key to point to yaml sequence: " + key->GetText());
    state_machine.Change(key, ToMapping(*transitions))->Free();
  }

  static YAMLMapping* ToMapping(YAMLSequence& transitions) {
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

  const bool is_stripped_;
};

}  // namespace

void TransitionsToSequences(YAMLMapping& root) {
  PreProcessInvalidMappingsVisitor visitor;
  root.Accept(visitor);
}

void TransitionsToMappings(YAMLMapping& root) {
  PostProcessInvalidMappingsVisitor visitor(false);
  root.Accept(visitor);
}

void StrippedTransitionsToMappings(YAMLMapping& root) {
  PostProcessInvalidMappingsVisitor visitor(true);
  root.Accept(visitor);
}

}  // namespace vexel_yaml
