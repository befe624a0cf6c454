#include "tests/lost_edits/hostile_scenes.h"

#include <algorithm>
#include <vector>

namespace vexel_yaml::lost_edits {

namespace {

// One version of a scene. A node is what its seed says; what a version changes is decided by the node's seed
// and the version's, so that two versions that share a seed make the same edits.
class Version {
 public:
  explicit Version(std::vector<uint32_t> edit_seeds) : edit_seeds_(std::move(edit_seeds)) {}

  std::string Scene(uint32_t seed) const {
    constexpr const char* kHeaders[] = {
        "91 &1\nAnimatorController:", "1 &2\nGameObject:", "114 &3\nMonoBehaviour:"};
    std::string text;
    for (uint32_t i = 0; i < std::size(kHeaders); ++i) {
      const uint32_t object = Mix(seed, i);
      if ((object % 4 != 0) != Edits(object, 24))
        text += "--- !v!" + std::string(kHeaders[i]) + Mapping(object, "  ");
    }
    return text;
  }

 private:
  static uint32_t Mix(uint32_t a, uint32_t b) {
    uint32_t mixed = (a ^ (b + 0x9E3779B9U)) * 0x85EBCA6BU;
    mixed = (mixed ^ (mixed >> 15)) * 0xC2B2AE35U;
    return mixed ^ (mixed >> 13);
  }

  // Whether this version edits the node, which happens once in so many nodes; the edit then has a seed of its
  // own.
  bool Edits(uint32_t node, uint32_t one_in, uint32_t* seed = nullptr) const {
    const auto edit =
        std::ranges::find_if(edit_seeds_, [&](uint32_t s) { return Mix(node, s) % one_in == 0; });
    if (edit == edit_seeds_.end()) return false;
    if (seed != nullptr) *seed = Mix(node, *edit + 1);
    return true;
  }

  std::string Mapping(uint32_t seed, const std::string& indent) const {
    constexpr const char* kFields[] = {"a",    "inner", "vector",  "list",        "plain",
                                       "refs", "parts", "m_Curve", "m_Component", "m_Parameters"};
    std::string text;
    for (uint32_t i = 0; i < std::size(kFields); ++i) {
      const uint32_t field = Mix(seed, 100 + i);
      if ((field % 3 == 0) != Edits(field, 40))
        text += indent + kFields[i] + ":" + Value(kFields[i], Mix(field, 1), indent);
    }
    return text.empty() ? " {}\n" : "\n" + text;
  }

  // Few different ones, so that edits meet and elements repeat.
  std::string Scalar(uint32_t seed) const {
    Edits(seed, 12, &seed);
    return std::to_string(1 + seed / 8 % 4);
  }

  std::string Value(const std::string& key, uint32_t seed, const std::string& indent) const {
    Edits(seed, 30, &seed);
    if (key == "a" || indent.size() > 8 || seed % 20 == 0) return " " + Scalar(seed) + "\n";
    if (seed % 20 == 1) return seed % 3 == 0 ? " []\n" : " {}\n";
    if (key == "vector") return " {x: " + Scalar(Mix(seed, 2)) + ", y: " + Scalar(Mix(seed, 3)) + "}\n";
    if (key == "inner") return Mapping(seed, indent + "  ");
    std::string text;
    for (const uint32_t element : Elements(seed)) text += indent + "-" + Element(key, element, indent + "  ");
    return text.empty() ? " []\n" : "\n" + text;
  }

  std::vector<uint32_t> Elements(uint32_t seed) const {
    std::vector<uint32_t> elements(seed % 41 == 2 ? 200 : seed / 4 % 6);
    for (uint32_t i = 0; i < elements.size(); ++i) elements[i] = Mix(seed, i) % 9;
    // Edits in a row, as long as there are any: the first decides about the second, and so on.
    for (uint32_t edit = seed; Edits(edit, 3, &edit);) {
      const uint32_t size = static_cast<uint32_t>(elements.size());
      const auto at = elements.begin() + edit / 8 % (size + 1);
      if (edit % 8 < 3 || at == elements.end()) {
        elements.insert(at, edit / 64 % 12);
      } else if (edit % 8 < 5) {
        elements.erase(at);
      } else {
        std::swap(*at, elements[edit / 64 % size]);
      }
    }
    return elements;
  }

  std::string Element(const std::string& list, uint32_t seed, const std::string& indent) const {
    const std::string id = std::to_string(11 + seed);
    const std::string rest = indent + "b: " + Scalar(seed) + "\n" + indent + "c: " + Scalar(seed + 50) + "\n";
    // Some elements have no key.
    if (list == "refs") return seed == 8 ? " x\n" : " {fileID: " + id + "}\n";
    if (list == "m_Component") return " {component: {fileID: " + id + "}}\n";
    if (list == "m_Parameters") return "\n" + indent + (seed == 8 ? "n: " : "m_Name: ") + id + "\n" + rest;
    return list == "parts" ? "\n" + rest : " " + Scalar(seed) + "\n";
  }

  std::vector<uint32_t> edit_seeds_;
};

}  // namespace

HostileTriple MakeHostileTriple(uint32_t seed) {
  const uint32_t common = seed * 4 + 1;
  return {Version({}).Scene(seed), Version({common, common + 1}).Scene(seed),
          Version({common, common + 2}).Scene(seed)};
}

}  // namespace vexel_yaml::lost_edits
