#pragma once

#include <array>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "yaml/yaml_node.h"

namespace vexel_yaml::lost_edits {

/// What a person reads in a file, without its style and without the order of keys.
struct Value {
  enum class Kind { kAbsent, kScalar, kMapping, kList };

  Kind kind = Kind::kAbsent;
  /// A scalar's text, a mapping's first key.
  std::string text;
  std::map<std::string, Value> fields;
  std::vector<Value> items;

  explicit operator bool() const { return kind != Kind::kAbsent; }
  bool operator==(const Value& other) const {
    return kind == other.kind && (kind == Kind::kMapping || text == other.text) && fields == other.fields &&
           items == other.items;
  }
};

/// A mapping with repeated keys becomes a list of mappings of one field.
Value FromNode(const YAMLNode* node);

/// Looks for edits that a merge lost, and for values that nobody wrote, without the merge's own idea of a
/// difference: a walk over the three versions, the merged file and the records, place by place.
///
/// At every place an edit of one side alone must stand in the merged file; so must an edit that both made;
/// and where both edited differently, fields are looked at one by one, and a single value needs a pending
/// record of its own. What the user settled must be the chosen side's.
///
/// What counts as "the element" of a list: what its key fields name (the file ID and guid of a reference, the
/// fields that the rules shipped with the program name for a list of that key), and for elements without key
/// fields their content. Elements of one key are looked at one by one; where a key is repeated, and for
/// elements without one, copies are counted. An index in a path is "#", since a record has that of the merged
/// list.
///
/// Where the required rules let an edit vanish without a pending record, that is an exception with a name,
/// which holds only for the form of place that it names, and is counted each time. Where it leaves a line
/// under "Non-conflicts:", that line is looked for. The order of keys is no edit.
class Checker {
 public:
  /// `records` is the text of a record file, written with the descriptions.
  explicit Checker(const std::string& records);

  /// The root mappings of the four files, objects by file ID. Once a checker.
  void Check(const Value& base, const Value& left, const Value& right, const Value& merged) {
    WalkFields("", {base, left, right, merged});
  }

  /// What was lost or invented, a line each.
  std::vector<std::string> findings;
  /// How often each exception was taken.
  std::map<std::string, size_t> exceptions;

 private:
  /// A value in the four files.
  struct Place {
    const Value& base;
    const Value& left;
    const Value& right;
    const Value& merged;
  };
  /// The elements of one identity, in base, left, right and the merged file.
  using Group = std::array<std::vector<const Value*>, 4>;

  void Walk(const std::string& path, const Place& at);
  void WalkFields(const std::string& path, const Place& at);
  void CheckChoice(const std::string& path, const Place& at, char choice);
  void CheckOneSided(const std::string& path, const Place& at, const Value& expected);
  void CheckReplacement(const std::string& path, const Place& at);
  void CheckList(const std::string& path, const Place& at);
  void CheckGroup(const std::string& path, const Group& group, bool by_equality);
  bool CheckCounts(const Group& group);
  void CheckOrder(const std::string& path, const Place& at, bool by_equality);
  void CheckAddedList(const std::string& path, const Place& at);

  /// Whether a pending record for exactly this place is left; it then serves no other place.
  bool Claim(const std::string& path);
  /// The user's choice for the place: 'B', 'L' or 'R', 0 for none.
  char FindChoice(const std::string& path) const;
  void Report(const std::string& what, const std::string& path) { findings.push_back(what + ": " + path); }
  void Except(const std::string& name) { ++exceptions[name]; }

  std::multiset<std::string> pending_;
  /// "Right removes 5.Light.m_Range" and so on.
  std::set<std::string> described_;
  std::vector<std::pair<std::string, char>> choices_;
};

}  // namespace vexel_yaml::lost_edits
