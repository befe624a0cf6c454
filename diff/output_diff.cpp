#include "diff/yaml_diff_output.h"
#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"

namespace vexel_yaml {

namespace {

// The text of an added value; an added object is shown without its pseudo keys.
std::string AddedText(const YAMLNode& value) {
  const YAMLMapping* mapping = value.AsMapping();
  if (mapping == nullptr) return value.GetYAMLString();
  YAMLMapping shown(mapping->IsFlow());
  bool is_object = false;
  const auto show = [&](const YAMLMapping::Slot& slot) {
    is_object |= slot.key == YAMLScalar::classIDPlaceHolderName;
    if (!slot.key->IsPseudoKey()) shown.Append(slot.key, slot.value);
  };
  if (mapping->HasDuplicateKeys()) {
    for (const YAMLMapping::Slot& slot : mapping->GetDuplicatePairs()) show(slot);
  } else {
    for (const YAMLMapping::Slot& slot : *mapping) show(slot);
  }
  std::string text = is_object ? shown.GetYAMLString() : value.GetYAMLString();
  shown.ForgetPairs();
  return text;
}

// Positions are those after the earlier deletions: a deleted element does not advance the position.
void OutputMoves(YAMLDiffOutput& out, const YAMLSequenceRemapper& remapper, const YAMLSequenceDiff& diff) {
  int position = 0;
  for (const uint32_t target : remapper.GetMapping()) {
    if (target == YAMLSequenceRemapper::kDropped) {
      if (diff.Get(position) == nullptr) {
        out << "delete index \"" << position << "\"" << endl;
        continue;
      }
    } else if (target != static_cast<uint32_t>(position)) {
      out << "move index \"" << position << "\" to \"" << static_cast<size_t>(target) << "\"" << endl;
    }
    ++position;
  }
}

}  // namespace

void RemoveOperation::Output(YAMLDiffOutput& out) const { out << "delete" << endl; }

void ChangeOperation::Output(YAMLDiffOutput& out) const {
  out << "change to " << GetValue()->GetYAMLString() << endl;
}

void AddOperation::Output(YAMLDiffOutput& out) const {
  out << "add as ";
  const std::string text = AddedText(*GetValue());
  if (text.find('\n') == std::string::npos) {
    out << text << endl;
    return;
  }
  // The lines of the value line up under its first character.
  std::string indent = out.ExchangeIndent(std::string(out.GetIndent().size() + out.GetColumn(), ' '));
  out << text;
  out.ExchangeIndent(std::move(indent));
  out << endl;
}

void ChangeMappingOperation::Output(YAMLDiffOutput& out) const {
  out << endl;
  out.PushLevel();
  diff_->Output(out);
  out.PopLevel();
}

void ChangeSequenceOperation::Output(YAMLDiffOutput& out) const {
  out << "[";
  if (remapper_ != nullptr) out << remapper_->GetMapping().size();
  out << "]" << endl;
  if (remapper_ != nullptr) {
    out.PushLevel();
    OutputMoves(out, *remapper_, *diff_);
    out.PopLevel();
  }
  diff_->Output(out);
}

void YAMLMappingDiff::Output(YAMLDiffOutput& out) const {
  if (entries_.empty()) return;
  out.PushLevel();
  for (const Entry& entry : entries_) {
    out << entry.key->GetText() << " ";
    entry.operation->Output(out);
  }
  out.PopLevel();
}

void YAMLSequenceDiff::Output(YAMLDiffOutput& out) const {
  if (entries_.empty()) return;
  out.PushLevel();
  for (const auto& [index, operation] : entries_) {
    out << "index " << index << " ";
    operation->Output(out);
  }
  out.PopLevel();
}

}  // namespace vexel_yaml
