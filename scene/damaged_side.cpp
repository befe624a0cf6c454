#include "scene/damaged_side.h"

#include <string_view>

namespace vexel_yaml {

namespace {

using Slot = YAMLMapping::Slot;

constexpr size_t kFewestObjects = 50;

// What one side lacks of base.
struct Side {
  const FileToRead& file;
  std::string_view name;
  size_t missing = 0;
  // Null where the file ends behind an object.
  const YAMLScalar* cut_object = nullptr;
};

size_t CountMissing(const VexelObjects& base, const VexelObjects& side) {
  size_t missing = 0;
  auto next = side.begin();
  const auto stands_next = [&](const YAMLScalar* key) { return next != side.end() && (*next).key == key; };
  for (const Slot& slot : base) {
    // Mostly the objects stand in one order, and new ones here and there.
    if (!stands_next(slot.key)) {
      if (!side.HasKey(slot.key)) {
        ++missing;
        continue;
      }
      while (next != side.end() && !base.HasKey((*next).key)) ++next;
    }
    if (stands_next(slot.key)) ++next;
  }
  return missing;
}

const Slot* LastOf(const VexelObjects& objects) {
  const Slot* last = nullptr;
  for (const Slot& slot : objects) last = &slot;
  return last;
}

// Whether base has objects behind one of its own, and the side none of them.
bool LacksAllBehind(const YAMLScalar* file_id, const VexelObjects& base, const VexelObjects& side) {
  bool is_behind = false;
  bool lacks = false;
  for (const Slot& slot : base) {
    if (is_behind && side.HasKey(slot.key)) return false;
    lacks |= is_behind;
    is_behind |= slot.key == file_id;
  }
  return lacks;
}

// Whether the text of a body is the first lines of another's.
bool IsCutAtLineEnd(const YAMLNode& body, const YAMLNode& whole) {
  std::string text = body.GetYAMLString();
  // What stands for a value that isn't there any more.
  text.resize(text.find_last_not_of(" '\n") + 1);
  const std::string whole_text = whole.GetYAMLString();
  return text.size() < whole_text.size() && whole_text.starts_with(text) && whole_text[text.size()] == '\n';
}

const YAMLScalar* FindCutObject(const VexelObjects& base, const VexelObjects& side) {
  const Slot* last = LastOf(side);
  if (last == nullptr) return nullptr;
  if (base.EndsInLineBreak() && !side.EndsInLineBreak()) return last->key;
  if (!base.HasKey(last->key)) return nullptr;
  // Copies, since an object that was read is no longer known as the same by its text.
  const OwnedNodePtr<YAMLNode> object(last->value->Clone()), whole(base.Get(last->key)->Clone());
  const YAMLNode* body = object->AsMapping()->First();
  const YAMLNode* whole_body = whole->AsMapping()->First();
  // Removing the last lines of the last object is an edit like others, unless none are left.
  const bool is_cut = body == YAMLScalar::empty
                          ? whole_body != YAMLScalar::empty
                          : LacksAllBehind(last->key, base, side) && IsCutAtLineEnd(*body, *whole_body);
  return is_cut ? last->key : nullptr;
}

std::string Describe(const Side& side, const Side& other, size_t base_size) {
  std::string lacks;
  if (side.missing != 0) {
    lacks = "lacks " + std::to_string(side.missing) + " of base's " + std::to_string(base_size) + " objects";
  }
  const bool is_too_small = base_size >= kFewestObjects && side.missing * 2 > base_size && other.missing == 0;
  const std::string start =
      "Warning: the " + std::string(side.name) + " file '" + side.file.path + "' looks damaged: it ";
  if (side.cut_object != nullptr) {
    return start + "ends in the middle of object " + side.cut_object->GetText() +
           (lacks.empty() ? "" : " and " + lacks);
  }
  return is_too_small ? start + lacks + ", the " + std::string(other.name) + " file none" : "";
}

}  // namespace

std::vector<std::string> DescribeDamage(const std::vector<FileToRead>& versions) {
  const VexelObjects& base = versions[0].objects;
  const auto look = [&](const FileToRead& file, std::string_view name) {
    return Side{file, name, CountMissing(base, file.objects), FindCutObject(base, file.objects)};
  };
  const Side left = look(versions[1], "left");
  const Side right = look(versions[2], "right");
  std::vector<std::string> lines;
  for (std::string line : {Describe(left, right, base.Size()), Describe(right, left, base.Size())}) {
    if (!line.empty()) lines.push_back(std::move(line));
  }
  return lines;
}

}  // namespace vexel_yaml
