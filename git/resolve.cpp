#include "git/resolve.h"

#include <algorithm>
#include <optional>
#include <set>

#include "git/conflict_messages.h"
#include "git/decision_memory.h"
#include "git/git_call.h"
#include "git/prompt.h"
#include "git/repository.h"
#include "git/settle.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/undecided_places.h"
#include "git/work_files.h"
#include "platform/file_error.h"

namespace vexel_yaml {

namespace {

// The side that an option names, as a word of a record; empty for another option.
std::string SideNamedBy(const std::string& option) {
  if (option == "--left" || option == "--theirs") return "left";
  if (option == "--right" || option == "--ours") return "right";
  return option == "--base" ? "base" : "";
}

// What the user wants, and by which way.
struct Arguments {
  Choice choice;
  bool asks = false;
  ColourUse colour = ColourUse::kAuto;
  std::vector<std::string> files;
};

ColourUse ColourNamed(const std::string& word) {
  if (word == "auto") return ColourUse::kAuto;
  if (word == "always") return ColourUse::kAlways;
  if (word == "never") return ColourUse::kNever;
  throw WrongUsage("--color is auto, always or never");
}

// The options may stand anywhere before "--".
Arguments Parse(const std::vector<std::string>& arguments) {
  Arguments parsed;
  Choice& choice = parsed.choice;
  for (auto argument = arguments.begin(); argument != arguments.end(); ++argument) {
    if (const std::string side = SideNamedBy(*argument); !side.empty()) {
      if (!choice.side.empty()) throw WrongUsage("only one of --theirs, --ours and --base can be given");
      choice.side = side;
    } else if (*argument == "--path") {
      if (++argument == arguments.end()) throw WrongUsage("--path needs a value");
      choice.pattern = *argument;
    } else if (argument->starts_with("--path=")) {
      choice.pattern = argument->substr(7);
    } else if (*argument == "--force") {
      choice.force = true;
    } else if (*argument == "-p") {
      parsed.asks = true;
    } else if (argument->starts_with("--color=")) {
      parsed.colour = ColourNamed(argument->substr(8));
    } else if (*argument == "--as-is") {
      choice.as_is = true;
    } else if (*argument == "--") {
      parsed.files.insert(parsed.files.end(), argument + 1, arguments.end());
      break;
    } else if (argument->starts_with('-')) {
      throw WrongUsage("unknown option '" + *argument + "'");
    } else {
      parsed.files.push_back(*argument);
    }
  }
  if (!choice.pattern.empty() && choice.side.empty())
    throw WrongUsage("--path goes with --theirs, --ours or --base");
  if (!choice.side.empty() && parsed.asks) throw WrongUsage("-p asks for the side: name none");
  if (choice.as_is && (!choice.side.empty() || parsed.asks)) throw WrongUsage("--as-is goes with no choice");
  return parsed;
}

// How somebody wants to settle who hasn't said it. An editor is no place to begin.
void AskForWay(Arguments& arguments, Prompt& prompt) {
  const char way =
      prompt.AskLetter("Settle here, conflict by conflict (p), or in the editor (e) [p,e,q]? ", "peq");
  if (way == 'q') throw CommandError("nothing is settled");
  arguments.asks = way == 'p';
}

// The file of this name that was in conflict before it was staged.
std::vector<std::string> StagedConflict(const std::string& pathspec) {
  const ProgramResult found = Git({"ls-files", "-z", "--resolve-undo", "--full-name", "--", pathspec});
  std::set<std::string> paths;
  for (const std::string& entry : Pieces(found.output, '\0'))
    paths.insert(entry.substr(entry.find('\t') + 1));
  return paths.size() == 1 ? std::vector<std::string>(paths.begin(), paths.end())
                           : std::vector<std::string>();
}

// The conflicts of ours that somebody means who names a path, from here or, as git prints it, from the top.
std::vector<std::string> NamedConflicts(const std::string& path, const std::string& top) {
  for (const char* magic : {":(literal)", ":(top,literal)"}) {
    std::vector<std::string> named =
        OursAmong(UnmergedBelow({magic + path}).value_or(std::vector<std::string>()), top);
    if (!named.empty()) return named;
  }
  // One that is settled and staged can be settled otherwise, if it is meant for sure.
  for (const char* magic : {":(literal)", ":(top,literal)"}) {
    const std::vector<std::string> staged = OursAmong(StagedConflict(magic + path), top);
    if (!staged.empty()) return staged;
  }
  return {};
}

// All that is in conflict, where no file is named. What is not found has been said, and `is_complete` is
// false.
std::set<std::string> FindAssets(const std::vector<std::string>& files, bool& is_complete) {
  const std::string top = TopFolder();
  std::set<std::string> assets;
  for (const std::string& file : files.empty() ? std::vector<std::string>{top} : files) {
    const std::vector<std::string> named = NamedConflicts(file, top);
    if (named.empty()) {
      Complain(files.empty() ? "nothing is in conflict that has the attribute merge=vexel"
                             : file + " is not in conflict, or has no attribute merge=vexel");
      is_complete = false;
    }
    assets.insert(named.begin(), named.end());
  }
  return assets;
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

class Resolving {
 public:
  Resolving(const Repository& repository, const MergeSettings& settings, const Choice& choice)
      : repository_(repository), settings_(settings), choice_(choice) {}

  // Resolves a file, and stages it if nothing is left. Returns whether that is so.
  bool Resolve(const std::string& asset) {
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

  void Sweep() const { records_.Sweep(); }

 private:
  // Git still knows the stages then.
  bool IsCommitted(const std::string& asset) const {
    return records_.Entry(asset).asset.empty() && !repository_.IsAtWork() &&
           GitQuietly({"diff-index", "--quiet", "--cached", "HEAD", "--", ":(literal)" + asset}).status == 0;
  }

  bool TakeAsIs(const std::string& asset) {
    if (HasMarkers(asset)) {
      Complain(asset + " has conflict markers");
      return false;
    }
    records_.TakeAsIs(asset, HashOfAsset(asset));
    if (!Stage(asset)) return false;
    Tell("Resolved " + asset);
    return true;
  }

  // Its record stays, in case that somebody changes their mind before the commit.
  bool Finish(const Settlement& settlement) {
    const std::string& asset = settlement.entry.asset;
    LeaveRecord(settlement);
    if (!Stage(asset)) return false;
    Tell("Resolved " + asset);
    return true;
  }

  // What is settled already counts when the rest is settled in the engine.
  bool LeaveRest(const Settlement& settlement, StageFiles& stages) {
    const std::string& asset = settlement.entry.asset;
    if (!PutAsset(asset, settlement.text) || !stages.Unstage()) return false;
    LeaveRecord(settlement);
    Say(CountOfConflicts(settlement.entry.CountPending()) + " left in " + asset + ":");
    SayConflicts(asset, settlement.entry.conflicts);
    return false;
  }

  void LeaveRecord(const Settlement& settlement) {
    const std::string& asset = settlement.entry.asset;
    const std::string record = records_.Leave(
        settlement.entry, *settlement.merge, settlement.merge->GetText(), [&] { return HashOfAsset(asset); },
        settings_);
    if (record.empty()) Complain("cannot write the record of " + asset);
  }

  const Repository& repository_;
  const MergeSettings& settings_;
  const Choice& choice_;
  const SideNames names_ = FindSideNames(repository_);
  const ConflictRecords records_{repository_};
  ScratchFolder scratch_{repository_};
};

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
  Arguments parsed = Parse(arguments);
  Choice& choice = parsed.choice;
  const bool is_free = choice.side.empty() && !parsed.asks && !choice.as_is && IsConversation();
  if (parsed.files.empty() && !parsed.asks && !is_free) throw WrongUsage("resolve needs a file");
  bool is_done = true;
  const std::set<std::string> assets = FindAssets(parsed.files, is_done);
  GoToTop();
  std::optional<Prompt> prompt;
  if (!assets.empty() && (parsed.asks || is_free)) prompt.emplace(parsed.colour);
  if (prompt && is_free) AskForWay(parsed, *prompt);
  if (parsed.asks && prompt) choice.prompt = &*prompt;
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  Resolving resolving(repository, settings, choice);
  for (const std::string& asset : assets) {
    try {
      if (!resolving.Resolve(asset)) is_done = false;
    } catch (const FileError& error) {
      // The others can be settled all the same.
      Complain(error.what());
      is_done = false;
    }
    if (prompt && prompt->HasQuit()) {
      is_done = is_done && asset == *assets.rbegin();
      break;
    }
  }
  resolving.Sweep();
  return is_done ? 0 : 1;
}

int RunMergetool(const std::vector<std::string>& arguments) {
  if (arguments.size() != 4) throw WrongUsage("mergetool is called by git");
  const std::string& asset = arguments[3];
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  const ConflictRecords records(repository);
  const std::string start = TextOf("./" + asset);
  AssetVersions versions = {asset, arguments[0], arguments[2], arguments[1]};
  MarkUndecided(versions);
  const SideNames names = FindSideNames(repository);
  const Settlement settlement = Settle(versions, {records, settings, Choice(), names});
  const int status = settlement.status;
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
  const std::string record = records.Leave(
      settlement.entry, *settlement.merge, merged, [&] { return hash; }, settings);
  if (record.empty()) Complain("cannot write the record of " + asset);
  if (!is_merged) Say(CountOfConflicts(settlement.entry.CountPending()) + " left in " + asset);
  return is_merged ? AssetMerge::kMerged : AssetMerge::kConflicts;
}

int RunSweep(const std::vector<std::string>& arguments) {
  GoToTop();
  const Repository repository;
  ConflictRecords(repository).Sweep(!arguments.empty() && arguments.front() == "--committed");
  return 0;
}

}  // namespace vexel_yaml
