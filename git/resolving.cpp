#include "git/resolving.h"

#include "git/conflict_messages.h"
#include "git/decision_memory.h"
#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/ending_signals.h"

namespace vexel_yaml {

namespace {

// Adds the file, and gives it the line ends that the user has set for files of the work tree.
bool Stage(const std::string& asset) {
  const std::vector<std::string> add = {"add", "--", ":(literal)" + asset};
  if (Git(add).status != 0) return false;
  const ProgramResult checked_out = Git({"cat-file", "--filters", ":0:" + asset});
  if (checked_out.status != 0) return false;
  if (checked_out.output == TextOf("./" + asset)) return true;
  return PutAsset(asset, checked_out.output) && Git(add).status == 0;
}

}  // namespace

bool Resolving::Resolve(const std::string& asset) {
  StageFiles stages(asset);
  if (stages.IsStaged() && IsCommitted(asset)) {
    Complain(asset + " is not in conflict any more: it is committed");
    return false;
  }
  if (choice_.as_is) return TakeAsIs(asset);
  AssetVersions versions;
  const bool is_of_one_side = choice_.side == "left" || choice_.side == "right";
  if (stages.LackBase() && is_of_one_side && choice_.pattern.empty()) {
    return PutAsset(asset, stages.TextOf(choice_.side == "left" ? "3" : "2")) && TakeAsIs(asset);
  }
  if (!stages.Write(scratch_, versions)) return false;
  if (!versions.HasAsset()) {
    Complain(asset + " was merged as text: edit it, and 'git add' it");
    return false;
  }
  Settlement settlement =
      Settle(versions, {records_, settings_, choice_, names_, [&] { return stages.AreSame(); }});
  if (settlement.status == AssetMerge::kFailed) return false;
  if (settings_.remembers_decisions) {
    DecisionMemory(repository_).Remember(settlement.entry.conflicts, settlement.merge->GetChoices());
  }
  return settlement.status == AssetMerge::kMerged ? Finish(settlement) : LeaveRest(settlement, stages);
}

// Git still knows the stages then.
bool Resolving::IsCommitted(const std::string& asset) const {
  return records_.Entry(asset).asset.empty() && !repository_.IsAtWork() &&
         GitQuietly({"diff-index", "--quiet", "--cached", "HEAD", "--", ":(literal)" + asset}).status == 0;
}

bool Resolving::TakeAsIs(const std::string& asset) {
  if (HasMarkers(asset)) {
    Complain(asset + " has conflict markers");
    return false;
  }
  const SignalsHeld held;
  records_.TakeAsIs(asset, HashOfAsset(asset));
  if (!Stage(asset)) return false;
  Tell("Resolved " + asset);
  return true;
}

// Its record stays, in case that somebody changes their mind before the commit. Neither of the two without
// the other.
bool Resolving::Finish(const Settlement& settlement) {
  const SignalsHeld held;
  const std::string& asset = settlement.entry.asset;
  if (!PutAsset(asset, settlement.text)) return false;
  if (!LeaveRecord(settlement) || !Stage(asset)) return false;
  Tell("Resolved " + asset);
  return true;
}

// What is settled already counts when the rest is settled in the engine.
bool Resolving::LeaveRest(const Settlement& settlement, StageFiles& stages) {
  const SignalsHeld held;
  const std::string& asset = settlement.entry.asset;
  if (!PutAsset(asset, settlement.text) || !stages.Unstage()) return false;
  LeaveRecord(settlement);
  Say(CountOfConflicts(settlement.entry.CountPending()) + " left in " + asset + ":");
  SayConflicts(asset, settlement.entry.conflicts);
  return false;
}

bool Resolving::LeaveRecord(const Settlement& settlement) {
  const std::string& asset = settlement.entry.asset;
  const std::string record = records_.Leave(
      settlement.entry, *settlement.merge, settlement.merge->GetText(), [&] { return HashOfAsset(asset); },
      settings_);
  if (record.empty()) Complain("cannot write the record of " + asset);
  return !record.empty();
}

}  // namespace vexel_yaml
