#pragma once

#include <string>
#include <vector>

#include "report/merged_files.h"

namespace vexel_yaml {

/// What the merge command writes.
struct FinishedFile {
  std::string text;
  std::string record;
  /// The places of the conflicts that nobody has settled.
  std::vector<std::string> pending;
};

/// Merges what has been read as the merge command does with these resolutions. Throws what merging and
/// writing throw.
FinishedFile FinishFile(const SceneDocuments& read, bool safe,
                        std::vector<RecordingConflictResolver::RecordResolve> resolutions);

/// Throws FileError for a path that nothing could be written to, as far as that can be told without writing.
void CheckDestination(const std::string& path);

/// Replaces the file at `path`, and that of the record unless its path is empty; both or, as far as that can
/// be told before, none. Throws FileError.
void StoreResult(const std::string& path, const std::string& text, const std::string& record_path,
                 const std::string& record);

}  // namespace vexel_yaml
