#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "git/record_entry.h"
#include "git/settings.h"

namespace vexel_yaml {

/// Base's text and theirs; empty for one that isn't known.
struct SideTexts {
  std::string base;
  std::string theirs;
};

/// Marks those conflicts as settled at whose places `later` has something else than `merged`, which is how
/// the merge left the file: somebody has been there. Line ends, styles and the order of fields are no change,
/// and whatever else was edited doesn't count. A conflict about an object is compared with all that hangs on
/// it.
///
/// `sides` is asked where a conflict stands in a list, since its path has the index of an element in base or
/// in theirs; without them the whole list is compared. Where a text can't be read, nothing is marked.
void MarkSettledByHand(const std::string& merged, const std::string& later, const MergeSettings& settings,
                       const std::function<SideTexts()>& sides, std::vector<RecordedConflict>& conflicts);

/// The places of those that it would mark, each with what stands there in `later`, in short and on one line.
std::map<std::string, std::string> FindSettledByHand(const std::string& merged, const std::string& later,
                                                     const MergeSettings& settings,
                                                     const std::function<SideTexts()>& sides,
                                                     const std::vector<RecordedConflict>& conflicts);

}  // namespace vexel_yaml
