#include "git/settle.h"

#include <algorithm>

#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

// The record, which is made where the asset has none (any more), with nothing settled; empty where it can't.
std::string RecordOf(const AssetVersions& versions, const SettleContext& context) {
  std::string record = context.records.Find(versions.asset);
  if (!record.empty()) return record;
  AssetMerge merge(versions);
  if (merge.Run(context.settings) == AssetMerge::kFailed) return {};
  record = context.records.Leave(
      versions.asset, merge, [&] { return Line(RunProgram(HashCall(versions.asset, merge.GetText()))); },
      context.settings);
  if (record.empty()) Complain("cannot write the record of " + versions.asset);
  return record;
}

// Whether a place fits a pattern, component by component. As texts: as numbers, two file IDs of 19 digits may
// be equal.
bool Fits(const std::string& place, const std::string& pattern) {
  if (pattern.empty()) return true;
  const std::vector<std::string> wanted = Pieces(pattern + ".", '.');
  const std::vector<std::string> given = Pieces(place + ".", '.');
  return std::ranges::equal(wanted, given,
                            [](const std::string& w, const std::string& g) { return w == "*" || w == g; });
}

// Adds a decision for each pending conflict whose place fits, since a pattern in the record itself would also
// decide about places that only one side has changed. False where none fits, which has been said.
bool ChooseSide(const AssetMerge& merge, const Choice& choice, const std::string& asset,
                std::string& decided) {
  if (merge.GetConflicts().empty()) return true;
  bool found = false;
  for (const ListedConflict& conflict : merge.GetConflicts()) {
    if (!Fits(conflict.place, choice.pattern)) continue;
    decided += choice.side + " " + conflict.place + "\n";
    found = true;
  }
  if (!found) Complain("no conflict in " + asset + " fits '" + choice.pattern + "'");
  return found;
}

bool HasMarkers(const std::string& asset) {
  const std::string text = TextOf("./" + asset);
  return text.starts_with("<<<<<<< ") || text.find("\n<<<<<<< ") != std::string::npos;
}

// Whether somebody has changed the asset since it was merged, which has been said.
bool IsEdited(const std::string& asset, const SettleContext& context) {
  if (context.choice.force || !FileExists("./" + asset)) return false;
  if (HashOfAsset(asset) == context.records.RecordedHash(asset)) return false;
  if (HasMarkers(asset)) {
    Complain(asset + " was merged as text; say --force to merge it anew, and lose what was edited since");
  } else {
    Complain(asset + " was edited after the merge; 'git add' it as it is, or say --force to lose the edits");
  }
  return true;
}

// Also of a name with blanks, while the editor may be a command with arguments.
bool Edit(const std::string& record) {
  const ProgramResult editor = Git({"var", "GIT_EDITOR"});
  if (editor.status != 0) return false;
  const std::string command = Line(editor) + " \"$1\"";
  return RunProgram({.arguments = {"sh", "-c", command, "sh", record}, .returns_output = false}).status == 0;
}

// What the user decides, in `decided`. False where there is nothing to go by, which has been said.
bool Decide(const AssetVersions& versions, const SettleContext& context, const std::string& record,
            Decisions& decided) {
  const std::string& asset = versions.asset;
  decided.record = ShownRecord(record);
  if (!context.choice.side.empty()) {
    decided.text = DecidedIn(record);
    AssetMerge merge(versions);
    if (merge.Run(context.settings, &decided) == AssetMerge::kFailed) return false;
    return ChooseSide(merge, context.choice, asset, decided.text);
  }
  if (!Edit(record)) {
    Complain("the editor failed; nothing is merged");
    return false;
  }
  decided.text = DecidedIn(record);
  // Who looks at the scene in the engine while deciding may save it there.
  if (!context.is_same_conflict()) {
    context.records.Remove(asset);
    Complain(asset + " is no longer in the conflict that it was in when the editor was opened");
    return false;
  }
  return !IsEdited(asset, context);
}

}  // namespace

std::string HashOfAsset(const std::string& asset) {
  return Line(RunProgram(HashCall(asset, TextOf("./" + asset))));
}

bool PutAsset(const std::string& asset, std::string_view text) {
  if (IsPlain(asset) && PutFile("./" + asset, text)) return true;
  Complain("cannot write " + asset);
  return false;
}

int Settle(const AssetVersions& versions, const SettleContext& context, AssetMerge& merge) {
  const std::string& asset = versions.asset;
  if (!IsPlain(asset)) {
    Complain(asset + " lies behind a symbolic link, or is one or a folder, in the work tree");
    return AssetMerge::kFailed;
  }
  const std::string record = RecordOf(versions, context);
  Decisions decided;
  if (record.empty() || IsEdited(asset, context) || !Decide(versions, context, record, decided)) {
    return AssetMerge::kFailed;
  }
  const int status = merge.Run(context.settings, &decided);
  if (status == AssetMerge::kMerged && !PutAsset(asset, merge.GetText())) return AssetMerge::kFailed;
  return status;
}

}  // namespace vexel_yaml
