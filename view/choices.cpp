#include "view/choices.h"

#include <algorithm>

#include "merge/conflict_record_file.h"

namespace vexel_yaml {

void Choices::Choose(const std::vector<Change>& changes) {
  steps_.resize(done_);
  Step& step = steps_.emplace_back();
  step.after = changes;
  for (const Change& change : changes) {
    const auto found = chosen_.find(change.path);
    step.before.push_back(
        {change.path, found == chosen_.end() ? std::nullopt : std::optional(found->second)});
  }
  // Where a place is named twice, what was there first comes back last.
  std::ranges::reverse(step.before);
  Redo();
}

const std::vector<Choices::Change>& Choices::Undo() { return Apply(steps_[--done_].before); }

const std::vector<Choices::Change>& Choices::Redo() { return Apply(steps_[done_++].after); }

std::vector<RecordingConflictResolver::RecordResolve> Choices::GetResolutions() const {
  std::vector<RecordingConflictResolver::RecordResolve> resolutions;
  for (const auto& [path, choice] : chosen_) resolutions.push_back({StringToPath(path), choice});
  return resolutions;
}

const std::vector<Choices::Change>& Choices::Apply(const std::vector<Change>& changes) {
  for (const Change& change : changes) {
    if (change.choice) {
      chosen_[change.path] = *change.choice;
    } else {
      chosen_.erase(change.path);
    }
  }
  return changes;
}

}  // namespace vexel_yaml
