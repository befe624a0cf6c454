#pragma once

#include <exception>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "git/settings.h"
#include "merge/recording_conflict_resolver.h"
#include "report/conflict_names.h"
#include "scene/scene_documents.h"

namespace vexel_yaml {

/// The three versions of one file that git merges.
struct AssetVersions {
  std::string asset;  ///< Its path from the top folder.
  std::string base;   ///< Paths of files.
  std::string left;
  std::string right;
  /// What is undecided in a base that git has made, and what marks its values; see undecided_places.h.
  std::vector<std::string> undecided = {};
  std::string mark = {};

  bool HasAsset() const;
};

/// What the user has decided, as a record file says it, and where that was read.
struct Decisions {
  std::string text;
  std::string record;
};

/// Merges the versions of an asset as `VexelYAMLMerge merge --force --safe` does, or without `--safe` where
/// the settings say so, in this process, with conflicts to base. The documents live as long as the object.
class AssetMerge {
 public:
  explicit AssetMerge(AssetVersions versions) : versions_(std::move(versions)) {}

  static constexpr int kMerged = 0;
  static constexpr int kFailed = 1;
  static constexpr int kConflicts = 2;
  static constexpr int kBrokenDependencies = 3;

  /// Reads the versions for a safe merge, which takes no settings: a part of `Run` for which there may be
  /// time before that. What goes wrong is kept for `Run`.
  void Read() { Read(true); }

  /// Returns one of these. What went wrong has been said, with the asset's own name for those of the
  /// versions. To be called once. All merges of a process have the same settings.
  int Run(const MergeSettings& settings, const Decisions* decisions = nullptr);

  /// The same without a word, which `SayMessages` has then.
  int RunQuietly(const MergeSettings& settings, const Decisions* decisions = nullptr);
  void SayMessages() const;

  /// Lets `GetEdits` tell which objects each side has edited. To be called before the merge.
  void ListEdits() { lists_edits_ = true; }
  struct Edits {
    std::vector<std::string> theirs;
    std::vector<std::string> ours;
  };
  const Edits& GetEdits() const { return edits_; }

  /// The merged asset.
  const std::string& GetText() const { return text_; }
  bool HasConflicts() const { return resolver_.HasPendingConflicts(); }
  const std::vector<RecordingConflictResolver::Record>& GetRecords() const { return resolver_.GetRecords(); }
  /// What is pending. It takes time to name it, which only the first call does.
  const std::vector<NamedConflict>& GetConflicts();
  /// What has been chosen, as a word of a record file, by the conflict's place.
  std::map<std::string, std::string> GetChoices() const;
  /// The places where base's value was chosen, and base has none: left's stands there.
  std::set<std::string> FindBaseless() const;
  /// Forgets what was chosen for places that are neither in this merge nor among `known`. Returns a line for
  /// people about each.
  std::vector<std::string> DropUnknownChoices(const std::set<std::string>& known);
  /// The record file's text, which goes by the last line for a place.
  std::string GetRecord() const;

 private:
  void Read(bool is_safe);
  int Merge(const MergeSettings& settings, const Decisions* decisions);
  void TakeDecisions(const Decisions& decisions);
  /// Both return whether a broken component dependency is pending.
  bool MergeScenes();
  bool MergeValues();
  void NameUndecided(NamedConflict& conflict) const;

  const AssetVersions versions_;
  /// Whether what has been read is for a safe merge; nothing before that.
  std::optional<bool> is_read_safe_;
  bool threads_ = false;
  std::exception_ptr read_failure_;
  // What was written to standard error.
  std::string messages_;
  std::unique_ptr<SceneDocuments> documents_;
  DiffPair diffs_;
  std::unique_ptr<VexelObjects> merged_;
  RecordingConflictResolver resolver_{MergeResolve::kBase};
  std::string text_;
  std::optional<std::vector<NamedConflict>> conflicts_;
  bool lists_edits_ = false;
  Edits edits_;
};

/// Loads the rules and the type information, once: both stay loaded, and all merges of a process have the
/// same. Throws what was wrong with them, each time.
void LoadRulesAndTypes(const MergeSettings& settings);

/// Says what a program or a merge has said about the versions, with the asset's own name.
void SayMessages(std::string messages, const AssetVersions& versions);

/// Such as "1 conflict".
std::string CountOfConflicts(size_t number);

}  // namespace vexel_yaml
