#include "fixups/three_way_merge.h"

#include "fixups/duplicate_keys.h"
#include "yaml/read_files.h"

namespace vexel_yaml {

void ReadMergeDocuments(const std::string& base_path, const std::string& left_path,
                        const std::string& right_path, MergeDocuments& documents, bool threads,
                        TimerStat& timer) {
  const std::vector<FileToRead> files = {{"Read base", base_path, documents.base},
                                         {"Read left", left_path, documents.left},
                                         {"Read right", right_path, documents.right}};
  ReadFiles(files, threads, timer);
  for (const FileToRead& file : files) RefuseDuplicateKeys(file.objects, file.path);
}

std::vector<RenumberedObject> PrepareForDiff(VexelObjects& base, VexelObjects& left, VexelObjects& right,
                                             SameObject same) {
  const FileIDSet in_base = PreProcess(base);
  const FileIDSet in_left = PreProcess(left);
  const FileIDSet in_right = PreProcess(right);
  ConflictingFileIDs ids = CreateConflictingFileIDsRemapper(in_base, in_left, in_right);
  return RemapCollidingAddFileIDs(ids, left, right, same);
}

std::unique_ptr<VexelObjects> MergeIntoCopy(const VexelObjects& base, const DiffPair& diffs,
                                            ConflictResolver& resolver, TimerStat& timer) {
  const YAMLMappingDiff* diff = nullptr;
  {
    TimerStat step(timer, "Merging");
    diff = YAMLMappingDiff::Merge(*diffs.left, *diffs.right, resolver);
  }
  std::unique_ptr<VexelObjects> merged;
  {
    TimerStat step(timer, "Cloning base roots");
    merged.reset(base.Clone());
  }
  TimerStat step(timer, "Applying merged changes");
  diff->Apply(*merged);
  return merged;
}

}  // namespace vexel_yaml
