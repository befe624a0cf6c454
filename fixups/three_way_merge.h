#pragma once

#include <memory>
#include <string>
#include <vector>

#include "diff/diff_pair.h"
#include "fixups/file_id_collisions.h"
#include "merge/conflict_resolver.h"
#include "platform/timer_stat.h"
#include "yaml/vexel_objects.h"

namespace vexel_yaml {

/// The three versions of one asset.
struct MergeDocuments {
  VexelObjects base;
  VexelObjects left;
  VexelObjects right;
};

/// Reads the three files, on threads of their own if `threads`, and refuses repeated keys, which a merge
/// would lose. Throws what ReadFiles and RefuseDuplicateKeys throw.
void ReadMergeDocuments(const std::string& base_path, const std::string& left_path,
                        const std::string& right_path, MergeDocuments& documents, bool threads,
                        TimerStat& timer);

/// Makes three versions comparable: lists that stand as mappings with repeated keys become lists, and objects
/// that both sides added under one file ID, and that aren't the same, get different ones; those renumbered on
/// the right are returned. Throws what PreProcess and RemapCollidingAddFileIDs throw.
std::vector<RenumberedObject> PrepareForDiff(VexelObjects& base, VexelObjects& left, VexelObjects& right,
                                             SameObject same = SameObject::kSameClass);

/// Merges both diffs into a copy of base, which still needs the post-processing. Throws what merging and
/// applying throw.
std::unique_ptr<VexelObjects> MergeIntoCopy(const VexelObjects& base, const DiffPair& diffs,
                                            ConflictResolver& resolver, TimerStat& timer);

}  // namespace vexel_yaml
