#include "report/conflict_names.h"

#include <algorithm>
#include <sstream>

#include "diff/yaml_diff_output.h"
#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "fixups/engine_keys.h"
#include "report/list_edit_text.h"
#include "report/override_names.h"
#include "report/record_patterns.h"
#include "report/report_model.h"
#include "report/report_places.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

using Record = RecordingConflictResolver::Record;

constexpr size_t kMostOfValue = 60;
constexpr size_t kMostOfField = 100;
constexpr size_t kMostKeys = 3;

bool IsIndex(const std::string& text) {
  return !text.empty() && std::ranges::all_of(text, [](char c) { return c >= '0' && c <= '9'; });
}

// The fields on the way from an object's body to a place in it.
std::string FieldText(const FieldPath& path) {
  std::string text;
  for (size_t i = 2; i < path.size(); ++i) {
    const std::string component = path[i]->GetText();
    if (i > 2 && IsIndex(component)) {
      text += "[" + component + "]";
    } else {
      text += (text.empty() ? "" : ".") + component;
    }
  }
  return Shortened(OnOneLine(text), kMostOfField);
}

std::string KeysText(const YAMLMappingDiff& diff) {
  std::string text;
  size_t count = 0;
  for (const YAMLMappingDiff::Entry& entry : diff.GetEntries()) {
    if (entry.key->IsPseudoKey() || ++count > kMostKeys) continue;
    text += (text.empty() ? "" : ", ") + entry.key->GetText();
  }
  if (count > kMostKeys) text += " and " + std::to_string(count - kMostKeys) + " more";
  return text;
}

// Null for any other operation, or none.
const YAMLMappingDiff* ChangedMapping(const Operation* operation) {
  if (operation == nullptr || operation->GetKind() != Operation::Kind::kChangeMapping) return nullptr;
  return static_cast<const ChangeMappingOperation*>(operation)->GetDiff();
}

// The fields of an object: it has one entry, which is its body.
const YAMLMappingDiff& BodyDiff(const YAMLMappingDiff& object) {
  if (object.GetEntries().size() != 1) return object;
  const YAMLMappingDiff* body = ChangedMapping(object.GetEntries().front().operation);
  return body == nullptr ? object : *body;
}

const YAMLScalar* NewScalar(const Operation* operation) {
  if (operation == nullptr) return nullptr;
  const auto kind = operation->GetKind();
  if (kind != Operation::Kind::kAdd && kind != Operation::Kind::kChange) return nullptr;
  return static_cast<const ValuedOperation*>(operation)->GetValue()->AsScalar();
}

// The new values of a few fields, such as "x 2, z 3"; empty where more than that was done.
std::string ScalarsText(const YAMLMappingDiff& diff) {
  std::string text;
  if (diff.GetEntries().size() > kMostKeys) return text;
  for (const YAMLMappingDiff::Entry& entry : diff.GetEntries()) {
    const YAMLScalar* value = NewScalar(entry.operation);
    if (value == nullptr) return {};
    text += (text.empty() ? "" : ", ") + entry.key->GetText() + " " + value->GetText();
  }
  return text.size() > kMostOfValue ? std::string() : text;
}

std::string MappingText(const YAMLMappingDiff& diff) {
  const std::string keys = KeysText(diff);
  const ChangeSequenceOperation* order = diff.GetKeyOrder();
  const bool is_reordered =
      order != nullptr && (order->GetRemapper() != nullptr || !order->GetDiff()->GetEntries().empty());
  if (keys.empty() && !is_reordered) return "leaves it";
  return keys.empty() ? "reorders it" : "edits " + keys;
}

std::string FullText(const Operation* operation) {
  if (operation == nullptr) return {};
  std::ostringstream text;
  YAMLDiffOutput out(text, 1);
  operation->Output(out);
  return std::move(text).str();
}

class ConflictNamer {
 public:
  ConflictNamer(const RecordingConflictResolver& resolver, const ComparedVersions& versions)
      : patterns_(resolver), versions_(versions), names_({&versions.right, &versions.left, &versions.base}) {}

  void FindAssets(const std::vector<const Record*>& records, const AssetSearch& search) {
    std::set<std::string> guids;
    for (const Record* record : records) {
      guids.insert(names_.GetScriptGuid(record->path.front()));
      if (record->path.size() == 1) continue;
      const YAMLNode* base = ValueAt(record->path);
      for (const YAMLNode* value : {base, ValueAfter(base, record->left), ValueAfter(base, record->right)})
        CollectGuids(value, guids);
    }
    guids.erase("");
    if (!guids.empty()) names_.SetAssetNames(search(guids));
  }

  NamedConflict Name(const Record& record) {
    const FieldPath& path = record.path;
    NamedConflict conflict = {patterns_.For(record),
                              names_.GetOwner(path.front())->GetText(),
                              ObjectText(path.front()),
                              {},
                              {},
                              {},
                              {}};
    const auto overridden = OverrideAt(record, versions_);
    if (overridden) {
      conflict.name += " > " + overridden->name;
    } else if (path.size() > 2) {
      conflict.name += " > " + FieldText(path);
    }
    const YAMLNode* base_value = overridden ? overridden->base_value : ValueAt(path);
    Describe(record, base_value, conflict);
    // Things of one name, or long lists that differ at their ends.
    if (conflict.theirs == conflict.ours || conflict.was == conflict.theirs ||
        conflict.was == conflict.ours) {
      with_ = NamedWith::kFileIDs;
      Describe(record, base_value, conflict);
      with_ = NamedWith::kNothing;
    }
    conflict.edits = BaseContent(path) + '\n' + FullText(record.left) + '\n' + FullText(record.right);
    return conflict;
  }

 private:
  // What there was, and what the sides did.
  void Describe(const Record& record, const YAMLNode* base_value, NamedConflict& conflict) {
    const FieldPath& path = record.path;
    if (record.type == ConflictType::kBothAdd) {
      conflict.was = "nothing";
      if (versions_.are_scenes) conflict.was += " (theirs stands until settled)";
    } else if (path.size() > 1 && base_value != nullptr) {
      conflict.was = IsAboutFather(path) ? FatherText(*base_value) : WasText(record, *base_value);
    }
    conflict.theirs = SideText(record, record.left, true);
    conflict.ours = SideText(record, record.right, false);
  }

  // The object, and its class where the path to it doesn't say it all.
  std::string ObjectText(const YAMLScalar* file_id) {
    const std::string path = OnOneLine(names_.GetPath(file_id));
    const std::string class_name = OnOneLine(names_.GetClass(file_id));
    if (path.empty())
      return (class_name.empty() ? "object" : class_name) + " " + OnOneLine(file_id->GetText());
    return class_name.empty() || class_name == "GameObject" ? path : path + " > " + class_name;
  }

  const YAMLNode* ValueAt(const FieldPath& path) const {
    const YAMLNode* node = &versions_.base;
    for (const YAMLScalar* component : path) {
      const YAMLSequence* list = versions_.are_scenes ? node->AsSequence() : nullptr;
      const auto index = static_cast<size_t>(component->GetIntValue());
      if (list != nullptr) {
        node = IsIndex(component->GetText()) && index < list->Size() ? list->GetItems()[index] : nullptr;
      } else {
        const YAMLMapping* mapping = node->AsMapping();
        node = mapping == nullptr || mapping->HasDuplicateKeys() ? nullptr : mapping->Get(component);
      }
      if (node == nullptr) return nullptr;
    }
    return node;
  }

  // All that goes or stays with a conflict: of an object, what belongs to it or hangs below it as well, and
  // of an element that can't be told, its list.
  std::string BaseContent(const FieldPath& path) {
    FieldPath place = path;
    while (place.size() > 2 && ValueAt(place) == nullptr) place.pop_back();
    if (place.size() > 1) {
      const YAMLNode* value = ValueAt(place);
      return value == nullptr ? std::string() : TextOf(*value);
    }
    const YAMLScalar* owner = names_.GetOwner(path.front());
    const std::string own_path = names_.GetPath(path.front());
    std::string content;
    for (const YAMLMapping::Slot& slot : versions_.base) {
      const std::string& there = names_.GetPath(slot.key);
      const bool is_below = !own_path.empty() && there.starts_with(own_path) &&
                            (there.size() == own_path.size() || there[own_path.size()] == '/');
      if (is_below || names_.GetOwner(slot.key) == owner) content += TextOf(*slot.value) + '\n';
    }
    return content;
  }

  static std::string TextOf(const YAMLNode& value) {
    const YAMLScalar* scalar = value.AsScalar();
    return scalar == nullptr ? value.GetYAMLString() : scalar->GetText();
  }

  static bool IsAboutFather(const FieldPath& path) {
    return path.back() == YAMLScalar::mFather || path.back() == YAMLScalar::mTransformParent;
  }

  std::string FatherText(const YAMLNode& reference) {
    const YAMLScalar* father = LocalReference(&reference);
    return father == nullptr ? "at the top" : "below " + PlaceText(father);
  }

  std::string PlaceText(const YAMLScalar* file_id) {
    const std::string name = OnOneLine(names_.Describe(file_id));
    if (name.empty()) return "object " + file_id->GetText();
    return with_ == NamedWith::kNothing ? Shortened(name, kMostOfValue)
                                        : name + " (" + file_id->GetText() + ")";
  }

  std::string WasText(const Record& record, const YAMLNode& value) {
    const std::string text = ValueText(record.path, value);
    const YAMLSequence* list = value.AsSequence();
    if (list != nullptr && text.ends_with(kEllipsis))
      return ListBeforeText(*list, record.left, record.right, names_);
    return value.AsScalar() == nullptr && text.ends_with(kEllipsis) ? std::string() : text;
  }

  // A value at a place. Of a reference, a record may name a part alone.
  std::string ValueText(const FieldPath& path, const YAMLNode& value) {
    std::string text;
    if (const YAMLSequence* list = value.AsSequence()) {
      for (const std::string& element : NamedElements(*list, names_, with_))
        text += (text.empty() ? "" : ", ") + element;
      text = '[' + text + ']';
    } else {
      text = PartOfReference(path, value.AsScalar());
      if (text.empty()) text = OnOneLine(NamedText(&value, names_, with_));
    }
    return with_ == NamedWith::kNothing ? Shortened(text, kMostOfValue) : text;
  }

  std::string PartOfReference(const FieldPath& path, const YAMLScalar* part) {
    if (part == nullptr || !IsPartOfReference(path)) return {};
    if (path.back() == YAMLScalar::guid) return OnOneLine(names_.GetAssetName(part->GetText()));
    const YAMLNode* whole = ValueAt(Above(path));
    if (whole == nullptr || !IsReference(whole) || whole->AsMapping()->HasKey(YAMLScalar::guid)) return {};
    return TargetText(part);
  }

  std::string TargetText(const YAMLScalar* file_id) {
    return IsNullReference(file_id) ? "none" : PlaceText(file_id);
  }

  std::string SideText(const Record& record, const Operation* operation, bool is_left) {
    const std::string_view dependency = DependencyText(record);
    if (!dependency.empty() && IsLeftType(record.type) == is_left) return std::string(dependency);
    if (record.type == ConflictType::kTransformCycle) return "moves it into a circle";
    if (operation == nullptr) return "leaves it";
    switch (operation->GetKind()) {
      case Operation::Kind::kRemove:
        return "removes it";
      case Operation::Kind::kAdd:
        if (record.path.size() == 1) return "adds it";
        return "adds " + ValueText(record.path, *static_cast<const AddOperation*>(operation)->GetValue());
      case Operation::Kind::kChange:
        return ValueText(record.path, *static_cast<const ChangeOperation*>(operation)->GetValue());
      case Operation::Kind::kChangeMapping: {
        const YAMLMappingDiff& diff = *static_cast<const ChangeMappingOperation*>(operation)->GetDiff();
        if (record.path.size() > 1) {
          if (IsAboutFather(record.path) && NewTarget(diff) != nullptr) {
            return "moves it" + WhereText(NewTarget(diff));
          }
          const std::string moves = IsAboutFather(record.path) ? OtherMovesText(diff) : std::string();
          if (!moves.empty()) return moves;
          const YAMLNode* reference = ValueAfter(ValueAt(record.path), operation);
          if (reference != nullptr) return ValueText(record.path, *reference);
          const std::string values =
              NewTarget(diff) == nullptr ? ScalarsText(diff) : TargetText(NewTarget(diff));
          return OnOneLine(values.empty() ? MappingText(diff) : values);
        }
        const std::string parts = PartsText(diff, names_.GetPath(record.path.front()));
        return OnOneLine(parts.empty() ? MappingText(BodyDiff(diff)) : parts);
      }
      case Operation::Kind::kChangeSequence:
        return ListEditText(*static_cast<const ChangeSequenceOperation*>(operation), ValueAt(record.path),
                            names_, with_);
    }
    return {};
  }

  // What was done to the objects that an object consists of, where the diff is by file IDs; empty for one by
  // the object's class.
  std::string PartsText(const YAMLMappingDiff& diff, const std::string& path) {
    std::string text;
    size_t count = 0;
    for (const YAMLMappingDiff::Entry& entry : diff.GetEntries()) {
      if (!IsIndex(entry.key->GetText()) || entry.operation == nullptr || ++count > kMostKeys) continue;
      const bool is_inside = names_.GetPath(entry.key) == path && !path.empty();
      std::string name =
          is_inside ? names_.GetClass(entry.key) : Shortened(names_.Describe(entry.key), kMostOfValue);
      // What is gone with the rest of it has no name any more.
      if (name.empty()) name = "object " + entry.key->GetText();
      text += text.empty() ? "" : ", ";
      if (entry.operation->GetKind() == Operation::Kind::kChangeMapping) {
        const auto* change = static_cast<const ChangeMappingOperation*>(entry.operation);
        text += MappingText(BodyDiff(*change->GetDiff())) + " of " + name;
      } else {
        text += (entry.operation->GetKind() == Operation::Kind::kRemove ? "removes " : "adds ") + name;
      }
    }
    return count > kMostKeys ? text + " and " + std::to_string(count - kMostKeys) + " more" : text;
  }

  // What a reference leads to now, where that is all that has changed of it; else null.
  static const YAMLScalar* NewTarget(const YAMLMappingDiff& diff) {
    const Operation* change = diff.Get(YAMLScalar::fileID);
    if (change == nullptr || change->GetKind() != Operation::Kind::kChange || diff.GetEntries().size() > 1)
      return nullptr;
    return NewScalar(change);
  }

  std::string WhereText(const YAMLScalar* father) {
    return IsNullReference(father) ? " to the top" : " below " + PlaceText(father);
  }

  // A side can have its part in a circle without having moved this object. The diff is by file IDs then.
  std::string OtherMovesText(const YAMLMappingDiff& diff) {
    std::string text;
    for (const YAMLMappingDiff::Entry& entry : diff.GetEntries()) {
      const Operation* father = nullptr;
      if (const YAMLMappingDiff* fields = ChangedMapping(entry.operation)) {
        father = BodyDiff(*fields).Get(YAMLScalar::mFather);
      }
      const YAMLMappingDiff* reference = ChangedMapping(father);
      const YAMLScalar* target = reference == nullptr ? nullptr : NewTarget(*reference);
      if (target == nullptr) continue;
      text += (text.empty() ? "moves " : ", ") + PlaceText(entry.key) + WhereText(target);
    }
    return text;
  }

  const RecordPatterns patterns_;
  const ComparedVersions versions_;
  ObjectNames names_;
  NamedWith with_ = NamedWith::kNothing;
};

// Two lamps of one name can stand beside one another.
void TellApart(std::vector<NamedConflict>& conflicts) {
  std::map<std::string, size_t> counts;
  for (const NamedConflict& conflict : conflicts) ++counts[conflict.name];
  for (NamedConflict& conflict : conflicts) {
    if (counts[conflict.name] > 1) conflict.name += " (" + conflict.place + ")";
  }
}

std::string WithName(std::string_view side, std::string_view name) {
  return name.empty() ? std::string(side) : std::string(side) + " (" + std::string(name) + ")";
}

}  // namespace

std::vector<NamedConflict> NameConflicts(const RecordingConflictResolver& resolver,
                                         const ComparedVersions& versions, const AssetSearch& search) {
  std::vector<const Record*> pending;
  for (const Record& record : resolver.GetRecords()) {
    if (record.resolution == MergeResolve::kConflict) pending.push_back(&record);
  }
  ConflictNamer namer(resolver, versions);
  namer.FindAssets(pending, search);
  std::vector<NamedConflict> conflicts;
  for (const Record* record : pending) conflicts.push_back(namer.Name(*record));
  TellApart(conflicts);
  return conflicts;
}

std::string ConflictLine(const NamedConflict& conflict, std::string_view theirs, std::string_view ours) {
  return conflict.name + ": " + (conflict.was.empty() ? "" : "was " + conflict.was + ", ") +
         WithName("theirs", theirs) + " " + conflict.theirs + ", " + WithName("ours", ours) + " " +
         conflict.ours;
}

}  // namespace vexel_yaml
