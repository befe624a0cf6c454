#include "git/resolving.h"

#include "git/all_or_nothing.h"
#include "git/conflict_messages.h"
#include "git/decision_memory.h"
#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

bool Stage(const std::string& asset) { return Git({"add", "--", ":(literal)" + asset}).status == 0; }

// The line ends that the user has set for files of the work tree.
bool SetLineEnds(const std::string& asset) {
  const ProgramResult checked_out = Git({"cat-file", "--filters", ":0:" + asset});
  if (checked_out.status != 0) return false;
  if (checked_out.output == TextOf("./" + asset)) return true;
  return PutAsset(asset, checked_out.output) && Stage(asset);
}

// Of a file that is staged.
bool TellResolved(const std::string& asset) {
  const bool has_line_ends = SetLineEnds(asset);
  Tell("Resolved " + asset);
  return has_line_ends;
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
    return TakeText(asset, stages.TextOf(choice_.side == "left" ? "3" : "2"));
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
  if (settlement.status == AssetMerge::kMerged && !choice_.stays_open) return Finish(settlement);
  return LeaveRest(settlement, stages) && choice_.stays_open;
}

// Git still knows the stages then.
bool Resolving::IsCommitted(const std::string& asset) const {
  return records_.Entry(asset).asset.empty() && !repository_.IsAtWork() &&
         GitQuietly({"diff-index", "--quiet", "--cached", "HEAD", "--", ":(literal)" + asset}).status == 0;
}

bool Resolving::TakeAsIs(const std::string& asset) {
  if (!HasMarkers(asset)) return TakeText(asset, TextOf("./" + asset));
  Complain(asset + " has conflict markers");
  return false;
}

bool Resolving::TakeText(const std::string& asset, const std::string& text) {
  const std::string hash = HashOfAsset(asset, text);
  const RecordEntry entry = records_.EntryFor(asset, hash);
  const auto take = [&] {
    if (text != TextOf("./" + asset) && !PutAsset(asset, text)) return false;
    records_.TakeAsIs(entry, hash);
    return Stage(asset);
  };
  return Change(asset, entry.asset.empty() ? asset : entry.asset, take) && TellResolved(asset);
}

// Its record stays, in case that somebody changes their mind before the commit.
bool Resolving::Finish(const Settlement& settlement) {
  const std::string& asset = settlement.entry.asset;
  const auto finish = [&] {
    return PutAsset(asset, settlement.text) && LeaveRecord(settlement) && Stage(asset);
  };
  return Change(asset, asset, finish) && TellResolved(asset);
}

// What is settled already counts when the rest is settled in the engine.
bool Resolving::LeaveRest(const Settlement& settlement, StageFiles& stages) {
  const std::string& asset = settlement.entry.asset;
  const auto leave = [&] {
    return PutAsset(asset, settlement.text) && LeaveRecord(settlement) && stages.Unstage();
  };
  if (!Change(asset, asset, leave)) return false;
  const size_t pending = settlement.entry.CountPending();
  Say(pending == 0 ? "Nothing is open any more in " + asset + ", and it is not staged yet"
                   : CountOfConflicts(pending) + " left in " + asset + ":");
  SayConflicts(asset, settlement.entry.conflicts);
  return true;
}

// The file and its record go together, and with them what is staged, as the last step.
bool Resolving::Change(const std::string& asset, const std::string& recorded,
                       const std::function<bool()>& change) const {
  std::vector<std::string> paths = records_.FilesOf(recorded);
  paths.push_back("./" + asset);
  return AllOrNothing(paths, change);
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
