#include "git/settle.h"

#include <algorithm>
#include <map>
#include <set>
#include <vector>

#include "git/conflict_messages.h"
#include "git/decided_lines.h"
#include "git/git_call.h"
#include "git/named_places.h"
#include "git/questions.h"
#include "git/settled_by_hand.h"
#include "git/shown_text.h"
#include "git/stage_files.h"
#include "git/work_files.h"
#include "platform/files.h"
#include "platform/progress.h"

namespace vexel_yaml {

namespace {

constexpr int kMostMerges = 3;

// The decisions that a choice makes about these places, as lines of a record.
std::vector<std::string> Chosen(const Choice& choice, const std::vector<NamedPlace>& places) {
  std::vector<std::string> lines;
  for (const NamedPlace& place : places) {
    if (IsMeant(place, choice.pattern)) lines.push_back(choice.side + " " + place.place);
  }
  return lines;
}

// Also of a name with blanks, while the editor may be a command with arguments.
bool Edit(const std::string& record) {
  const ProgramResult editor = Git({"var", "GIT_EDITOR"});
  if (editor.status != 0) return false;
  const std::string command = Line(editor) + " \"$1\"";
  return RunProgram({.arguments = {"sh", "-c", command, "sh", record}, .returns_output = false}).status == 0;
}

// One file on its way to being settled.
class Settling {
 public:
  Settling(const AssetVersions& versions, const SettleContext& context)
      : versions_(versions), context_(context), choice_(context.choice) {}

  Settlement Run() {
    if (!FindStart() || !FindEdits()) return {};
    const bool is_merged = choice_.prompt != nullptr     ? MergeAnswered()
                           : choice_.decided.has_value() ? Merge(*choice_.decided)
                           : choice_.side.empty()        ? MergeEdited()
                                                         : MergeWithSide();
    if (!is_merged || !CarryEdits()) return {};
    TellBaseless();
    entry_.conflicts = ConflictsAfter(*merge_, versions_.asset, entry_.names, entry_.conflicts);
    for (RecordedConflict& conflict : entry_.conflicts) {
      if (edits_.settled.contains(conflict.place)) conflict.is_settled = true;
    }
    if (entry_.CountPending() == 0) status_ = AssetMerge::kMerged;
    return {status_, std::move(merge_), std::move(text_), std::move(entry_)};
  }

 private:
  // The record, which is made where the asset has none (any more), with nothing settled. Where that fails,
  // a choice can still be what the merge needs.
  bool FindStart() {
    const std::string& asset = versions_.asset;
    record_ = context_.records.Find(asset);
    entry_ = context_.records.Entry(asset);
    // Of a single pick, git tells what it is only once it has stopped.
    if (entry_.names.theirs.empty()) entry_.names = context_.names;
    if (!record_.empty()) {
      merged_ = context_.records.MergedText(asset);
      return true;
    }
    entry_ = {asset, {}, context_.names, {}, {}};
    AssetMerge merge(versions_);
    if (merge.RunQuietly(context_.settings) == AssetMerge::kFailed) {
      if (!choice_.side.empty() && !choice_.pattern.empty()) {
        entry_.hash = HashOfAsset(asset, TextOf(versions_.right));
        has_failed_ = true;
        return true;
      }
      merge.SayMessages();
      Say("To take a side at the object that is in the way: " +
          ResolveCall(asset, "resolve --theirs --path <object>"));
      return false;
    }
    merged_ = merge.GetText();
    entry_.hash = HashOfAsset(asset, merged_);
    entry_.conflicts = ConflictsAfter(merge, asset, entry_.names, {});
    if (!choice_.side.empty() || choice_.prompt != nullptr || choice_.decided) return true;
    record_ = context_.records.Leave(
        entry_, merge, merged_, [&] { return entry_.hash; }, context_.settings);
    if (record_.empty()) Complain("cannot write the record of " + asset);
    return !record_.empty();
  }

  // What somebody has made of the asset since it was merged. False where it can't be kept, which has been
  // said.
  bool FindEdits() {
    edits_ = {};
    if (choice_.force) return true;
    std::optional<HandEdits> edits = FindHandEdits(versions_, entry_, merged_, context_.settings);
    if (!edits) return false;
    edits_ = std::move(*edits);
    if (edits_.text.empty() || !choice_.seen || edits_.text == *choice_.seen) return true;
    const std::string& asset = versions_.asset;
    Complain(asset + " was edited by hand since the page was opened; save again to keep that, too: " +
             EditedObjects(asset, merged_, edits_, context_.settings));
    return false;
  }

  // Merges what was edited by hand with what the new merge makes of the conflicts.
  bool CarryEdits() {
    text_ = merge_->GetText();
    if (edits_.text.empty()) return true;
    if (text_ == merged_) {
      text_ = edits_.text;
      return AreChoicesKept();
    }
    ScratchFolder scratch;
    AssetMerge carried({versions_.asset, scratch.Write("merged", merged_), scratch.Write("chosen", text_),
                        scratch.Write("edited", edits_.text)});
    const int status = carried.RunQuietly(context_.settings);
    if (status == AssetMerge::kMerged) {
      text_ = carried.GetText();
      return AreChoicesKept();
    }
    if (status == AssetMerge::kFailed) {
      carried.SayMessages();
    } else {
      SayConflicts(versions_.asset, ConflictsAfter(carried, versions_.asset, {"chosen now", "edited"}, {}));
    }
    ComplainOfEdits(versions_.asset);
    return false;
  }

  // What is chosen can be what the merge had before the edit: then the edit alone would stand there.
  bool AreChoicesKept() const {
    std::vector<RecordedConflict> chosen;
    const std::map<std::string, std::string> choices = merge_->GetChoices();
    for (const RecordedConflict& conflict : entry_.conflicts) {
      const NamedPlace place = {conflict.place, NamedPlace::NameIn(conflict.text)};
      const bool is_new =
          !conflict.is_settled || (!choice_.pattern.empty() && IsMeant(place, choice_.pattern));
      if (!is_new || !edits_.settled.contains(place.place) || !choices.contains(place.place)) continue;
      chosen.push_back(conflict);
      chosen.back().is_settled = false;
    }
    const auto sides = [&] { return SideTexts{TextOf(versions_.base), TextOf(versions_.left)}; };
    const auto lost = FindSettledByHand(merge_->GetText(), text_, context_.settings, sides, chosen);
    for (const RecordedConflict& conflict : chosen) {
      if (lost.contains(conflict.place)) ComplainOfEdits(NamedPlace::NameIn(conflict.text));
    }
    return lost.empty();
  }

  static void ComplainOfEdits(const std::string& what) {
    Complain(what +
             " was edited by hand, and that doesn't go with the choice; say --force to lose the edits");
  }

  bool Merge(const std::string& decided) {
    const Decisions decisions = {decided, ShownRecord(record_)};
    const Progress progress("Merging " + versions_.asset);
    merge_ = std::make_unique<AssetMerge>(versions_);
    status_ = merge_->Run(context_.settings, &decisions);
    return status_ != AssetMerge::kFailed;
  }

  bool MergeEdited() {
    if (!Edit(record_)) {
      Complain("the editor failed; nothing is merged");
      return false;
    }
    const std::string decided = DecidedIn(record_);
    if (!IsStillInConflict("the editor was opened") || !Merge(decided)) return false;
    std::set<std::string> places;
    for (const RecordedConflict& conflict : entry_.conflicts) places.insert(conflict.place);
    for (const std::string& line : merge_->DropUnknownChoices(places)) Say(line);
    for (const std::string& line : DescribeCommentedChoices(record_, places)) Say(line);
    return true;
  }

  // Says where whoever wants base's value gets another one.
  void TellBaseless() const {
    const std::set<std::string> places = merge_->FindBaseless();
    for (const RecordedConflict& conflict : entry_.conflicts) {
      if (!places.contains(conflict.place)) continue;
      Say("Warning: base has nothing at " + NamedPlace::NameIn(conflict.text) + ", so theirs stands there");
    }
  }

  bool MergeAnswered() {
    // Where nothing is open, minds can be changed about all of it.
    const bool asks_again = entry_.CountPending() == 0;
    Questions questions(
        *choice_.prompt, entry_, edits_.settled, [&](const std::vector<std::string>& chosen, bool is_blank) {
          return Merge(is_blank ? std::string() : DecidedIn(record_, chosen)) ? merge_.get() : nullptr;
        });
    if (!questions.Ask(asks_again)) return false;
    if (!questions.HaveDecided() && HasOpen()) {
      Say("Nothing is settled in " + versions_.asset);
      return false;
    }
    return IsStillInConflict("the first question was asked");
  }

  bool HasOpen() {
    return std::ranges::any_of(merge_->GetConflicts(), [&](const NamedConflict& conflict) {
      return !edits_.settled.contains(conflict.place);
    });
  }

  // Who looks at the scene in the engine while deciding may save it there.
  bool IsStillInConflict(const std::string& since) {
    if (context_.is_same_conflict()) return FindEdits();
    context_.records.Remove(versions_.asset);
    Complain(versions_.asset + " is no longer in the conflict that it was in when " + since);
    return false;
  }

  // Only at conflicts, since a pattern in the record itself would also decide about places that only one side
  // has changed.
  bool MergeWithSide() {
    std::vector<NamedPlace> places;
    // Whoever says no more than a side means the rest, or all where nothing is left.
    const bool is_rest = choice_.pattern.empty() && entry_.CountPending() > 0;
    for (const RecordedConflict& conflict : entry_.conflicts) {
      if ((!is_rest || !conflict.is_settled) && !IsKept(conflict.place))
        places.push_back({conflict.place, NamedPlace::NameIn(conflict.text)});
    }
    std::vector<std::string> chosen = Chosen(choice_, places);
    if (has_failed_) chosen.push_back(choice_.side + " " + choice_.pattern);
    for (int merges = 1;; ++merges) {
      if (!Merge(DecidedIn(record_, chosen))) return false;
      std::vector<NamedPlace> pending;
      for (const NamedConflict& conflict : merge_->GetConflicts()) {
        if (!IsKept(conflict.place)) pending.push_back({conflict.place, conflict.name});
      }
      bool is_new = false;
      for (const std::string& line : Chosen(choice_, pending)) {
        if (std::ranges::find(chosen, line) != chosen.end()) continue;
        chosen.push_back(line);
        is_new = true;
      }
      if (!is_new || merges == kMostMerges) break;
    }
    const bool is_merged = status_ == AssetMerge::kMerged || !edits_.settled.empty();
    if (!chosen.empty() || (is_merged && choice_.pattern.empty())) return true;
    Complain("no conflict in " + versions_.asset + " fits '" + choice_.pattern + "'" +
             SuggestionFor(choice_.pattern, places));
    return false;
  }

  // Whoever has settled a conflict by hand doesn't mean it without naming it.
  bool IsKept(const std::string& place) const {
    return choice_.pattern.empty() && edits_.settled.contains(place);
  }

  const AssetVersions& versions_;
  const SettleContext& context_;
  const Choice& choice_;
  std::string record_;
  // Whether the merge has failed without a choice.
  bool has_failed_ = false;
  RecordEntry entry_;
  // How the last merge left the file, and what it has become since.
  std::string merged_;
  HandEdits edits_;
  std::string text_;
  std::unique_ptr<AssetMerge> merge_;
  int status_ = AssetMerge::kFailed;
};

}  // namespace

bool PutAsset(const std::string& asset, std::string_view text) {
  if (IsPlain(asset) && PutFile("./" + asset, text)) return true;
  Complain("cannot write " + asset);
  return false;
}

Settlement Settle(const AssetVersions& versions, const SettleContext& context) {
  if (IsPlain(versions.asset)) return Settling(versions, context).Run();
  Complain(versions.asset + " lies behind a symbolic link, or is one or a folder, in the work tree");
  return {};
}

}  // namespace vexel_yaml
