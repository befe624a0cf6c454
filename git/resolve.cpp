#include "git/resolve.h"

#include <algorithm>
#include <set>

#include "git/git_call.h"
#include "git/repository.h"
#include "git/settle.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/work_files.h"
#include "platform/file_error.h"

namespace vexel_yaml {

namespace {

// The options; what is left in `files` names files.
Choice Parse(const std::vector<std::string>& arguments, std::vector<std::string>& files) {
  Choice choice;
  auto argument = arguments.begin();
  for (; argument != arguments.end() && argument->starts_with('-'); ++argument) {
    if (*argument == "--left" || *argument == "--right" || *argument == "--base") {
      if (!choice.side.empty()) throw WrongUsage("only one of --left, --right and --base can be given");
      choice.side = argument->substr(2);
    } else if (*argument == "--path") {
      if (++argument == arguments.end()) throw WrongUsage("--path needs a value");
      choice.pattern = *argument;
    } else if (argument->starts_with("--path=")) {
      choice.pattern = argument->substr(7);
    } else if (*argument == "--force") {
      choice.force = true;
    } else if (*argument == "--") {
      ++argument;
      break;
    } else {
      throw WrongUsage("unknown option '" + *argument + "'");
    }
  }
  files.assign(argument, arguments.end());
  if (files.empty()) throw WrongUsage("resolve needs a file");
  if (!choice.pattern.empty() && choice.side.empty())
    throw WrongUsage("--path goes with --left, --right or --base");
  return choice;
}

// The conflicts of ours that somebody means who names a path, from here or, as git prints it, from the top.
std::vector<std::string> NamedConflicts(const std::string& path, const std::string& top) {
  for (const char* magic : {":(literal)", ":(top,literal)"}) {
    std::vector<std::string> named =
        OursAmong(UnmergedBelow({magic + path}).value_or(std::vector<std::string>()), top);
    if (!named.empty()) return named;
  }
  return {};
}

// Adds the file, and gives it the line ends that the user has set for files of the work tree.
bool Stage(const std::string& asset) {
  const std::vector<std::string> add = {"add", "--", ":(literal)" + asset};
  if (Git(add).status != 0) return false;
  const ProgramResult checked_out = Git({"cat-file", "--filters", ":0:" + asset});
  if (checked_out.status != 0) return false;
  if (checked_out.output == TextOf("./" + asset)) return true;
  return PutAsset(asset, checked_out.output) && Git(add).status == 0;
}

// Resolves a file, and stages it if nothing is left. Returns whether that is so.
bool ResolveAsset(const std::string& asset, const SettleContext& general, ScratchFolder& scratch) {
  const StageFiles stages(asset);
  AssetVersions versions;
  if (!stages.Write(scratch, versions)) return false;
  if (!versions.HasAsset()) {
    Complain(asset + " was merged as text: edit it, and 'git add' it");
    return false;
  }
  SettleContext context = general;
  context.is_same_conflict = [&] { return stages.AreSame(); };
  AssetMerge merge(versions);
  const int status = Settle(versions, context, merge);
  if (status == AssetMerge::kFailed) return false;
  if (status == AssetMerge::kMerged) {
    if (!Stage(asset)) return false;
    context.records.Remove(asset);
    Tell("Resolved " + asset);
    return true;
  }
  // What is settled already counts when the rest is settled in the engine.
  if (!PutAsset(asset, merge.GetText())) return false;
  if (context.records
          .Leave(
              asset, merge, [&] { return HashOfAsset(asset); }, context.settings)
          .empty()) {
    Complain("cannot write the record of " + asset);
  }
  Say(Count(merge.GetConflicts()) + " left in " + asset + ":");
  SayConflicts(asset, merge.GetConflicts());
  return false;
}

// A copy of the work tree's file, beside it where that can be.
void KeepEdited(const std::string& asset, std::string_view text, const Repository& repository) {
  std::string copy = "./" + asset + ".vexel-edited.XXXXXX";
  if (!IsPlain(asset) || !MakeCopy(copy, text)) {
    copy = repository.Path("vexel-edited.XXXXXX");
    if (!MakeCopy(copy, text)) throw CommandError("cannot keep the edited " + asset);
  }
  Say("The edited file is kept as " + ShownRecord(copy));
}

}  // namespace

int RunResolve(const std::vector<std::string>& arguments) {
  std::vector<std::string> files;
  const Choice choice = Parse(arguments, files);
  const std::string top = TopFolder();
  bool is_done = true;
  std::set<std::string> assets;
  for (const std::string& file : files) {
    const std::vector<std::string> named = NamedConflicts(file, top);
    if (named.empty()) {
      Complain(file + " is not in conflict, or has no attribute merge=vexel");
      is_done = false;
    }
    assets.insert(named.begin(), named.end());
  }
  GoToTop();
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  const ConflictRecords records(repository);
  {
    ScratchFolder scratch(repository);
    for (const std::string& asset : assets) {
      try {
        if (!ResolveAsset(asset, {records, settings, choice}, scratch)) is_done = false;
      } catch (const FileError& error) {
        // The others can be settled all the same.
        Complain(error.what());
        is_done = false;
      }
    }
  }
  records.Sweep();
  return is_done ? 0 : 1;
}

int RunMergetool(const std::vector<std::string>& arguments) {
  if (arguments.size() != 4) throw WrongUsage("mergetool is called by git");
  const std::string& asset = arguments[3];
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  const ConflictRecords records(repository);
  const std::string start = TextOf("./" + asset);
  const AssetVersions versions = {asset, arguments[0], arguments[2], arguments[1]};
  AssetMerge merge(versions);
  const int status = Settle(versions, {records, settings, Choice()}, merge);
  if (status != AssetMerge::kMerged && IsFile("./" + asset)) {
    // Git puts the old file back where we fail.
    const std::string text = TextOf("./" + asset);
    if (text != start) KeepEdited(asset, text, repository);
  }
  if (status == AssetMerge::kMerged) records.Remove(asset);
  if (status == AssetMerge::kConflicts || status == AssetMerge::kBrokenDependencies) {
    if (records
            .Leave(
                asset, merge, [&] { return records.RecordedHash(asset); }, settings)
            .empty()) {
      Complain("cannot write the record of " + asset);
    }
    Say(Count(merge.GetConflicts()) + " left in " + asset);
  }
  return status == AssetMerge::kBrokenDependencies ? AssetMerge::kConflicts : status;
}

int RunSweep() {
  GoToTop();
  const Repository repository;
  ConflictRecords(repository).Sweep();
  return 0;
}

}  // namespace vexel_yaml
