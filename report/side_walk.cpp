#include "report/side_walk.h"

#include <algorithm>

#include "report/list_order.h"

namespace vexel_yaml {

namespace {

constexpr size_t kMostOfValue = 160;
constexpr size_t kMostOfElement = 100;
constexpr size_t kMostElements = 3;

const YAMLMapping* BodyOf(const YAMLNode* object) {
  const YAMLMapping* mapping = object == nullptr ? nullptr : object->AsMapping();
  if (mapping == nullptr || mapping->HasDuplicateKeys() || mapping->Size() == 0) return nullptr;
  return mapping->FirstKey()->IsPseudoKey() ? nullptr : mapping->First()->AsMapping();
}

// The mapping that says more by the number of its fields than by the first few of them; null for others.
const YAMLMapping* FieldsToCount(const FieldPath& path, const YAMLNode* node) {
  const bool whole = path.size() == 1;
  const YAMLMapping* fields = whole ? BodyOf(node) : node == nullptr ? nullptr : node->AsMapping();
  if (fields == nullptr || fields->HasDuplicateKeys()) return nullptr;
  return whole || (!fields->IsFlow() && fields->Size() > kMostElements) ? fields : nullptr;
}

std::string FullText(const YAMLNode& node) {
  const YAMLScalar* scalar = node.AsScalar();
  return scalar != nullptr ? scalar->GetText() : node.GetYAMLString();
}

bool IsUnit(const YAMLNode* from, const YAMLNode* to) {
  const auto in_braces = [](const YAMLNode* node) {
    return node != nullptr && node->AsMapping() != nullptr && node->AsMapping()->IsFlow();
  };
  return in_braces(from) || in_braces(to);
}

const YAMLNode* ValueAt(const YAMLNode* node, const YAMLScalar* key) {
  const YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping();
  return mapping == nullptr || mapping->HasDuplicateKeys() ? nullptr : mapping->Get(key);
}

// Whether an element of a list says what it is in a line of its own.
bool FitsIntoLine(const YAMLNode* element) {
  if (element == nullptr) return true;
  if (const YAMLScalar* scalar = element->AsScalar()) return scalar->GetText().size() <= kMostOfElement;
  return ReferenceIn(element) != nullptr;
}

const YAMLNode* ElementAt(const YAMLSequence& sequence, size_t index) {
  return index < sequence.Size() ? sequence.GetItems()[index] : nullptr;
}

}  // namespace

void ShowNamed(ReportCell& cell, ObjectNames& names, NamedWith with) {
  if (cell.node == nullptr) return;
  if (const YAMLSequence* list = cell.node->AsSequence()) {
    if (list->Size() > 0 && std::ranges::all_of(list->GetItems(), FitsIntoLine))
      cell.shown = NamedText(list, names, with);
  } else if (cell.node->AsMapping() != nullptr || cell.node == YAMLScalar::empty) {
    cell.shown = Shortened(NamedText(cell.node, names, with), kMostOfValue);
  }
}

ReportCell ValueCell(const FieldPath& path, const YAMLNode* node, ReportCell::Kind kind, CellNames names) {
  ReportCell cell{kind, {}, {}};
  cell.node = node;
  if (const YAMLMapping* fields = FieldsToCount(path, node)) {
    cell.text = std::to_string(fields->Size()) + (fields->Size() == 1 ? " field" : " fields");
    cell.full = FullText(*fields);
    return cell;
  }
  const YAMLSequence* list = node == nullptr ? nullptr : node->AsSequence();
  ShowNamed(cell, names.own, NamedWith::kNothing);
  if (list != nullptr && list->Size() > kMostElements) {
    cell.text = std::to_string(list->Size()) + " elements";
    cell.full = FullText(*list);
    return cell;
  }
  cell.text = ValueText(node, names.common, kMostOfValue);
  if (cell.shown == cell.text) cell.shown.clear();
  if (node == nullptr || !cell.text.ends_with(kEllipsis)) return cell;
  cell.full = FullText(*node);
  // The value's own dots.
  if (cell.full == cell.text) cell.full.clear();
  return cell;
}

void SideWalk::Walk(const YAMLMappingDiff& diff, const YAMLMapping& from, const YAMLMapping& to) {
  for (const YAMLMappingDiff::Entry& entry : diff.GetEntries()) {
    WalkAt(entry.key, *entry.operation, ValueAt(&from, entry.key), ValueAt(&to, entry.key));
  }
}

void SideWalk::WalkAt(const YAMLScalar* key, const Operation& operation, const YAMLNode* from,
                      const YAMLNode* to) {
  path_.push_back(key);
  if (in_list_ && places_ != nullptr) places_->emplace(&operation, path_);
  WalkOperation(operation, from, to);
  path_.pop_back();
}

void SideWalk::WalkOperation(const Operation& operation, const YAMLNode* from, const YAMLNode* to) {
  switch (operation.GetKind()) {
    case Operation::Kind::kRemove:
      found_(path_, {ReportCell::Kind::kRemoved, {}, {}}, from);
      return;
    case Operation::Kind::kAdd:
      found_(path_, ValueCell(path_, to, ReportCell::Kind::kAdded, names_), from);
      return;
    case Operation::Kind::kChange:
      found_(path_, ValueCell(path_, to, ReportCell::Kind::kChanged, names_), from);
      return;
    case Operation::Kind::kChangeMapping:
      if (IsUnit(from, to)) {
        RememberInner(operation);
        found_(path_, ValueCell(path_, to, ReportCell::Kind::kChanged, names_), from);
        return;
      }
      Walk(*static_cast<const ChangeMappingOperation&>(operation).GetDiff(), *from->AsMapping(),
           *to->AsMapping());
      return;
    case Operation::Kind::kChangeSequence:
      WalkList(static_cast<const ChangeSequenceOperation&>(operation), *from->AsSequence(),
               *to->AsSequence());
      return;
  }
}

// An edit inside an element that stays is a change of its own; what came, went or moved is one of the list.
void SideWalk::WalkList(const ChangeSequenceOperation& operation, const YAMLSequence& from,
                        const YAMLSequence& to) {
  const YAMLSequenceRemapper* remapper = operation.GetRemapper();
  const std::vector<uint32_t> origins = Origins(remapper, from.Size(), to.Size());
  ReportCell edits{ReportCell::Kind::kEdited, {}, {}};
  edits.node = &to;
  bool shortened = false;
  const auto add = [&](std::string_view word, const YAMLNode* value, const std::string& named) {
    const std::string whole = OnOneLine(ValueText(value, names_.common, std::string::npos));
    const std::string start = Shortened(whole, kMostOfElement);
    shortened |= start.size() < whole.size();
    const std::string_view line_break = edits.text.empty() ? "" : "\n";
    edits.text.append(line_break).append(word).append(start);
    edits.full.append(line_break).append(word).append(whole);
    edits.shown.append(line_break).append(word).append(named);
  };
  const std::vector<std::string> before = NamedElements(from, names_.own);
  const std::vector<std::string> after = NamedElements(to, names_.own);
  const auto add_edit = [&](std::string_view word, const YAMLSequence& list, size_t index) {
    const std::vector<std::string>& named = &list == &from ? before : after;
    add(word, ElementAt(list, index), index < named.size() ? Shortened(named[index], kMostOfElement) : "");
  };
  const bool was_in_list = std::exchange(in_list_, true);
  if (remapper != nullptr) {
    for (size_t i = 0; i < remapper->GetMapping().size(); ++i) {
      if (remapper->GetMapping()[i] == YAMLSequenceRemapper::kDropped) {
        add_edit("- ", from, i);
        MarkGone(i);
      }
    }
  }
  for (const auto& [index, element] : operation.GetDiff()->GetEntries()) {
    const auto at = static_cast<size_t>(index);
    const uint32_t origin = origins.at(at);
    if (element->GetKind() == Operation::Kind::kRemove) {
      add_edit("- ", from, origin);
      MarkGone(origin);
    } else if (element->GetKind() == Operation::Kind::kAdd || origin == YAMLSequenceRemapper::kDropped) {
      add_edit("+ ", to, at);
    } else {
      WalkAt(YAMLScalar::Lookup(IntToString(static_cast<int>(origin))), *element, ElementAt(from, origin),
             ElementAt(to, at));
      continue;
    }
    if (places_ != nullptr) places_->emplace(element, path_);
  }
  in_list_ = was_in_list;
  edits.order = origins;
  std::erase(edits.order, YAMLSequenceRemapper::kDropped);
  if (!std::ranges::is_sorted(edits.order)) add(kNewOrder, &to, OrderText(after, origins, from.Size()));
  if (edits.text.empty()) return;
  if (!shortened) edits.full.clear();
  if (edits.shown == edits.text) edits.shown.clear();
  found_(path_, std::move(edits), &from);
}

void SideWalk::MarkGone(size_t index) {
  path_.push_back(YAMLScalar::Lookup(IntToString(static_cast<int>(index))));
  gone_(path_);
  path_.pop_back();
}

void SideWalk::RememberInner(const Operation& operation) {
  if (places_ == nullptr) return;
  if (operation.GetKind() == Operation::Kind::kChangeSequence) {
    const auto& elements = static_cast<const ChangeSequenceOperation&>(operation).GetDiff()->GetEntries();
    for (const auto& [index, element] : elements) {
      places_->emplace(element, path_);
      RememberInner(*element);
    }
  }
  if (operation.GetKind() != Operation::Kind::kChangeMapping) return;
  const auto& entries = static_cast<const ChangeMappingOperation&>(operation).GetDiff()->GetEntries();
  for (const YAMLMappingDiff::Entry& entry : entries) {
    places_->emplace(entry.operation, path_);
    RememberInner(*entry.operation);
  }
}

}  // namespace vexel_yaml
