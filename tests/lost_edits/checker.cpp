#include "tests/lost_edits/checker.h"

#include <fnmatch.h>

#include <algorithm>
#include <sstream>

#include "yaml/yaml_mapping.h"
#include "yaml/yaml_scalar.h"
#include "yaml/yaml_sequence.h"

namespace vexel_yaml::lost_edits {

namespace {

using Kind = Value::Kind;

const Value kAbsent;

const Value& Field(const Value& value, const std::string& key) {
  const auto found = value.fields.find(key);
  return found == value.fields.end() ? kAbsent : found->second;
}

std::string TextOf(const Value& value) { return value.kind == Kind::kScalar ? value.text : ""; }
std::string LastKey(const std::string& path) { return path.substr(path.find_last_of('.') + 1); }

// One line that only equal values share: the length keeps a text apart from what it holds.
std::string Canonical(const Value& value) {
  if (value.kind == Kind::kScalar) return std::to_string(value.text.size()) + "'" + value.text;
  std::string text = value.kind == Kind::kMapping ? "{" : "[";
  for (const auto& [key, field] : value.fields)
    text += std::to_string(key.size()) + "'" + key + Canonical(field);
  for (const Value& item : value.items) text += Canonical(item);
  return text + ".";
}

// The path at the beginning of a line of the records, "#" for each index; the first component is a file ID.
std::string PathIn(const std::string& line) {
  std::istringstream components(line.substr(0, line.find(' ')));
  std::string path;
  std::getline(components, path, '.');
  for (std::string component; std::getline(components, component, '.');) {
    path += component.find_first_not_of("0123456789") == std::string::npos ? ".#" : "." + component;
  }
  return path;
}

// What names an element of the list at a path; empty where nothing does.
std::string IdentityOf(const std::string& path, const Value& element) {
  // Where the reference stands that names an element: in it, in its first field, or in the field of that
  // name.
  static const std::map<std::string, std::string> kReferences = {
      {"GameObject.m_Component", "*"},
      {"PrefabInstance.m_Modification.m_Modifications", "target"},
      {"Prefab.m_Modification.m_Modifications", "target"},
      {"AnimatorStateMachine.m_ChildStates", "m_State"},
      {"AnimatorStateMachine.m_ChildStateMachines", "m_StateMachine"}};
  const std::string list = path.substr(path.find('.') + 1);
  if (list == "AnimatorController.m_Parameters") return TextOf(Field(element, "m_Name"));
  const auto found = kReferences.find(list);
  const Value& reference = found == kReferences.end() ? element
                           : found->second == "*"     ? Field(element, element.text)
                                                      : Field(element, found->second);
  const std::string id = TextOf(Field(reference, "fileID"));
  if (id.empty()) return "";
  return id + ":" + TextOf(Field(reference, "guid")) + ":" + TextOf(Field(element, "propertyPath"));
}

std::string IdentityOrContent(const std::string& path, const Value& element) {
  const std::string identity = IdentityOf(path, element);
  return identity.empty() ? Canonical(element) : identity;
}

bool AreToldApart(const std::string& path, const Value& value) {
  std::set<std::string> seen;
  return std::ranges::all_of(value.items, [&](const Value& item) {
    const std::string identity = IdentityOf(path, item);
    return !identity.empty() && seen.insert(identity).second;
  });
}

// The contents that `to` holds more often than `from`.
std::multiset<std::string> Additions(const Value& from, const Value& to) {
  std::multiset<std::string> added;
  for (const Value& item : to.items) added.insert(Canonical(item));
  for (const Value& item : from.items) {
    if (const auto found = added.find(Canonical(item)); found != added.end()) added.erase(found);
  }
  return added;
}

}  // namespace

Value FromNode(const YAMLNode* node) {
  if (const YAMLScalar* scalar = node->AsScalar())
    return {Kind::kScalar, std::string(scalar->GetText()), {}, {}};
  Value value;
  if (const YAMLMapping* mapping = node->AsMapping()) {
    if (mapping->HasDuplicateKeys()) return FromNode(mapping->ToSequence());
    value.kind = Kind::kMapping;
    if (mapping->Size() > 0) value.text = mapping->FirstKey()->GetText();
    for (const auto& [key, child] : *mapping) value.fields[std::string(key->GetText())] = FromNode(child);
  } else {
    value.kind = Kind::kList;
    for (const YAMLNode* item : node->AsSequence()->GetItems()) value.items.push_back(FromNode(item));
  }
  return value;
}

Checker::Checker(const std::string& records) {
  std::istringstream lines(records);
  std::string section;
  for (std::string line; std::getline(lines, line);) {
    if (line.ends_with(':') && line.find("onflict") != std::string::npos) {
      section = line;
    } else if (section == "Conflicts:") {
      // The line of right's that follows belongs to the same record.
      for (const std::string_view word : {"Left  ", "BreakCycle  "}) {
        if (line.starts_with(word)) pending_.insert(PathIn(line.substr(word.size())));
      }
    } else if (section == "Conflict handling:") {
      std::ranges::replace(line, '.', '/');
      choices_.emplace_back(line.substr(line.find(' ') + 1), line.front());
    } else if (const size_t type = line.find(' ', line.find(' ') + 1); type < line.size()) {
      described_.insert(line.substr(0, type + 1) + PathIn(line.substr(type + 1)));
    }
  }
}

bool Checker::Claim(const std::string& path) {
  const auto record = pending_.find(path);
  return record != pending_.end() && (pending_.erase(record), true);
}

char Checker::FindChoice(const std::string& path) const {
  std::string slashed = path;
  std::ranges::replace(slashed, '.', '/');
  const auto found = std::ranges::find_if(choices_, [&](const auto& choice) {
    return fnmatch(choice.first.c_str(), slashed.c_str(), FNM_PATHNAME | FNM_NOESCAPE) == 0;
  });
  return found == choices_.end() ? '\0' : found->second;
}

void Checker::WalkFields(const std::string& path, const Place& at) {
  std::set<std::string> keys;
  for (const Value* value : {&at.base, &at.left, &at.right, &at.merged}) {
    for (const auto& [key, field] : value->fields) keys.insert(key);
  }
  const std::string above = path.empty() ? "" : path + ".";
  for (const std::string& key : keys) {
    Walk(above + key,
         {Field(at.base, key), Field(at.left, key), Field(at.right, key), Field(at.merged, key)});
  }
}

void Checker::Walk(const std::string& path, const Place& at) {
  const bool is_edited = at.left != at.base || at.right != at.base;
  if (const char choice = FindChoice(path); is_edited && choice != '\0') return CheckChoice(path, at, choice);
  if (at.left == at.base) return CheckOneSided(path, at, at.right);
  if (at.right == at.base || (at.left == at.right && at.merged == at.left))
    return CheckOneSided(path, at, at.left);
  const bool is_somebodys = at.merged == at.base || at.merged == at.left || at.merged == at.right;
  // Two mappings that were added at one place are merged, whatever they are.
  const bool are_fields = !at.base && at.left.kind == Kind::kMapping && at.right.kind == Kind::kMapping;
  if (is_somebodys && !are_fields && Claim(path)) return;
  const auto are_all = [&](Kind kind) {
    return at.left.kind == kind && at.right.kind == kind && at.merged.kind == kind &&
           (!at.base || at.base.kind == kind);
  };
  if (are_all(Kind::kMapping)) return WalkFields(path, at);
  if (are_all(Kind::kList)) return at.base ? CheckList(path, at) : CheckAddedList(path, at);
  CheckReplacement(path, at);
}

void Checker::CheckChoice(const std::string& path, const Place& at, char choice) {
  if (at.merged == (choice == 'B' ? at.base : choice == 'L' ? at.left : at.right)) return;
  if (at.merged == at.base && at.left != at.base && at.right != at.base) {
    return Except("a choice refused what had won without a conflict, and what had lost stays away");
  }
  Report("not what was chosen", path);
}

void Checker::CheckOneSided(const std::string& path, const Place& at, const Value& expected) {
  if (at.merged == expected || (at.merged == at.base && Claim(path))) return;
  if (LastKey(path) == "fileID" && TextOf(at.merged) == "0") {
    return Except("a reference became 0: to an object that is gone, or to break a cycle");
  }
  const bool are_mappings = at.base.kind == Kind::kMapping && expected.kind == at.base.kind;
  if (are_mappings && at.merged.kind == at.base.kind) return WalkFields(path, at);
  Report(at.merged == at.base ? "lost" : "nobody wrote this", path);
}

// Both edited, and not both inside: one of them removed or replaced the whole.
void Checker::CheckReplacement(const std::string& path, const Place& at) {
  const bool holds_more = at.base.kind == Kind::kMapping || at.base.kind == Kind::kList;
  const bool left_inside = holds_more && at.left.kind == at.base.kind;
  const bool right_inside = holds_more && at.right.kind == at.base.kind;
  const auto won = [&](const Value& winner, const std::string& how) {
    return at.base && at.merged == winner && described_.contains(how + " " + path);
  };
  if (at.base && path.back() == '#' && !at.merged && (!at.left || !at.right)) {
    Except("an element that one side removed was edited by the other");
  } else if (!at.right && won(at.right, "Right removes")) {
    Except("right removed what left edited");
  } else if (!at.left && right_inside && at.right.kind == Kind::kList && won(at.left, "Left removes")) {
    Except("left removed a list that right edited");
  } else if (at.right && left_inside && !right_inside && won(at.right, "Right changes")) {
    Except("right replaced what left edited inside");
  } else if (at.left && right_inside && !left_inside && won(at.left, "Left changes")) {
    Except("left replaced what right edited inside");
  } else {
    Report("two edits, no record", path);
  }
}

void Checker::CheckList(const std::string& path, const Place& at) {
  const Value* const files[] = {&at.base, &at.left, &at.right, &at.merged};
  std::map<std::string, Group> groups;
  // Elements of one content have one name: a merge may have put another field first, which would name
  // another.
  std::map<std::string, std::string> names;
  for (size_t i = 0; i < std::size(files); ++i) {
    for (const Value& item : files[i]->items) {
      const auto name = names.try_emplace(Canonical(item), IdentityOrContent(path, item)).first;
      groups[name->second][i].push_back(&item);
    }
  }
  const bool by_equality =
      !std::ranges::all_of(files, [&](const Value* file) { return AreToldApart(path, *file); });
  const size_t before = findings.size();
  for (const auto& [identity, group] : groups) CheckGroup(path + ".#", group, by_equality);
  CheckOrder(path, at, by_equality);
  // Two edits of a list are compared by what they put where; what they removed or moved is not looked at.
  if (findings.size() > before && at.merged == at.left &&
      Additions(at.base, at.left) == Additions(at.base, at.right)) {
    findings.resize(before);
    Except("two edits of a list with the same additions were taken for equal");
  }
}

void Checker::CheckGroup(const std::string& path, const Group& group, bool by_equality) {
  if (CheckCounts(group)) return;
  const auto contents = [&](size_t file) {
    std::multiset<std::string> all;
    for (const Value* element : group[file]) all.insert(Canonical(*element));
    return all;
  };
  if (by_equality && !group[0].empty() && (contents(3) == contents(1) || contents(3) == contents(2))) {
    return Except("elements were edited by both, in a list where keys are missing or repeated");
  }
  if (group[0].empty() && group[1].size() == 1 && group[2].size() > 1 && group[2].size() == group[3].size()) {
    // Of right's additions with one key the first becomes one with left's.
    Group pair = group;
    for (const Value* copy : std::vector(group[2].begin() + 1, group[2].end())) {
      const auto taken =
          std::ranges::find_if(pair[3], [&](const Value* element) { return *element == *copy; });
      if (taken != pair[3].end()) pair[3].erase(taken);
    }
    pair[2].resize(1);
    return CheckGroup(path, pair, by_equality);
  }
  if (std::ranges::any_of(group, [](const auto& elements) { return elements.size() > 1; })) {
    return Report("wrong number of elements", path);
  }
  const auto only = [&](size_t i) -> const Value& { return group[i].empty() ? kAbsent : *group[i].front(); };
  Walk(path, {only(0), only(1), only(2), only(3)});
}

// Counts copies. Which of several equal elements a side removed is not known, and one that both added may be
// there once or twice, so the counts have bounds.
bool Checker::CheckCounts(const Group& group) {
  std::map<std::string, std::array<int, 4>> counts;
  for (size_t i = 0; i < group.size(); ++i) {
    for (const Value* element : group[i]) ++counts[Canonical(*element)][i];
  }
  bool doubled = false;
  for (const auto& [content, count] : counts) {
    const auto [base, left, right, merged] = count;
    const int kept_left = std::min(base, left);
    const int kept_right = std::min(base, right);
    const int least =
        std::max(0, kept_left + kept_right - base) + std::max(left - kept_left, right - kept_right);
    const int most = std::min(kept_left, kept_right) + left - kept_left + right - kept_right;
    if (merged < least || merged > most) return false;
    doubled |= left > base && right > base && merged == most;
  }
  if (doubled) Except("an element that both added is there twice");
  return true;
}

void Checker::CheckOrder(const std::string& path, const Place& at, bool by_equality) {
  const auto name_of = [&](const Value& item) {
    return by_equality ? Canonical(item) : IdentityOrContent(path, item);
  };
  std::map<std::string, int> counts;
  for (const Value* value : {&at.base, &at.left, &at.right, &at.merged}) {
    std::set<std::string> seen;
    for (const Value& item : value->items) counts[name_of(item)] += seen.insert(name_of(item)).second ? 1 : 4;
  }
  const auto order_of = [&](const Value& value) {
    std::vector<std::string> order;
    for (const Value& item : value.items) {
      // Those that are in each file, once.
      if (counts[name_of(item)] == 4) order.push_back(name_of(item));
    }
    return order;
  };
  const auto base = order_of(at.base), left = order_of(at.left), right = order_of(at.right),
             merged = order_of(at.merged);
  if (merged != base && merged != left && merged != right) Report("an order that nobody made", path);
  if ((left != base && merged != left) || (right != base && merged != right)) {
    Except("a move in a list that both edited");
  }
}

// A list that both added is merged index by index; where two values can't be one, both wait in a record, and
// the place closes up unless a default side fills it.
void Checker::CheckAddedList(const std::string& path, const Place& at) {
  const auto item = [](const Value& list, size_t i) -> const Value& {
    return i < list.items.size() ? list.items[i] : kAbsent;
  };
  const size_t count = std::max(at.left.items.size(), at.right.items.size());
  size_t next = 0;
  for (size_t i = 0; i < count; ++i) {
    const Value& left = item(at.left, i);
    const Value& right = item(at.right, i);
    const bool differ =
        left && right && left != right && (left.kind != right.kind || left.kind == Kind::kScalar);
    if (differ && at.merged.items.size() < count && Claim(path + ".#")) continue;
    Walk(path + ".#", {kAbsent, left, right, item(at.merged, next++)});
  }
  if (next < at.merged.items.size()) Report("nobody wrote an element", path);
}

}  // namespace vexel_yaml::lost_edits
