#pragma once

#include <functional>
#include <string>
#include <unordered_map>

#include "diff/yaml_mapping_diff.h"
#include "diff/yaml_sequence_diff.h"
#include "report/report_model.h"
#include "report/value_text.h"

namespace vexel_yaml {

/// Takes one diff apart into what a person sees as single changes: a field, a list, a vector as a whole.
class SideWalk {
 public:
  /// Gets a place, in the base's numbering, what was done there, and the node that stood there before, which
  /// may be null.
  using Found = std::function<void(const FieldPath& path, ReportCell cell, const YAMLNode* from)>;
  /// Gets the place of an element that went out of a list; the list itself is found as well.
  using Gone = std::function<void(const FieldPath& path)>;
  /// Operations whose records have another path than the place that shows them.
  using Places = std::unordered_map<const Operation*, FieldPath>;

  SideWalk(CellNames names, Found found, Gone gone, Places* places)
      : names_(names), found_(std::move(found)), gone_(std::move(gone)), places_(places) {}

  /// Walks over the changes that make `to` of `from`, both whole files.
  void Walk(const YAMLMappingDiff& diff, const YAMLMapping& from, const YAMLMapping& to);
  /// The same for one list, whose place is the empty path.
  void WalkList(const ChangeSequenceOperation& operation, const YAMLSequence& from, const YAMLSequence& to);

 private:
  void WalkAt(const YAMLScalar* key, const Operation& operation, const YAMLNode* from, const YAMLNode* to);
  void WalkOperation(const Operation& operation, const YAMLNode* from, const YAMLNode* to);
  void MarkGone(size_t index);
  void RememberInner(const Operation& operation);

  const CellNames names_;
  Found found_;
  Gone gone_;
  Places* places_;
  FieldPath path_;
  bool in_list_ = false;
};

/// Makes a cell show its value by names. Long texts, and lists of what takes more than a line, stay as they
/// are.
void ShowNamed(ReportCell& cell, ObjectNames& names, NamedWith with);

/// What `node` is at `path`: a whole object counts its fields.
ReportCell ValueCell(const FieldPath& path, const YAMLNode* node, ReportCell::Kind kind, CellNames names);

}  // namespace vexel_yaml
