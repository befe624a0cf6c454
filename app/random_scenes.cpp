#include "app/random_scenes.h"

#include <algorithm>
#include <random>
#include <set>

#include "fixups/file_id_collisions.h"
#include "yaml/read_yaml.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml {

namespace {

struct List {
  // The key under which it stands.
  std::string key;
  YAMLSequence* elements;
};

// Everything below the class key of an object that an edit may touch.
void Collect(const std::string& at, YAMLNode* node, std::vector<YAMLMapping*>& mappings,
             std::vector<List>& lists) {
  if (YAMLMapping* mapping = node->AsMapping()) {
    mappings.push_back(mapping);
    for (const auto& [key, value] : *mapping) Collect(key->GetText(), value, mappings, lists);
  } else if (YAMLSequence* list = node->AsSequence()) {
    lists.push_back({at, list});
    for (YAMLNode* item : list->GetItems()) Collect(at, item, mappings, lists);
  }
}

// What tells an element from the others of its list, empty for one without a key.
std::string IdentityOf(const List& list, const YAMLNode* element) {
  if (const YAMLScalar* scalar = element->AsScalar()) return "value " + scalar->GetText();
  const YAMLMapping* mapping = element->AsMapping();
  if (list.key == "m_Component" && mapping != nullptr) mapping = mapping->First()->AsMapping();
  const YAMLNode* file_id = mapping == nullptr ? nullptr : mapping->Get(YAMLScalar::fileID);
  return file_id == nullptr || file_id->AsScalar() == nullptr ? "" : file_id->AsScalar()->GetText();
}

OwnedNodePtr<YAMLNode> ReadValue(const std::string& text) {
  const auto objects = ReadScene("--- !v!1 &1\nvalue: " + text + "\n");
  return OwnedNodePtr<YAMLNode>(objects->First()->AsMapping()->Steal(YAMLScalar::Lookup("value")));
}

// Edits scenes, and remembers whether it moved anything.
class Editor {
 public:
  explicit Editor(uint32_t seed) : random_(seed) {}

  uint32_t Below(size_t limit) { return static_cast<uint32_t>(random_() % limit); }
  bool HasMoved() const { return moved_; }

  std::string NewObject(uint32_t file_id) {
    const std::string header = " &" + std::to_string(file_id) + (Below(8) == 0 ? " stripped\n" : "\n");
    const std::string fields[] = {
        "1" + header + "GameObject:\n  m_Component:\n" + References("component: ") +
            "  m_Name: b1\n  m_Text: b2\n  m_Tags: [b1, b2, b3]\n",
        "4" + header + "Transform:\n  m_LocalPosition: {x: 0.5, y: 1, z: -2}\n  m_Children:\n" +
            References("") + "  m_Father: {fileID: 3}\n",
        "114" + header + "MonoBehaviour:\n  m_Script: {fileID: 7, guid: b1, type: 3}\n  speed: b1\n" +
            "  nested:\n    p: b1\n    q: b2\n    deep:\n      r: b3\n      s: b4\n" +
            "  list:\n  - b1\n  - b2\n  - b3\n  - b4\n  targets: [{fileID: 1}, {fileID: 2}]\n"};
    return "--- !v!" + fields[Below(3)];
  }

  void Edit(VexelObjects& scene, uint32_t count) {
    for (; count > 0; --count) EditOnce(scene);
    scene.RebuildHash(false);
  }

 private:
  std::string References(const std::string& name) {
    std::string lines;
    for (uint32_t i = 0, count = 1 + Below(4); i < count; ++i) {
      lines += "  - " + name + "{fileID: 1" + std::to_string(i) + "}\n";
    }
    return lines;
  }

  // An ordinary text or one that is hard to write.
  YAMLNode* NewScalar() {
    constexpr const char* kPieces[] = {"",   " ",  "\n", "- ",       ": ",   "#",  "'",
                                       "\"", "\\", "\t", "\xC3\xA9", "e1",   "~",  "{",
                                       "]",  "%",  "\r", "&",        "null", "!v", "long words "};
    std::string text = Below(6) != 0 ? "e" + std::to_string(Below(4)) : "";
    for (uint32_t i = text.empty() ? 1 + Below(12) : 0; i > 0; --i)
      text += kPieces[Below(std::size(kPieces))];
    return YAMLScalar::LookupValue(text);
  }

  YAMLNode* NewValue() {
    constexpr const char* kTexts[] = {
        "{fileID: 21}", "{fileID: 22, guid: e1}", "{x: e1, y: e2}",    "{x: e1, y: e4}", "[e1, e2]",
        "[e1, e3]",     "\n  p: e1\n  q: e2",     "\n  r: e2\n  p: e1"};
    return Below(2) == 0 ? NewScalar() : ReadValue(kTexts[Below(std::size(kTexts))]).release();
  }

  void EditOnce(VexelObjects& scene) {
    const uint32_t kind = Below(10);
    if (kind == 0 || scene.Size() == 0) return AddObject(scene);
    const YAMLScalar* object = AnyKey(scene);
    if (kind == 1) return scene.Remove(object);
    if (kind == 2 && Below(3) == 0) return MoveKey(scene, object);
    std::vector<YAMLMapping*> mappings;
    std::vector<List> lists;
    Collect("", scene.Get(object)->AsMapping()->First(), mappings, lists);
    if (kind > 6 && !lists.empty()) return EditList(lists[Below(lists.size())]);
    if (!mappings.empty()) EditMapping(*mappings[Below(mappings.size())]);
  }

  const YAMLScalar* AnyKey(const YAMLMapping& mapping) {
    auto slot = mapping.begin();
    for (uint32_t i = Below(mapping.Size()); i > 0; --i) ++slot;
    return (*slot).key;
  }

  void AddObject(VexelObjects& scene) {
    const uint32_t file_id = 31 + Below(4);
    const YAMLScalar* key = YAMLScalar::Lookup(std::to_string(file_id));
    if (scene.HasKey(key)) return;
    scene.Insert(key, ReadScene(NewObject(file_id))->Steal(key));
    PutKey(scene, key);
  }

  void PutKey(YAMLMapping& mapping, const YAMLScalar* key) {
    std::vector<const YAMLScalar*> order;
    for (const auto& [other, value] : mapping) {
      if (other != key) order.push_back(other);
    }
    order.insert(order.begin() + Below(order.size() + 1), key);
    mapping.Reorder(order);
  }

  void MoveKey(YAMLMapping& mapping, const YAMLScalar* key) {
    PutKey(mapping, key);
    moved_ = true;
  }

  void EditMapping(YAMLMapping& mapping) {
    const YAMLScalar* key = AnyKey(mapping);
    const YAMLScalar* added = YAMLScalar::Lookup("k" + std::to_string(Below(4)));
    const uint32_t kind = Below(6);
    if (kind == 0 && !mapping.HasKey(added)) {
      mapping.Insert(added, NewValue());
      PutKey(mapping, added);
    } else if (kind == 1 && mapping.Size() > 1) {
      // The last one stays: an empty mapping has the hash of an empty list, which counts as unchanged.
      mapping.Remove(key);
    } else if (key == YAMLScalar::fileID) {
      mapping.Change(key, YAMLScalar::LookupValue("4" + std::to_string(Below(9))));
    } else if (kind == 2 || mapping.Get(key)->AsScalar() != nullptr) {
      // Below the root only a mapping that changed otherwise keeps its new order.
      if (kind == 2) MoveKey(mapping, key);
      mapping.Change(key, NewScalar())->Free();
    }
  }

  void EditList(const List& list) {
    std::vector<YAMLNode*> items = list.elements->GetItems();
    const uint32_t kind = items.empty() ? 0 : Below(25);
    YAMLNode* put = nullptr;
    if (kind < 9) {
      put = NewElement(list);
    } else if (kind == 24) {
      put = items[Below(items.size())]->Clone();
    } else {
      put = items[Below(items.size())];
      std::erase(items, put);
    }
    if (kind < 9 || kind > 16) {
      items.insert(items.begin() + Below(items.size() + 1), put);
    } else {
      put->Free();
    }
    moved_ = moved_ || kind > 16;
    list.elements->SwapItems(std::move(items));
  }

  YAMLNode* NewElement(const List& list) {
    const auto [before, after] = list.key == "m_Component" ? std::pair("{component: {fileID: 2", "}}")
                                 : list.key == "m_Children" || list.key == "targets"
                                     ? std::pair("{fileID: 2", "}")
                                     : std::pair("e", "");
    for (uint32_t i = Below(4);; ++i) {
      YAMLNode* element = ReadValue(before + std::to_string(i) + after).release();
      const std::string identity = IdentityOf(list, element);
      const auto is_it = [&](const YAMLNode* item) { return IdentityOf(list, item) == identity; };
      if (std::ranges::none_of(list.elements->GetItems(), is_it)) return element;
      element->Free();
    }
  }

  std::mt19937 random_;
  bool moved_ = false;
};

}  // namespace

std::unique_ptr<VexelObjects> ReadScene(const std::string& documents) {
  auto scene = std::make_unique<VexelObjects>();
  if (!ParseYAMLString("%YAML 1.1\n%TAG !v! tag:vexel.com,2011:\n" + documents, *scene)) {
    throw YAMLError("libyaml can't start");
  }
  return scene;
}

SceneTriple RandomTriple(uint32_t seed) {
  Editor editor(seed);
  std::string text;
  for (uint32_t file_id = 1, count = 1 + editor.Below(4); file_id <= count; ++file_id) {
    text += editor.NewObject(file_id);
  }
  SceneTriple triple;
  triple.base = ReadScene(text);
  const std::unique_ptr<VexelObjects> common(triple.base->Clone());
  editor.Edit(*common, editor.Below(3) / 2);
  triple.left.reset(common->Clone());
  triple.right.reset(common->Clone());
  editor.Edit(*triple.left, editor.Below(5));
  editor.Edit(*triple.right, editor.Below(5));
  ConflictingFileIDs ids = CreateConflictingFileIDsRemapper(FileIDSet(*triple.base), FileIDSet(*triple.left),
                                                            FileIDSet(*triple.right));
  RemapCollidingAddFileIDs(ids, *triple.left, *triple.right);
  triple.moved = editor.HasMoved();
  return triple;
}

}  // namespace vexel_yaml
