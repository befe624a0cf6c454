#pragma once

#include <map>
#include <string>
#include <vector>

#include "git/record_entry.h"
#include "git/repository.h"

namespace vexel_yaml {

/// What has been chosen in conflicts, for the next time that the same one comes: in a later commit of a
/// rebase, or when a merge is made again. The same means the same file, place, base and edits of both sides.
///
/// A small file each, in the folder that all work trees share, as git keeps its own memory. What was neither
/// made nor used for 60 days is forgotten, which is git's own measure.
class DecisionMemory {
 public:
  explicit DecisionMemory(const Repository& repository);

  /// What was chosen in those of the conflicts that are pending, as lines of a record file.
  std::vector<std::string> Recall(const std::vector<RecordedConflict>& conflicts) const;

  /// Keeps what has been chosen, by places, in these conflicts.
  void Remember(const std::vector<RecordedConflict>& conflicts,
                const std::map<std::string, std::string>& choices) const;

 private:
  void ForgetOld() const;

  std::string folder_;
};

}  // namespace vexel_yaml
