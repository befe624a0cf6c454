#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "report/conflict_names.h"
#include "report/report_cards.h"
#include "report/version_names.h"
#include "view/choices.h"
#include "view/edit_groups.h"
#include "view/finished_file.h"
#include "view/shown_names.h"

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
  /// The places of conflicts that are settled elsewhere, such as by hand in the file, with what stands there:
  /// they are shown, and there is nothing to choose.
  std::map<std::string, std::string> settled_by_hand = {};
  /// Whether the paths tell people nothing, so that the title is named in their place.
  bool has_temporary_paths = false;
  /// How many conflicts are open, as far as that is known before the file is read.
  std::optional<size_t> known_pending = {};
  /// What is to be said about the file beside the merge's own notes; may be empty.
  std::string note = {};
  /// Finds the names of other assets; may be empty.
  AssetSearch asset_search = {};
  /// Keeps a finished file and the text of its record; throws a std::exception or YAMLError that says why it
  /// could not, and then nothing has changed.
  std::function<void(const std::string& text, const std::string& record)> store = {};
  /// Keeps what is settled so far for the next time, from the record's text, as `store` does. Empty where
  /// nothing may be written before all is settled.
  std::function<void(const std::string& record)> keep = {};
};

/// The settling of one file: read once, merged anew with every choice, as far as that choice goes. For one
/// thread at a time.
class Settling {
 public:
  /// What a merge showed.
  struct Shown {
    std::vector<ReportCard> cards;
    /// The objects of which nothing holds any more that was shown before; null for all.
    const EditGroups::Group* group = nullptr;
  };

  /// Reads and merges. The rules and the type information are loaded. Throws what ReadForReport throws.
  explicit Settling(const ViewFile& file);

  /// Where a choice is none of those that can be made, nothing changes and false is returned.
  bool Choose(std::vector<Choices::Change> changes);
  void Undo();
  void Redo();
  const Choices& GetChoices() const { return choices_; }

  /// Goes up with every step.
  size_t GetRevision() const { return revision_; }
  size_t CountPending() const { return pending_; }
  /// The conflicts that there are, settled ones included.
  size_t CountConflicts() const { return places_.size(); }
  /// Why there is no result; empty where there is one.
  const std::string& GetError() const { return files_.error; }
  const std::vector<SceneNote>& GetNotes() const { return files_.notes; }
  /// What was merged since the last call, in that order. The cards' nodes live until the next step.
  std::vector<Shown> TakeShown() { return std::move(shown_); }
  VersionNames& GetNames() { return *names_; }

  /// Keeps the result with `ViewFile::store`. Throws std::runtime_error with a text for people where
  /// something is pending, or where it can't be kept.
  void Save();
  /// Keeps what is settled so far with `ViewFile::keep`, which there must be. Throws as Save does.
  void Keep();

 private:
  // What can be chosen about in one object.
  struct Places {
    size_t pending = 0;
    std::vector<std::string> paths;
  };

  FinishedFile Finish() const;
  void TakeOverResolutions();
  std::vector<RecordingConflictResolver::RecordResolve> AllResolutions() const;
  void Merge(const std::vector<Choices::Change>& changes);
  void MergeAll();
  bool MergeGroups(const std::set<const EditGroups::Group*>& groups);
  bool MergeGroup(const EditGroups::Group& group, std::unordered_set<const YAMLScalar*>& renamed);
  void FindRenamed(const EditGroups::Group& group, const MergedFiles& part,
                   std::unordered_set<const YAMLScalar*>& renamed);
  void TakeOver(const EditGroups::Group& group, const MergedFiles& part);
  void RenewNames();
  std::vector<ReportCard> MakeCardsOf(const MergedFiles& files);
  void ShowSettledByHand(std::vector<ReportObject>& objects) const;
  bool AreOfTheirGroups(const std::vector<ReportCard>& cards, const EditGroups::Group* group);
  bool FindAssets(const std::vector<ReportObject>& objects);
  void AddPlaces(const std::vector<ReportCard>& cards);
  void ForgetPlaces(const YAMLScalar* file_id);

  const ViewFile file_;
  /// As it was read, and for everybody who looks at it.
  SceneDocuments whole_;
  SceneDocuments versions_;
  /// Of all that was read, or of what a merge looks at. Its merged objects and notes are those of the last
  /// merges.
  MergedFiles files_;
  /// What can be merged by itself; nothing where nothing can.
  std::optional<EditGroups> groups_;
  std::map<const EditGroups::Group*, std::unique_ptr<MergedFiles>> parts_;
  std::unordered_map<const YAMLScalar*, const EditGroups::Group*> group_of_card_;
  /// What was chosen before the page, as far as it can't be taken back there.
  std::vector<RecordingConflictResolver::RecordResolve> resolutions_ = file_.resolutions;
  Choices choices_;
  AssetNames assets_;
  std::set<std::string> looked_for_;
  std::optional<VersionNames> names_;
  std::vector<Shown> shown_;
  std::unordered_map<const YAMLScalar*, Places> objects_;
  ShownNames shown_names_;
  /// What can be chosen about, and in how many rows.
  std::map<std::string, size_t> places_;
  size_t revision_ = 1;
  size_t pending_ = 0;
};

}  // namespace vexel_yaml
