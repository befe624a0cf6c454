#include "git/undecided_places.h"

#include <algorithm>
#include <cerrno>
#include <fstream>
#include <set>
#include <sstream>

#include "fixups/engine_keys.h"
#include "git/git_call.h"
#include "git/work_files.h"
#include "platform/file_error.h"
#include "yaml/read_yaml.h"
#include "yaml/write_objects.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

// The components of a path, between tabs: in an object's file ID and in names of fields there is none.
using Places = std::set<std::string>;

constexpr std::string_view kBegin = "# Undecided in this common ancestor:";
constexpr std::string_view kEnd = "# End of what is undecided";
constexpr std::string_view kComment = "#\t";

FieldPath PathOf(const std::string& place) {
  FieldPath path;
  for (const std::string& component : Pieces(place + '\t', '\t'))
    path.push_back(YAMLScalar::Lookup(component));
  return path;
}

std::string PlaceOf(const FieldPath& path) {
  std::string place;
  for (const YAMLScalar* component : path) place += (place.empty() ? "" : "\t") + component->GetText();
  return place;
}

const YAMLNode* Field(const YAMLNode* node, const YAMLScalar* key) {
  const YAMLMapping* mapping = node == nullptr ? nullptr : node->AsMapping();
  return mapping == nullptr || mapping->HasDuplicateKeys() ? nullptr : mapping->Get(key);
}

bool AreEqual(const YAMLNode* a, const YAMLNode* b) {
  return a == b || (a != nullptr && b != nullptr && a->EqualsExpensive(b) && a->HasSameContent(*b));
}

// The one element of a list that equals this one.
const YAMLScalar* IndexOf(const YAMLNode* element, const YAMLSequence& list) {
  const YAMLScalar* found = nullptr;
  for (size_t i = 0; i < list.Size(); ++i) {
    if (!AreEqual(element, list.GetItems()[i])) continue;
    if (found != nullptr) return nullptr;
    found = YAMLScalar::Lookup(IntToString(static_cast<int>(i)));
  }
  return found;
}

// The place in the result that has what a record is about: elements of lists count otherwise there. Up to the
// list where the element can't be told.
FieldPath PlaceInResult(const FieldPath& path, const VexelObjects& result, const VexelObjects& base,
                        const VexelObjects& left) {
  FieldPath place;
  const YAMLNode *there = &result, *in_base = &base, *in_left = &left;
  for (const YAMLScalar* component : path) {
    const YAMLSequence* list = there == nullptr ? nullptr : there->AsSequence();
    const YAMLScalar* step = component;
    if (list != nullptr) {
      const bool is_new = component->GetText().starts_with('+');
      const YAMLNode* holder = is_new ? in_left : in_base;
      const YAMLSequence* source = holder == nullptr ? nullptr : holder->AsSequence();
      const auto index = static_cast<size_t>(component->GetIntValue());
      if (source == nullptr || index >= source->Size()) return place;
      in_base = in_left = source->GetItems()[index];
      step = IndexOf(in_base, *list);
      if (step == nullptr) return place;
      there = list->GetItems()[static_cast<size_t>(step->GetIntValue())];
    } else {
      there = Field(there, component);
      in_base = Field(in_base, component);
      in_left = Field(in_left, component);
    }
    place.push_back(step);
  }
  return place;
}

// The objects that an edit of a thing is about.
void AddParts(const Operation* operation, Places& places) {
  if (operation == nullptr || operation->GetKind() != Operation::Kind::kChangeMapping) return;
  for (const auto& entry : static_cast<const ChangeMappingOperation*>(operation)->GetDiff()->GetEntries()) {
    const std::string& key = entry.key->GetText();
    if (!key.empty() && key.find_first_not_of("-0123456789") == std::string::npos) places.insert(key);
  }
}

// Scenes are large, and next to none has one.
bool HasList(const std::string& path) {
  constexpr auto kSize = static_cast<std::streamoff>(kEnd.size() + 2);
  std::ifstream file(path, std::ios::binary);
  std::string end(kSize, ' ');
  const bool is_read = file.seekg(-kSize, std::ios::end) && file.read(end.data(), kSize);
  if (file.bad()) throw FileError(FileError::Step::kReading, path, errno);
  return is_read && end.find(kEnd) != std::string::npos;
}

Places TakeList(const std::string& path) {
  Places places;
  if (!HasList(path)) return places;
  const std::string text = TextOf(path);
  const size_t begin = std::min(text.rfind(kBegin), text.size());
  for (std::string& line : Pieces(std::string_view(text).substr(begin), '\n')) {
    if (line.ends_with('\r')) line.pop_back();
    if (line.starts_with(kComment)) places.insert(line.substr(kComment.size()));
  }
  if (!PutFile(path, text.substr(0, begin))) places.clear();
  return places;
}

class Marker {
 public:
  Marker(VexelObjects& base, const VexelObjects& left, const VexelObjects& right, const std::string& mark)
      : base_(base), left_(left), right_(right), mark_(mark) {}

  void MarkAt(const FieldPath& path) {
    if (path.size() == 1) return MarkObject(path.front());
    YAMLNode* holder = &base_;
    const YAMLNode *left = &left_, *right = &right_;
    bool is_in_list = false;
    for (size_t i = 0; i + 1 < path.size() && holder != nullptr; ++i) {
      is_in_list |= holder->AsSequence() != nullptr;
      holder = Step(holder, path[i]);
      left = Field(left, path[i]);
      right = Field(right, path[i]);
    }
    YAMLNode* value = holder == nullptr ? nullptr : Step(holder, path.back());
    if (value == nullptr) return;
    is_in_list |= holder->AsSequence() != nullptr;
    // Which elements the sides' lists have for this one is the merge's to say. Equal edits make no conflict.
    YAMLNode* marked = is_in_list ? Marked(value)
                                  : MarkedWhereDifferent(path.back(), value, Field(left, path.back()),
                                                         Field(right, path.back()));
    Put(*holder, path.back(), value, marked);
  }

 private:
  static YAMLNode* Step(YAMLNode* holder, const YAMLScalar* step) {
    if (YAMLMapping* mapping = holder->AsMapping())
      return mapping->HasDuplicateKeys() ? nullptr : mapping->Get(step);
    const YAMLSequence* list = holder->AsSequence();
    const auto index = static_cast<size_t>(step->GetIntValue());
    return list != nullptr && index < list->Size() ? list->GetItems()[index] : nullptr;
  }

  static void Put(YAMLNode& holder, const YAMLScalar* key, const YAMLNode* value, YAMLNode* marked) {
    if (marked == value) return;
    if (YAMLSequence* list = holder.AsSequence()) {
      list->Set(key->GetIntValue(), marked);
    } else if (marked == nullptr) {
      holder.AsMapping()->Remove(key);
    } else {
      holder.AsMapping()->Change(key, marked);
    }
  }

  // Which is still there on one side must not go without a word; on both, its fields are what differs.
  void MarkObject(const YAMLScalar* file_id) {
    YAMLMapping* object = GetSubmapping(base_, file_id);
    YAMLMapping* body = object == nullptr || object->HasDuplicateKeys()
                            ? nullptr
                            : GetSubmapping(*object, object->FirstKey());
    if (body == nullptr || body->HasDuplicateKeys()) return;
    const YAMLNode *left = Field(&left_, file_id), *right = Field(&right_, file_id);
    if (left == nullptr || right == nullptr) {
      body->Append(YAMLScalar::Lookup(mark_), YAMLScalar::one->AsValue());
    } else {
      MarkFields(*body, Field(left, object->FirstKey()), Field(right, object->FirstKey()));
    }
  }

  void MarkFields(YAMLMapping& mapping, const YAMLNode* left, const YAMLNode* right) {
    static const YAMLScalar* const children = YAMLScalar::Lookup("m_Children");
    std::vector<YAMLMapping::Slot> fields;
    for (const YAMLMapping::Slot& slot : mapping) {
      // These lists follow from the objects.
      if (slot.key != children && slot.key != YAMLScalar::mComponent) fields.push_back(slot);
    }
    for (const auto& [key, value] : fields) {
      Put(mapping, key, value, MarkedWhereDifferent(key, value, Field(left, key), Field(right, key)));
    }
  }

  // Null for a list: it is as if both sides had added it.
  YAMLNode* MarkedWhereDifferent(const YAMLScalar* key, YAMLNode* value, const YAMLNode* left,
                                 const YAMLNode* right) {
    if (AreEqual(left, right)) return value;
    if (left == nullptr || right == nullptr) return Marked(value);
    YAMLMapping* mapping = value->AsMapping();
    if (mapping != nullptr && key == YAMLScalar::mFather && mapping->HasKey(YAMLScalar::fileID)) {
      // No list of children has what hangs on nothing.
      mapping->Change(YAMLScalar::fileID, YAMLScalar::LookupValue("0" + mark_));
      return value;
    }
    if (mapping != nullptr && !mapping->HasDuplicateKeys() && left->AsMapping() != nullptr &&
        right->AsMapping() != nullptr) {
      MarkFields(*mapping, left, right);
      return value;
    }
    return value->AsSequence() != nullptr ? nullptr : Marked(value);
  }

  // The value with a mark in it.
  YAMLNode* Marked(YAMLNode* value) {
    if (const YAMLScalar* scalar = value->AsScalar())
      return YAMLScalar::LookupValue(scalar->GetText() + mark_);
    if (YAMLSequence* list = value->AsSequence()) {
      list->Append(YAMLScalar::LookupValue(mark_));
      return value;
    }
    YAMLMapping* mapping = value->AsMapping();
    if (!mapping->HasDuplicateKeys()) mapping->Append(YAMLScalar::Lookup(mark_), YAMLScalar::one->AsValue());
    return value;
  }

  VexelObjects& base_;
  const VexelObjects& left_;
  const VexelObjects& right_;
  const std::string& mark_;
};

class MarkRemover final : public YAMLNodeVisitor {
 public:
  explicit MarkRemover(const std::string& mark) : mark_(mark), key_(YAMLScalar::Lookup(mark)) {}

  void Visit(const YAMLScalar& /*scalar*/) override {}

  void Visit(YAMLMapping& mapping) override {
    // What is still folded, nobody has put a mark into.
    if (mapping.GetFolded() != nullptr || mapping.HasDuplicateKeys()) return;
    mapping.Remove(key_);
    std::vector<YAMLMapping::Slot> fields;
    for (const YAMLMapping::Slot& slot : mapping) fields.push_back(slot);
    for (const auto& [key, value] : fields) {
      if (YAMLNode* plain = Unmarked(value)) mapping.Change(key, plain);
    }
  }

  void Visit(YAMLSequence& sequence) override {
    std::vector<YAMLNode*> items;
    for (YAMLNode* item : sequence.GetItems()) {
      YAMLNode* plain = Unmarked(item);
      if (item != key_) items.push_back(plain != nullptr ? plain : item);
    }
    sequence.SwapItems(std::move(items));
  }

 private:
  // Null where it has none of its own.
  YAMLNode* Unmarked(YAMLNode* value) {
    if (value == nullptr) return nullptr;
    value->Accept(*this);
    const YAMLScalar* scalar = value->AsScalar();
    if (scalar == nullptr || !scalar->GetText().ends_with(mark_)) return nullptr;
    return YAMLScalar::LookupValue(
        std::string_view(scalar->GetText()).substr(0, scalar->GetText().size() - mark_.size()));
  }

  const std::string& mark_;
  const YAMLScalar* key_;
};

// What none of the files holds.
std::string FreeMark(const AssetVersions& versions) {
  std::string mark = "(undecided)";
  for (const std::string& path : {versions.base, versions.left, versions.right}) {
    const std::string text = TextOf(path);
    while (text.find(mark) != std::string::npos) mark.insert(mark.size() - 1, 1, '!');
  }
  return mark;
}

}  // namespace

std::string WithUndecidedPlaces(const AssetMerge& merge, const AssetVersions& versions) {
  Places places(versions.undecided.begin(), versions.undecided.end());
  std::string text = merge.GetText();
  VexelObjects result, base, left;
  ParseYAMLString(text, result);
  ParseYAMLFile(versions.base, base);
  ParseYAMLFile(versions.left, left);
  if (!versions.mark.empty()) RemoveMarks(base, versions.mark);
  for (const RecordingConflictResolver::Record& record : merge.GetRecords()) {
    if (record.resolution != MergeResolve::kConflict) continue;
    places.insert(PlaceOf(PlaceInResult(record.path, result, base, left)));
    if (record.path.size() > 1) continue;
    for (const Operation* operation : {record.left, record.right}) AddParts(operation, places);
  }
  if (places.empty()) return text;
  if (!text.ends_with('\n')) text += '\n';
  text += std::string(kBegin) + '\n';
  for (const std::string& place : places) text += std::string(kComment) + place + '\n';
  return text + std::string(kEnd) + '\n';
}

void MarkUndecided(AssetVersions& versions) {
  Places places;
  for (const std::string& path : {versions.base, versions.left, versions.right}) {
    places.merge(TakeList(path));
  }
  if (places.empty()) return;
  versions.undecided.assign(places.begin(), places.end());
  versions.mark = FreeMark(versions);
  VexelObjects base, left, right;
  try {
    ParseYAMLFile(versions.base, base);
    ParseYAMLFile(versions.left, left);
    ParseYAMLFile(versions.right, right);
    Marker marker(base, left, right, versions.mark);
    for (const std::string& place : places) marker.MarkAt(PathOf(place));
    std::ostringstream text;
    WriteObjects(base, text, false);
    PutFile(versions.base, text.view());
  } catch (const YAMLError&) {
    versions.mark.clear();
  }
}

void RemoveMarks(VexelObjects& merged, const std::string& mark) {
  MarkRemover remover(mark);
  for (const YAMLMapping::Slot& slot : merged) slot.value->Accept(remover);
}

}  // namespace vexel_yaml
