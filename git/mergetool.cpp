#include "git/mergetool.h"

#include <algorithm>
#include <optional>

#include "git/conflict_records.h"
#include "git/git_call.h"
#include "git/next_step.h"
#include "git/page_call.h"
#include "git/prompt.h"
#include "git/repository.h"
#include "git/shown_text.h"
#include "git/undecided_places.h"
#include "git/work_files.h"
#include "platform/ending_signals.h"

namespace vexel_yaml {

namespace {

// A copy of the work tree's file, beside it where that can be.
void KeepEdited(const std::string& asset, std::string_view text, const Repository& repository) {
  std::string copy = "./" + asset + ".vexel-edited.XXXXXX";
  if (!IsPlain(asset) || !MakeCopy(copy, text)) {
    copy = repository.Path("vexel-edited.XXXXXX");
    if (!MakeCopy(copy, text)) throw CommandError("cannot keep the edited " + asset);
  }
  Say("The edited file is kept as " + ShownRecord(copy));
}

// What was chosen now stands in the record alone, which the next try reads: git puts the old file back.
void LeaveOpen(const RecordEntry& before, RecordEntry& entry) {
  for (RecordedConflict& conflict : entry.conflicts) {
    const auto known = std::ranges::find(before.conflicts, conflict.place, &RecordedConflict::place);
    conflict.is_settled &= known != before.conflicts.end() && known->is_settled;
  }
}

// Git has one tool for all files, and this is the one where nobody has set another.
int HandOn(const std::string& path) {
  ProgramCall call = GitCall({"-c", "merge.tool=", "mergetool", "--no-prompt", "--", path});
  call.with = {"GIT_LITERAL_PATHSPECS=1"};
  call.returns_output = false;
  return RunProgram(call).status;
}

}  // namespace

AssetVersions MergetoolVersions(const std::vector<std::string>& arguments) {
  if (arguments.size() != 4) throw WrongUsage("mergetool is called by git");
  AssetVersions versions = {arguments[3], arguments[0], arguments[2], arguments[1]};
  MarkUndecided(versions);
  return versions;
}

int SettleForMergetool(const AssetVersions& versions, const Choice& choice) {
  const std::string& asset = versions.asset;
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  const ConflictRecords records(repository);
  const std::string start = TextOf("./" + asset);
  const SideNames names = FindSideNames(repository);
  const Settlement settlement = Settle(versions, {records, settings, choice, names});
  // The result and its record, or neither.
  const SignalsHeld held;
  const bool is_written = settlement.status != AssetMerge::kMerged || PutAsset(asset, settlement.text);
  const int status = is_written ? settlement.status : AssetMerge::kFailed;
  if (status != AssetMerge::kMerged && IsFile("./" + asset)) {
    // Git puts the old file back where we fail.
    const std::string text = TextOf("./" + asset);
    if (text != start) KeepEdited(asset, text, repository);
  }
  if (status == AssetMerge::kFailed) return status;
  const bool is_merged = status == AssetMerge::kMerged;
  const std::string hash = is_merged ? HashOfAsset(asset) : records.Entry(asset).hash;
  // Git keeps the old file where something is left.
  const std::string merged = is_merged ? settlement.merge->GetText() : records.MergedText(asset);
  RecordEntry entry = settlement.entry;
  if (!is_merged) LeaveOpen(records.Entry(asset), entry);
  const std::string record = records.Leave(
      entry, *settlement.merge, merged, [&] { return hash; }, settings);
  if (record.empty()) Complain("cannot write the record of " + asset);
  if (!is_merged) Say(CountOfConflicts(settlement.entry.CountPending()) + " left in " + asset);
  // Git itself goes on to the next file.
  const GitStep next = is_merged ? FindNextStep(repository, {asset}) : GitStep();
  if (next.open.empty()) SayNextStep(next);
  return is_merged ? AssetMerge::kMerged : AssetMerge::kConflicts;
}

int RunMergetool(const std::vector<std::string>& arguments) {
  if (arguments.size() == 4 &&
      !AssetVersions{arguments[3], arguments[0], arguments[2], arguments[1]}.HasAsset())
    return HandOn(arguments[3]);
  if (CanShowPage()) GoOnOnPage("mergetool", arguments);
  std::optional<Prompt> prompt;
  if (IsConversation()) prompt.emplace(ColourUse::kAuto);
  Choice choice;
  choice.prompt = prompt ? &*prompt : nullptr;
  return SettleForMergetool(MergetoolVersions(arguments), choice);
}

}  // namespace vexel_yaml
