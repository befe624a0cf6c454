#include "scene_documents.h"

#include <array>
#include <cstddef>
#include <string_view>
#include <vector>

namespace {

constexpr std::array<std::string_view, 12> kNames = {
    "Crate",        "Street Lamp", "Fence Post",  "\"Caf\\xE9 Chair\"",  "Oak Tree", "Barrel",
    "Market Stall", "Door Frame",  "Rowing Boat", "\"B\\xFCcherregal\"", "Rock",     "Window"};
constexpr std::array<std::string_view, 4> kTags = {"Untagged", "Scenery", "Breakable", "Interactive"};
constexpr std::string_view kNoReference = "{fileID: 0}";

template <typename... Parts>
void Put(std::string& out, const Parts&... parts) {
  (out.append(std::string_view(parts)), ...);
}

std::string Decimal(uint64_t thousandths) {
  std::string fraction = std::to_string(thousandths % 1000 + 1000).substr(1);
  fraction.erase(fraction.find_last_not_of('0') + 1);
  const std::string whole = std::to_string(thousandths / 1000);
  return fraction.empty() ? whole : whole + "." + fraction;
}

std::string Reference(uint64_t slot) { return "{fileID: " + ScenePlan::FileID(slot) + "}"; }

/// One document, with the field that this version edits.
class Document {
 public:
  Document(const ScenePlan& plan, uint64_t slot, Version version, std::string& out)
      : plan_(plan), slot_(slot), version_(version), edit_(plan.EditOf(slot, version)), out_(out) {}

  void GameObject(const std::vector<uint64_t>& components) {
    Begin(1, "GameObject");
    Put(out_, "  m_Component:\n");
    for (const uint64_t component : components) Put(out_, "  - component: ", Reference(component), "\n");
    std::string name(kNames[Pick(1, kNames.size())]);
    std::string number;
    Put(number, " ", std::to_string(Pick(2, 1000)), edit_ == 1 ? " renamed" : "");
    name.insert(name.back() == '"' ? name.size() - 1 : name.size(), number);
    Put(out_, "  m_Layer: ", std::to_string(Pick(3, 8) + (edit_ == 2 ? 8 : 0)), "\n");
    Put(out_, "  m_Name: ", name, "\n");
    Put(out_, "  m_Tag: ", edit_ == 3 ? "Edited" : kTags[Pick(4, kTags.size())], "\n");
    Put(out_, "  m_IsActive: ", edit_ == 4 ? "0" : "1", "\n");
  }

  void Transform(uint64_t game_object, std::string_view father, const std::vector<uint64_t>& children) {
    Begin(4, "Transform");
    Put(out_, "  m_GameObject: ", Reference(game_object), "\n");
    Put(out_, "  m_LocalRotation: {x: 0, y: ", Value(1, 1000, edit_ == 1), ", z: 0, w: ", Value(2, 1000),
        "}\n");
    Put(out_, "  m_LocalPosition: ", Vector(3, 200'000, edit_ == 2), "\n");
    Put(out_, "  m_LocalScale: ", Vector(6, 3000, edit_ >= 3), "\n");
    Put(out_, children.empty() ? "  m_Children: []\n" : "  m_Children:\n");
    for (const uint64_t child : children) Put(out_, "  - ", Reference(child), "\n");
    Put(out_, "  m_Father: ", father, "\n");
  }

  void MeshFilter(uint64_t game_object) {
    Begin(33, "MeshFilter");
    Put(out_, "  m_GameObject: ", Reference(game_object), "\n");
    const uint64_t mesh = 4'300'000 + 2 * Pick(1, 100) + (edit_ == 1 || edit_ == 2 ? 1 : 0);
    Put(out_, "  m_Mesh: ", Asset(mesh, 2, 3), "\n");
    Put(out_, "  m_LightmapScale: ", Value(3, 2000, edit_ >= 3), "\n");
  }

  void MeshRenderer(uint64_t game_object) {
    BeginComponent(23, "MeshRenderer", game_object);
    Put(out_, "  m_CastShadows: ", edit_ == 1 ? "2" : "1", "\n  m_ReceiveShadows: 1\n  m_Materials:\n");
    const uint64_t materials = 1 + Pick(1, 2) + (edit_ == 2 ? 1 : 0);
    for (uint64_t i = 0; i < materials; ++i) Put(out_, "  - ", Asset(2'100'000 + 2 * i, 10 + i, 2), "\n");
    Put(out_, "  m_LightProbeUsage: 1\n  m_ReflectionProbeUsage: 1\n");
    Put(out_, "  m_LightmapIndex: ", edit_ == 3 ? "3" : "65535", "\n");
    Put(out_, "  m_SortingOrder: ", std::to_string(Pick(2, 10) + (edit_ == 4 ? 20 : 0)), "\n");
  }

  void Collider(uint64_t game_object) {
    BeginComponent(65, "BoxCollider", game_object);
    Put(out_, "  m_Material: ", kNoReference, "\n");
    Put(out_, "  m_IsTrigger: ", edit_ == 1 ? "1" : "0", "\n");
    Put(out_, "  m_Size: ", Vector(1, 4000, edit_ == 2), "\n");
    Put(out_, "  m_Center: ", Vector(4, 1000, edit_ >= 3), "\n");
  }

  void Light(uint64_t game_object) {
    BeginComponent(108, "Light", game_object);
    Put(out_, "  m_Type: ", std::to_string(Pick(1, 3)), "\n  m_Color: ", Color(2, edit_ == 1), "\n");
    Put(out_, "  m_Intensity: ", Value(5, 4000, edit_ == 2), "\n");
    Put(out_, "  m_Range: ", Value(6, 50'000, edit_ == 3), "\n");
    Put(out_, "  m_SpotAngle: ", Value(7, 90'000, edit_ == 4), "\n");
  }

  void Script(std::string_view game_object, std::string_view target) {
    Begin(114, "MonoBehaviour");
    Put(out_, "  m_GameObject: ", game_object, "\n  m_Enabled: 1\n");
    Put(out_, "  m_Script: ", Asset(11'500'000, 1, 3), "\n  m_Name:\n");
    Put(out_, "  speed: ", Value(2, 9000, edit_ == 1), "\n");
    const std::string_view renamed = version_ == Version::kLeft ? "reachInMetres" : "reachInTiles";
    Put(out_, "  ", edit_ == 2 ? renamed : "reach", ": ", Value(3, 5000), "\n");
    Put(out_, "  target: ", target, "\n");
    Put(out_, "  description: Worn by salt and wind, this one has stood here longer than anybody\n",
        "    in the village can remember, and nobody knows who built it\n  waypoints:\n");
    const uint64_t waypoints = 3 + Pick(4, 4) + (edit_ == 3 ? 1 : 0);
    for (uint64_t i = 0; i < waypoints; ++i) {
      Put(out_, "  - position: ", Vector(100 + 4 * i, 50'000), "\n    wait: ", Value(103 + 4 * i, 5000),
          "\n");
    }
    Put(out_, "  clips:\n");
    for (uint64_t i = 0; i < 4; ++i) Put(out_, "  - ", Asset(8'300'000 + 2 * i, 20 + i, 3), "\n");
    Put(out_, "  responseCurve:\n    m_Curve:\n");
    for (uint64_t i = 0; i < 5; ++i) {
      Put(out_, "    - time: ", Decimal(250 * i),
          "\n      value: ", Value(40 + 3 * i, 1000, edit_ == 4 && i == 2));
      Put(out_, "\n      inSlope: ", Value(41 + 3 * i, 2000), "\n      outSlope: ", Value(42 + 3 * i, 2000),
          "\n");
    }
    Put(out_, "    m_PreInfinity: 2\n    m_PostInfinity: 2\n  tint:\n    m_ColorKeys:\n");
    for (uint64_t i = 0; i < 4; ++i) {
      Put(out_, "    - color: ", Color(60 + 3 * i), "\n      time: ", Decimal(300 * i), "\n");
    }
  }

  void PrefabInstance(uint64_t parent) {
    Begin(1001, "PrefabInstance");
    Put(out_, "  m_Modification:\n    m_TransformParent: ", Reference(parent), "\n    m_Modifications:\n");
    static constexpr std::array<std::string_view, 5> kFields = {"m_LocalPosition.x", "m_LocalPosition.y",
                                                                "m_LocalPosition.z", "speed", "volume"};
    const size_t modifications = kFields.size() - (edit_ >= 3 ? 0 : 1);
    for (size_t i = 0; i < modifications; ++i) {
      Put(out_, "    - target: ", Asset(400'000 + 2 * i, 1, 2), "\n      propertyPath: ", kFields[i]);
      const bool is_edited = i == 1 && (edit_ == 1 || edit_ == 2);
      Put(out_, "\n      value: ", Value(10 + i, 9000, is_edited), "\n      objectReference: {fileID: 0}\n");
    }
    Put(out_, "    m_RemovedComponents: []\n  m_Prefab: ", Asset(100'100'000, 1, 2), "\n");
  }

  void StrippedTransform(uint64_t prefab_instance) {
    Put(out_, "--- !v!4 &", ScenePlan::FileID(slot_), " stripped\nTransform:\n");
    Put(out_, "  m_PrefabInternal: ", Reference(prefab_instance), "\n");
    Put(out_, "  m_PrefabInstance: ", Reference(prefab_instance), "\n");
  }

  void StateMachine() {
    Begin(1107, "AnimatorStateMachine");
    Put(out_, "  m_Name: Layer ", std::to_string(Pick(1, 10)), edit_ == 1 || edit_ == 2 ? " renamed" : "",
        "\n");
    Put(out_, "  m_ChildStates: []\n  m_StateMachineTransitions:\n");
    const uint64_t transitions = edit_ >= 3 ? 4 : 3;
    for (uint64_t i = 0; i < transitions; ++i) {
      const std::string state = std::to_string(110'200'000 + i);
      Put(out_, "    data:\n      first: {fileID: ", state, "}\n      second:\n");
      Put(out_, "      - {fileID: ", std::to_string(110'100'000 + Pick(2 + i, 100'000)), "}\n");
    }
    Put(out_, "  m_DefaultState: ", kNoReference, "\n");
  }

 private:
  void Begin(int class_id, std::string_view class_name) {
    Put(out_, "--- !v!", std::to_string(class_id), " &", ScenePlan::FileID(slot_), "\n", class_name, ":\n");
    Put(out_, "  m_PrefabInternal: ", kNoReference, "\n");
  }

  void BeginComponent(int class_id, std::string_view class_name, uint64_t game_object) {
    Begin(class_id, class_name);
    Put(out_, "  m_GameObject: ", Reference(game_object), "\n  m_Enabled: 1\n");
  }

  uint64_t Pick(uint64_t field, uint64_t count) const { return plan_.Random(slot_, field) % count; }

  // Added, not drawn anew: an edit must never come out as the value that was there.
  std::string Value(uint64_t field, uint64_t range, bool is_edited = false) const {
    return Decimal(Pick(field, range) + (is_edited ? 250 : 0));
  }

  std::string Vector(uint64_t field, uint64_t range, bool is_edited = false) const {
    return "{x: " + Value(field, range, is_edited) + ", y: " + Value(field + 1, range) +
           ", z: " + Value(field + 2, range, is_edited) + "}";
  }

  std::string Color(uint64_t field, bool is_edited = false) const {
    return "{r: " + Value(field, 750, is_edited) + ", g: " + Value(field + 1, 1000) +
           ", b: " + Value(field + 2, 1000) + ", a: 1}";
  }

  // The assets of a project are few, and many objects share them.
  std::string Asset(uint64_t file_id, uint64_t field, int type) const {
    static constexpr std::string_view kHexDigits = "0123456789abcdef";
    const uint64_t asset = Pick(field, 200);
    std::string guid;
    for (uint64_t bits : {plan_.Random(asset, 2'000'000), plan_.Random(asset, 2'000'001)}) {
      for (int i = 0; i < 16; ++i, bits >>= 4) guid.push_back(kHexDigits[bits & 15]);
    }
    return "{fileID: " + std::to_string(file_id) + ", guid: " + guid + ", type: " + std::to_string(type) +
           "}";
  }

  const ScenePlan& plan_;
  uint64_t slot_;
  Version version_;
  int edit_;
  std::string& out_;
};

void AppendAddedGroup(const ScenePlan& plan, uint64_t group, Version version, std::string_view father,
                      std::string& out) {
  const auto slot = [&](uint64_t document) { return ScenePlan::AddedSlot(version, group, document); };
  const auto document = [&](uint64_t i) { return Document(plan, slot(i), version, out); };
  document(0).GameObject({slot(1), slot(2), slot(3)});
  document(1).Transform(slot(0), father, {});
  document(2).MeshFilter(slot(0));
  document(3).MeshRenderer(slot(0));
}

}  // namespace

void SceneDocuments::AppendGroup(uint64_t group, Version version, std::string& out) const {
  if (plan_.IsRemoved(group, version)) return;
  const auto slot = [&](uint64_t document) { return ScenePlan::Slot(group, document); };
  const auto document = [&](uint64_t i) { return Document(plan_, slot(i), version, out); };
  const bool holds_prefab = ScenePlan::HoldsPrefab(group);
  const bool holds_state_machine = ScenePlan::HoldsStateMachine(group);

  std::vector<uint64_t> components = {slot(1), slot(2), slot(3)};
  if (!holds_prefab && !holds_state_machine) components.push_back(slot(4));
  if (!holds_prefab) components.push_back(slot(5));

  std::vector<uint64_t> children;
  for (const uint64_t child : plan_.ChildrenOf(group)) {
    if (!plan_.IsRemoved(child, version)) children.push_back(ScenePlan::Slot(child, 1));
  }
  if (holds_prefab) children.push_back(slot(5));
  if (plan_.AddsChild(group, version)) children.push_back(ScenePlan::AddedSlot(version, group, 1));
  if (group == 0) {
    for (uint64_t i = 0; i < plan_.TailCount(version); ++i) {
      children.push_back(ScenePlan::AddedSlot(version, plan_.group_count() + i, 1));
    }
  }

  const auto parent = plan_.ParentOf(group);
  const std::string father = parent ? Reference(ScenePlan::Slot(*parent, 1)) : std::string(kNoReference);
  document(0).GameObject(components);
  document(1).Transform(slot(0), father, children);
  document(2).MeshFilter(slot(0));
  document(3).MeshRenderer(slot(0));
  if (holds_prefab) {
    document(4).PrefabInstance(slot(1));
    document(5).StrippedTransform(slot(4));
  } else {
    if (holds_state_machine) {
      document(4).StateMachine();
    } else if (group % 3 == 0) {
      document(4).Light(slot(0));
    } else {
      document(4).Collider(slot(0));
    }
    document(5).Script(Reference(slot(0)), father);
  }
  if (plan_.AddsChild(group, version)) AppendAddedGroup(plan_, group, version, Reference(slot(1)), out);
}

void SceneDocuments::AppendTail(Version version, std::string& out) const {
  const uint64_t groups = plan_.group_count();
  for (uint64_t i = 0; i < plan_.loose_count(); ++i) {
    Document(plan_, ScenePlan::Slot(groups, i), version, out).Script(kNoReference, kNoReference);
  }
  const std::string father = groups > 0 ? Reference(ScenePlan::Slot(0, 1)) : std::string(kNoReference);
  for (uint64_t i = 0; i < plan_.TailCount(version); ++i) {
    AppendAddedGroup(plan_, groups + i, version, father, out);
  }
}
