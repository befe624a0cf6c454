#pragma once

#include <string>
#include <unordered_set>

#include "merge/recording_conflict_resolver.h"

namespace vexel_yaml {

/// Writes the places of a merge's records as somebody would name them to settle them, each for itself alone.
class RecordPatterns {
 public:
  explicit RecordPatterns(const RecordingConflictResolver& resolver) {
    for (const RecordingConflictResolver::Record& record : resolver.GetRecords()) {
      components_.insert(record.path.begin(), record.path.end());
    }
  }

  std::string For(const RecordingConflictResolver::Record& record) const {
    return PathPattern(record.path, components_);
  }

 private:
  std::unordered_set<const YAMLScalar*> components_;
};

}  // namespace vexel_yaml
