#include "git/next_step.h"

#include <algorithm>

#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/side_names.h"
#include "platform/files.h"

namespace vexel_yaml {

GitStep FindNextStep(const Repository& repository, const std::set<std::string>& settled) {
  std::vector<std::string> open = UnmergedBelow({}).value_or(std::vector<std::string>());
  std::erase_if(open, [&](const std::string& path) { return settled.contains(path); });
  if (!open.empty()) {
    const char* command = OursAmong(open).empty() ? "git status" : "vexel-merge-git resolve";
    return {"settle what is left, in " + ListOf(open), command, open};
  }
  // One that stops for an edit leaves room for a merge or a pick within it.
  const GitStep rebase = {"go on with the rebase", "git rebase --continue"};
  const auto is_there = [&](const char* name) { return FileExists(repository.Path(name)); };
  if (!MergingRebase(repository).empty()) return rebase;
  if (is_there("MERGE_HEAD")) return {"finish the merge", "git commit"};
  if (is_there("CHERRY_PICK_HEAD")) return {"go on with the cherry-pick", "git cherry-pick --continue"};
  if (is_there("REVERT_HEAD")) return {"go on with the revert", "git revert --continue"};
  if (is_there("rebase-apply/applying")) return {"go on with the patches", "git am --continue"};
  if (is_there("rebase-merge") || is_there("rebase-apply")) return rebase;
  return {};
}

GitStep FindStepAfterMergetool(const Repository& repository, const std::string& settled,
                               const std::string& last) {
  GitStep step = FindNextStep(repository, {settled});
  // Without files of its own, git goes through all of them in this order.
  const bool goes_on =
      last.empty() ? std::ranges::any_of(step.open, [&](const std::string& path) { return path > settled; })
                   : last != settled;
  if (goes_on && !step.open.empty()) step.command.clear();
  return step;
}

void SayNextStep(const GitStep& step) {
  if (!step.command.empty()) Say("To " + step.purpose + ": " + step.command);
}

}  // namespace vexel_yaml
