#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "report/merged_files.h"
#include "report/object_names.h"

namespace vexel_yaml {

class VersionNames;

/// What stands at one place in one version, or what was done there.
struct ReportCell {
  /// kEdited: only parts of it changed, and the text says which.
  enum class Kind { kUnchanged, kChanged, kEdited, kAdded, kRemoved };

  Kind kind = Kind::kUnchanged;
  /// A short text, which may have several lines.
  std::string text;
  /// The whole text where `text` is only the start of it, else empty.
  std::string full;
  /// What people see of it, where that is another text: with names in place of file IDs, and lists whole, on
  /// a line an element. Two values can be the same in it.
  std::string shown = {};
  const std::string& ForPeople() const { return shown.empty() ? text : shown; }

  /// Of a list whose elements came, went or moved: those of base that are still there, in their order now.
  std::vector<uint32_t> order = {};
  /// Whether other rows show changes of parts of it.
  bool parts_changed = false;
  /// The value itself, of which `text` is for people; null where there is none. Of the documents' life.
  const YAMLNode* node = nullptr;

  /// Whatever things are called in the other version.
  bool HasSameValue(const ReportCell& other) const {
    return kind == other.kind && text == other.text && full == other.full;
  }
  bool operator==(const ReportCell& other) const { return HasSameValue(other) && shown == other.shown; }
};

/// One place in an object.
struct ReportRow {
  /// From the file ID on; elements of lists go by their index in base, new ones by a "+" and the index in
  /// their record. The file ID alone is the whole object.
  FieldPath path;
  ReportCell base;
  ReportCell left;
  ReportCell right;
  ReportCell result;
  /// What was committed in the end, where that is known.
  ReportCell committed;
  /// What became of it, in a word or two; empty where the merge failed.
  std::string_view state;
  /// Whether the conflict still waits for somebody, and with which pattern it is settled.
  bool pending = false;
  std::string record_path;
  bool repaired = false;
  std::string note;
  /// What an override of a prefab instance is about, such as "m_Color.r"; empty for other places.
  std::string overridden = {};

  bool operator==(const ReportRow& other) const = default;
};

/// An object that somebody changed, or that the merge is in trouble with.
struct ReportObject {
  const YAMLScalar* file_id;
  std::string class_name;
  std::string path;
  bool left = false;
  bool right = false;
  bool added = false;
  bool changed = false;
  bool removed = false;
  bool pending = false;
  bool repaired = false;
  std::vector<ReportRow> rows;

  bool operator==(const ReportObject& other) const = default;
};

/// What the two sides are called in notes.
struct SideWords {
  std::string left = "Left";
  std::string right = "Right";
};

/// Everything a merge did, object by object: those with conflicts first, then by their names. `names` must
/// know the objects of the versions and of the result.
std::vector<ReportObject> CollectReport(const MergedFiles& files, VersionNames& names,
                                        const SideWords& sides);
/// What knows the objects of the versions and of the result.
VersionNames NamesOf(const MergedFiles& files);

/// How the line of a list's edits begins that shows its new order.
inline constexpr std::string_view kNewOrder = "new order: ";
/// The text of a place of which only parts changed, which have rows of their own.
inline constexpr std::string_view kChangedInside = "changed inside";

/// Tells what became of a place that no record settles, from what its cells say, and notes it where an order
/// got lost.
void JudgeRow(ReportRow& row, const SideWords& sides);

/// The text of an element that can't be told from others in a version of its list.
inline constexpr std::string_view kSeeList = "see the list";

/// Whether the rows of its elements tell all that a list's row does. An element that nothing identifies has
/// gone for the list, and another one has come, where it was changed.
bool IsToldByElements(const ReportRow& list, const std::vector<ReportRow>& rows);

/// How the state of a conflict begins that is settled.
inline constexpr std::string_view kSettled = "settled: ";

/// A side, or a state that ends in one, with theirs for left and ours for right.
std::string InWordsOfPeople(std::string_view state);

/// Gives values of a row that only look the same what tells them apart.
void TellApart(ReportRow& row, VersionNames& names);

/// Why a record is about components that need or exclude one another, from its side's point of view; empty
/// for other records.
std::string_view DependencyText(const RecordingConflictResolver::Record& record);

}  // namespace vexel_yaml
