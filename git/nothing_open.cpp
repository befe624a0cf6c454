#include "git/nothing_open.h"

#include "git/conflict_messages.h"
#include "git/conflict_records.h"
#include "git/git_call.h"
#include "git/next_step.h"
#include "git/shown_text.h"

namespace vexel_yaml {

int SayNothingOpen() {
  const Repository repository;
  std::vector<std::string> settled;
  bool is_done = true;
  for (const RecordEntry& entry : ConflictRecords(repository).Entries()) {
    if (entry.CountPending() == 0) {
      settled.push_back(entry.asset);
      continue;
    }
    Complain(entry.asset + " is staged with " + Unsettled(entry));
    is_done = false;
  }
  if (!is_done) return 1;
  if (settled.empty()) {
    const auto others = UnmergedBelow({});
    Complain(!others || others->empty()
                 ? "nothing is in conflict"
                 : "no file in conflict has the attribute merge=vexel: " + ListOf(*others));
    return 1;
  }
  Say("No scene is in conflict any more. Settled, and not committed yet: " + ListOf(settled));
  Say("To settle one anew: " +
      (settled.size() == 1 ? ResolveCall(settled.front()) : "vexel-merge-git resolve <file>"));
  SayNextStep(FindNextStep(repository));
  return 0;
}

}  // namespace vexel_yaml
