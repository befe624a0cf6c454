#pragma once

#include <memory>
#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"
#include "scene/scene_documents.h"
#include "scene/settle_scene.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

/// What a report was asked for.
struct ReportConfig {
  std::string base_path;
  std::string left_path;   ///< Theirs.
  std::string right_path;  ///< Mine.
  std::string merge_file;  ///< Where resolutions are read from; empty for none.
  /// What became of such a merge in the end, to be shown beside its result; empty for none.
  std::string committed_path;
  std::string rules_file = "auto";
  std::string type_info_file;
  bool safe = false;  ///< Whether scenes are merged as scenes.
};

/// A merge with everything it went through, ready to be looked at. What was converted for the diff is not
/// converted back.
struct MergedFiles {
  SceneDocuments read;
  DiffPair diffs;
  /// What was read, for a safe merge: it takes an object for edited that was unfolded in one version alone,
  /// as a look at `read` does.
  SceneDocuments untouched;
  bool safe = false;
  /// What became of the versions where they were merged as scenes, else null: records may refer to it.
  std::unique_ptr<SceneDocuments> settled;
  RecordingConflictResolver resolver{MergeResolve::kBase};
  /// Before and after the repairs; null where the merge failed.
  std::unique_ptr<VexelObjects> unrepaired;
  std::unique_ptr<VexelObjects> merged;
  /// What became of it in the end, as left of a base of its own; null unless asked for.
  std::unique_ptr<SceneDocuments> committed;
  /// Why the merge failed after both sides had been compared with base; empty where it didn't.
  std::string error;
  std::vector<SceneNote> notes;
};

/// Merges the three files as the merge command does, conflicts to base. Throws what reading and diffing
/// throw, and YAMLError where the resolutions can't be read.
void MergeForReport(const ReportConfig& config, MergedFiles& files);

/// The parts of it, for whoever merges the same files again and again; rules and types are loaded. First,
/// what the files hold; once it is `untouched`, it is compared.
void ReadVersions(const ReportConfig& config, SceneDocuments& documents);
void CompareVersions(MergedFiles& files, bool threads);
/// Reads the resolutions of the record file at `path`. Throws YAMLError.
std::vector<RecordingConflictResolver::RecordResolve> ReadResolutions(const std::string& path);
/// Forgets what an earlier merge left in `files`. That the merge fails is said there.
void MergeRead(MergedFiles& files, std::vector<RecordingConflictResolver::RecordResolve> resolutions);

/// What went wrong and, in brackets behind it, where: a report is for people.
std::string Explained(const YAMLError& error);
std::string Explained(const std::exception& error);

}  // namespace vexel_yaml
