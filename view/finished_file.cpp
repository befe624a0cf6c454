#include "view/finished_file.h"

#include <filesystem>
#include <optional>
#include <sstream>
#include <system_error>

#include "fixups/post_process.h"
#include "merge/conflict_record_file.h"
#include "platform/ending_signals.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "report/record_patterns.h"
#include "scene/safe_merge.h"
#include "yaml/write_objects.h"

namespace vexel_yaml {

FinishedFile FinishFile(const SceneDocuments& read, bool safe,
                        std::vector<RecordingConflictResolver::RecordResolve> resolutions) {
  TimerStat silent("", nullptr);
  RecordingConflictResolver resolver(MergeResolve::kBase);
  resolver.SetResolveMethodForPaths(std::move(resolutions));
  std::unique_ptr<SceneDocuments> settled;
  std::unique_ptr<VexelObjects> merged;
  if (safe) {
    settled = read.Copy();
    merged = SafeMerge(*settled, resolver, {}, silent).merged;
  } else {
    const DiffPair diffs = CreateDiffPair({read.base, read.left}, {read.base, read.right}, true, silent);
    merged = MergeIntoCopy(read.base, diffs, resolver, silent);
    PostProcess(*merged, read.left, read.right, resolver);
  }
  std::ostringstream text;
  WriteObjects(*merged, text, true);
  std::ostringstream record;
  OutputConflictRecords(record, resolver, false);
  FinishedFile finished = {std::move(text).str(), std::move(record).str(), {}};
  const RecordPatterns patterns(resolver);
  for (const RecordingConflictResolver::Record& made : resolver.GetRecords()) {
    if (made.resolution == MergeResolve::kConflict) finished.pending.push_back(patterns.For(made));
  }
  return finished;
}

void CheckDestination(const std::string& path) {
  const std::string native = VexelToNativePath(path);
  std::error_code error;
  // It would wait for its reader.
  if (!std::filesystem::is_fifo(native, error)) FileReplacement{native};
}

void StoreResult(const std::string& path, const std::string& text, const std::string& record_path,
                 const std::string& record) {
  // Neither before both are on the disk, and the result last: whoever sees it may stage it.
  std::optional<FileReplacement> record_file;
  if (!record_path.empty()) {
    record_file.emplace(VexelToNativePath(record_path));
    record_file->Stream() << record;
    record_file->Finish();
  }
  FileReplacement result(VexelToNativePath(path));
  result.Stream() << text;
  result.Finish();
  // What is written in place may still find no room.
  const bool is_in_place = result.IsInPlace();
  if (is_in_place) result.Commit();
  const SignalsHeld held;
  if (record_file) record_file->Commit();
  if (!is_in_place) result.Commit();
}

}  // namespace vexel_yaml
