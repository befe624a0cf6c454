#pragma once

#include <exception>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "fixups/three_way_merge.h"
#include "git/settings.h"
#include "merge/recording_conflict_resolver.h"
#include "report/conflict_list.h"

namespace vexel_yaml {

/// The three versions of one file that git merges.
struct AssetVersions {
  std::string asset;  ///< Its path from the top folder.
  std::string base;   ///< Paths of files.
  std::string left;
  std::string right;

  bool HasAsset() const;
};

/// What the user has decided, as a record file says it, and where that was read.
struct Decisions {
  std::string text;
  std::string record;
};

/// Merges the versions of an asset as `VexelYAMLMerge merge --force` does, in this process, with conflicts to
/// base. The documents live as long as the object.
class AssetMerge {
 public:
  explicit AssetMerge(AssetVersions versions) : versions_(std::move(versions)) {}

  static constexpr int kMerged = 0;
  static constexpr int kFailed = 1;
  static constexpr int kConflicts = 2;
  static constexpr int kBrokenDependencies = 3;

  /// Reads the versions, which takes no settings: a part of `Run` for which there may be time before that.
  /// What goes wrong is kept for `Run`.
  void Read();

  /// Returns one of these. What went wrong has been said, with the asset's own name for those of the
  /// versions. To be called once. All merges of a process have the same settings.
  int Run(const MergeSettings& settings, const Decisions* decisions = nullptr);

  /// The merged asset.
  const std::string& GetText() const { return text_; }
  /// What is pending.
  const std::vector<ListedConflict>& GetConflicts() const { return conflicts_; }
  /// The record file's text.
  std::string GetRecord() const;

 private:
  int Merge(const MergeSettings& settings, const Decisions* decisions);

  const AssetVersions versions_;
  bool is_read_ = false;
  bool threads_ = false;
  std::exception_ptr read_failure_;
  // What was written to standard error.
  std::string messages_;
  MergeDocuments documents_;
  DiffPair diffs_;
  std::unique_ptr<VexelObjects> merged_;
  RecordingConflictResolver resolver_{MergeResolve::kBase};
  std::string text_;
  std::vector<ListedConflict> conflicts_;
};

/// Says what a program or a merge has said about the versions, with the asset's own name.
void SayMessages(std::string messages, const AssetVersions& versions);

/// Says each conflict of the asset in a line.
void SayConflicts(const std::string& asset, const std::vector<ListedConflict>& conflicts);

/// Such as "1 conflict".
std::string Count(const std::vector<ListedConflict>& conflicts);

}  // namespace vexel_yaml
