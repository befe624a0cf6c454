#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "merge/recording_conflict_resolver.h"

namespace vexel_yaml {

/// What somebody has chosen so far, by the pattern of the place, and the way back.
class Choices {
 public:
  /// Nothing takes a choice back.
  struct Change {
    std::string path;
    std::optional<MergeResolve> choice;
  };

  /// What was chosen before all steps; of two for one place the first counts.
  void Begin(const std::string& path, MergeResolve choice) { chosen_.emplace(path, choice); }

  /// One step of undoing.
  void Choose(const std::vector<Change>& changes);
  bool CanUndo() const { return done_ > 0; }
  bool CanRedo() const { return done_ < steps_.size(); }
  /// These return what changes with the step; there must be one.
  const std::vector<Change>& Undo();
  const std::vector<Change>& Redo();

  const std::map<std::string, MergeResolve>& Get() const { return chosen_; }
  /// As a merge takes them.
  std::vector<RecordingConflictResolver::RecordResolve> GetResolutions() const;

 private:
  struct Step {
    std::vector<Change> before;
    std::vector<Change> after;
  };

  const std::vector<Change>& Apply(const std::vector<Change>& changes);

  std::map<std::string, MergeResolve> chosen_;
  std::vector<Step> steps_;
  // How many of them are in effect; the others were undone.
  size_t done_ = 0;
};

}  // namespace vexel_yaml
