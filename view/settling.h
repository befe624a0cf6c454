#pragma once

#include <functional>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "report/conflict_names.h"
#include "report/report_cards.h"
#include "view/choices.h"

namespace vexel_yaml {

/// One file that is shown: three versions to be merged, or two to be compared.
struct ViewFile {
  /// How people know the file.
  std::string title;
  /// Base and left alone where two versions are compared: before and after.
  std::string base_path;
  std::string left_path;
  std::string right_path;
  bool is_review = false;
  /// Whether scenes are merged as scenes.
  bool safe = true;
  /// What holds where nothing is chosen on the page.
  std::vector<RecordingConflictResolver::RecordResolve> resolutions = {};
  /// Who is behind the versions, such as "Ann, feature/lights"; may be empty.
  std::string base_name = {};
  std::string theirs_name = {};
  std::string ours_name = {};
  /// Finds the classes of scripts; may be empty.
  ScriptSearch script_search = {};
  /// Keeps a finished file and the text of its record; throws a std::exception or YAMLError that says why it
  /// could not, and then nothing has changed.
  std::function<void(const std::string& text, const std::string& record)> store = {};
};

/// The settling of one file: read once, merged anew with every choice. For one thread at a time.
class Settling {
 public:
  /// Reads and merges. The rules and the type information are loaded. Throws what ReadForReport throws.
  explicit Settling(const ViewFile& file);

  /// Where a choice is none of those that can be made, nothing changes and false is returned.
  bool Choose(const std::vector<Choices::Change>& changes);
  void Undo();
  void Redo();
  const Choices& GetChoices() const { return choices_; }

  /// Goes up with every merge.
  size_t GetRevision() const { return revision_; }
  size_t CountPending() const { return pending_; }
  /// The conflicts that there are, settled ones included.
  size_t CountConflicts() const { return places_.size(); }
  /// Why there is no result; empty where there is one.
  const std::string& GetError() const { return files_.error; }
  const std::vector<std::string>& GetNotes() const { return files_.notes; }
  std::vector<ReportCard> TakeCards() { return std::move(cards_); }
  ObjectNames& GetNames() { return *names_; }

  /// Keeps the result with `ViewFile::store`. Throws std::runtime_error with a text for people where
  /// something is pending, or where it can't be kept.
  void Save();

 private:
  void TakeOverResolutions();
  std::vector<RecordingConflictResolver::RecordResolve> AllResolutions() const;
  void Merge();
  void FindScripts(const std::vector<ReportObject>& objects);
  void CountConflicts(const std::vector<ReportObject>& objects);

  const ViewFile file_;
  /// As it was read, and for everybody who looks at it.
  SceneDocuments whole_;
  SceneDocuments shown_;
  /// Of all that was read, or of what a merge looks at.
  MergedFiles files_;
  /// What was chosen before the page, as far as it can't be taken back there.
  std::vector<RecordingConflictResolver::RecordResolve> resolutions_ = file_.resolutions;
  Choices choices_;
  ScriptClasses scripts_;
  std::set<std::string> looked_for_;
  std::optional<ObjectNames> names_;
  std::vector<ReportCard> cards_;
  /// What can be chosen about.
  std::set<std::string> places_;
  size_t revision_ = 0;
  size_t pending_ = 0;
};

}  // namespace vexel_yaml
