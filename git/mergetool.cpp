#include "git/mergetool.h"

#include <algorithm>
#include <optional>

#include "git/all_or_nothing.h"
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

bool Leave(const ConflictRecords& records, const RecordEntry& entry, const Settlement& settlement,
           const std::string& merged, const MergeSettings& settings) {
  const auto hash = [&] {
    return settlement.status == AssetMerge::kMerged ? HashOfAsset(entry.asset)
                                                    : records.Entry(entry.asset).hash;
  };
  const std::string record = records.Leave(entry, *settlement.merge, merged, hash, settings);
  if (record.empty()) Complain("cannot write the record of " + entry.asset);
  return !record.empty();
}

// What was chosen now stands in the record alone, which the next try reads: git puts the old file back.
void LeaveOpen(const ConflictRecords& records, const Settlement& settlement, const MergeSettings& settings) {
  RecordEntry entry = settlement.entry;
  const RecordEntry before = records.Entry(entry.asset);
  for (RecordedConflict& conflict : entry.conflicts) {
    const auto known = std::ranges::find(before.conflicts, conflict.place, &RecordedConflict::place);
    conflict.is_settled &= known != before.conflicts.end() && known->is_settled;
  }
  Leave(records, entry, settlement, records.MergedText(entry.asset), settings);
  Say(CountOfConflicts(settlement.entry.CountPending()) + " left in " + entry.asset);
}

// Git has one tool for all files, and this is the one where nobody has set another.
int HandOn(const std::string& path) {
  ProgramCall call = GitCall({"-c", "merge.tool=", "mergetool", "--no-prompt", "--", path});
  call.with = {"GIT_LITERAL_PATHSPECS=1"};
  call.returns_output = false;
  return RunProgram(call).status;
}

MergetoolCall CallIn(const std::vector<std::string>& arguments) {
  if (arguments.size() != 4 && arguments.size() != 5) throw WrongUsage("mergetool is called by git");
  return {{arguments[3], arguments[0], arguments[2], arguments[1]},
          arguments.size() == 5 ? arguments[4] : ""};
}

}  // namespace

MergetoolCall ParseMergetool(const std::vector<std::string>& arguments) {
  MergetoolCall call = CallIn(arguments);
  MarkUndecided(call.versions);
  return call;
}

int SettleForMergetool(const MergetoolCall& call, const Choice& choice) {
  const std::string& asset = call.versions.asset;
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  const ConflictRecords records(repository);
  const std::string start = TextOf("./" + asset);
  const SideNames names = FindSideNames(repository);
  const Settlement settlement = Settle(call.versions, {records, settings, choice, names});
  int status = settlement.status;
  // Asked before anything is written.
  const GitStep next =
      status == AssetMerge::kMerged ? FindStepAfterMergetool(repository, asset, call.last) : GitStep();
  const SignalsHeld held;
  if (status == AssetMerge::kMerged) {
    std::vector<std::string> paths = records.FilesOf(asset);
    paths.push_back("./" + asset);
    const auto finish = [&] {
      return PutAsset(asset, settlement.text) &&
             Leave(records, settlement.entry, settlement, settlement.merge->GetText(), settings);
    };
    if (!AllOrNothing(paths, finish)) status = AssetMerge::kFailed;
    // Git would put the old file beside the new record.
    if (status == AssetMerge::kMerged) HoldSignalsToTheEnd();
  }
  if (status != AssetMerge::kMerged && IsFile("./" + asset)) {
    // Git puts the old file back where we fail.
    const std::string text = TextOf("./" + asset);
    if (text != start) KeepEdited(asset, text, repository);
  }
  if (status == AssetMerge::kConflicts) LeaveOpen(records, settlement, settings);
  if (status == AssetMerge::kMerged) SayNextStep(next);
  return status;
}

int RunMergetool(const std::vector<std::string>& arguments) {
  const AssetVersions versions = CallIn(arguments).versions;
  if (!versions.HasAsset()) return HandOn(versions.asset);
  if (CanShowPage()) GoOnOnPage("mergetool", arguments);
  std::optional<Prompt> prompt;
  if (IsConversation()) prompt.emplace(ColourUse::kAuto);
  Choice choice;
  choice.prompt = prompt ? &*prompt : nullptr;
  return SettleForMergetool(ParseMergetool(arguments), choice);
}

}  // namespace vexel_yaml
