#include "git/asset_merge.h"

#include <algorithm>
#include <exception>
#include <iostream>
#include <new>
#include <set>
#include <sstream>

#include "fixups/post_process.h"
#include "git/asset_names.h"
#include "git/captured_errors.h"
#include "git/shown_text.h"
#include "git/undecided_places.h"
#include "git/work_files.h"
#include "merge/conflict_record_file.h"
#include "platform/file_error.h"
#include "platform/progress.h"
#include "platform/thread.h"
#include "report/merged_files.h"
#include "report/record_patterns.h"
#include "report/value_text.h"
#include "rules/setup.h"
#include "scene/safe_merge.h"
#include "scene/unmatched_choices.h"
#include "yaml/write_objects.h"

namespace vexel_yaml {

namespace {

// A mistake in what the user has decided, which says its line.
class DecisionError : public std::runtime_error {
  using std::runtime_error::runtime_error;
};

// The objects that a diff is about, as people call them; a game object is one with its components.
std::vector<std::string> EditedObjects(const YAMLMappingDiff& diff, ObjectNames& names) {
  std::vector<std::string> objects;
  std::set<std::string> known;
  for (const YAMLMappingDiff::Entry& entry : diff.GetEntries()) {
    std::string name = names.GetPath(entry.key);
    if (name.empty()) name = names.GetClass(entry.key) + " " + entry.key->GetText();
    if (known.insert(name).second) objects.push_back(std::move(name));
  }
  return objects;
}

// Whether an element of a list is on the path, or something that is called like one.
bool HasElement(const FieldPath& path) {
  return path.size() > 2 && std::any_of(path.begin() + 2, path.end(), [](const YAMLScalar* component) {
           const std::string& text = component->GetText();
           const size_t digits = text.starts_with('+') ? 1 : 0;
           return text.size() > digits && text.find_first_not_of("0123456789", digits) == std::string::npos;
         });
}

bool IsListEdit(const Operation* edit) {
  return edit != nullptr && edit->GetKind() == Operation::Kind::kChangeSequence;
}

void Replace(std::string& text, const std::string& name, const std::string& by) {
  for (size_t at = 0; (at = text.find(name, at)) != std::string::npos; at += by.size()) {
    text.replace(at, name.size(), by);
  }
}

}  // namespace

void LoadRulesAndTypes(const MergeSettings& settings) {
  static const std::exception_ptr failure = [&]() -> std::exception_ptr {
    try {
      TimerStat silent("", nullptr);
      SetupRulesAndTypes(settings.rules, settings.type_info, silent);
      return nullptr;
    } catch (...) {
      return std::current_exception();
    }
  }();
  if (failure) std::rethrow_exception(failure);
}

void SayMessages(std::string messages, const AssetVersions& versions) {
  if (messages.empty()) return;
  if (messages.ends_with('\n')) messages.pop_back();
  const std::string asset = "'" + Shown(versions.asset) + "'";
  for (const auto& [side, name] :
       {std::pair("the left file", "theirs"), std::pair("the right file", "ours")}) {
    Replace(messages, std::string(side) + " '", "the file '");
    Replace(messages, side, name);
  }
  Replace(messages, "'" + versions.base + "'", asset);
  Replace(messages, "'" + versions.left + "'", asset + " (theirs)");
  Replace(messages, "'" + versions.right + "'", asset + " (ours)");
  std::cerr << messages << '\n' << std::flush;
}

bool AssetVersions::HasAsset() const { return IsAsset(right) || IsAsset(left) || IsAsset(base); }

void AssetMerge::Read(bool is_safe) {
  is_read_safe_ = is_safe;
  read_failure_ = nullptr;
  documents_ = std::make_unique<SceneDocuments>();
  Progress::Step("reading");
  const std::string &base = versions_.base, &left = versions_.left, &right = versions_.right;
  const CapturedErrors captured;
  try {
    TimerStat silent("", nullptr);
    threads_ = AreWorthThreads({base, left, right});
    if (is_safe) {
      ReadScenes(base, left, right, *documents_, threads_, silent);
    } else {
      ReadMergeDocuments(base, left, right, *documents_, threads_, silent);
      PrepareForDiff(documents_->base, documents_->left, documents_->right);
    }
  } catch (...) {
    read_failure_ = std::current_exception();
  }
  messages_ = captured.Text();
}

int AssetMerge::Merge(const MergeSettings& settings, const Decisions* decisions) {
  // What is wrong with these is told first.
  LoadRulesAndTypes(settings);
  if (read_failure_) std::rethrow_exception(read_failure_);
  Progress::Step("merging");
  const auto& [base, left, right] = static_cast<const MergeDocuments&>(*documents_);
  if (!settings.is_safe || lists_edits_) {
    TimerStat silent("", nullptr);
    diffs_ = CreateDiffPair({base, left}, {base, right}, threads_, silent);
  }
  if (lists_edits_) {
    ObjectNames names({&right, &left, &base});
    edits_ = {EditedObjects(*diffs_.left, names), EditedObjects(*diffs_.right, names)};
  }
  if (decisions != nullptr) TakeDecisions(*decisions);
  const bool breaks_dependency = settings.is_safe ? MergeScenes() : MergeValues();
  if (!versions_.mark.empty()) RemoveMarks(*merged_, versions_.mark);
  Progress::Step("writing");
  std::ostringstream text;
  WriteObjects(*merged_, text, threads_);
  text_ = std::move(text).str();
  if (!resolver_.HasPendingConflicts()) return kMerged;
  return breaks_dependency ? kBrokenDependencies : kConflicts;
}

void AssetMerge::TakeDecisions(const Decisions& decisions) {
  std::istringstream stream(decisions.text);
  try {
    InputConflictRecords(stream, resolver_);
  } catch (const YAMLError& error) {
    std::string mistake = OnOneLine(error.what());
    Replace(mistake, "(left,right,base)", "(theirs, ours or base)");
    Replace(mistake, "should be left,right or base", "should be theirs, ours or base");
    throw DecisionError(Shown(decisions.record) + ": " + mistake);
  }
}

bool AssetMerge::MergeScenes() {
  TimerStat silent("", nullptr);
  SafeMergeResult result = SafeMerge(*documents_, resolver_, {.threads = threads_}, silent);
  for (const auto& [file_id, note] : result.notes) {
    // That nothing hangs on what is undecided is no news.
    if (versions_.mark.empty() || note.find(versions_.mark) == std::string::npos) std::cerr << note << '\n';
  }
  merged_ = std::move(result.merged);
  return result.breaks_dependency;
}

bool AssetMerge::MergeValues() {
  TimerStat silent("", nullptr);
  merged_ = MergeIntoCopy(documents_->base, diffs_, resolver_, silent);
  return PostProcess(*merged_, documents_->left, documents_->right, resolver_);
}

int AssetMerge::Run(const MergeSettings& settings, const Decisions* decisions) {
  const int status = RunQuietly(settings, decisions);
  SayMessages();
  return status;
}

int AssetMerge::RunQuietly(const MergeSettings& settings, const Decisions* decisions) {
  if (IsEmpty(versions_.base)) {
    messages_ =
        "error: both sides have added " + Shown(versions_.asset) + ", so there is no base to merge it with";
    return kFailed;
  }
  if (is_read_safe_ != settings.is_safe) Read(settings.is_safe);
  const std::string prefix = "Cannot merge file '" + versions_.base + "': ";
  std::string failure;
  int status = kFailed;
  {
    const CapturedErrors captured;
    try {
      status = Merge(settings, decisions);
    } catch (const std::bad_alloc&) {
      throw;
    } catch (const DecisionError& error) {
      failure = std::string("error: ") + error.what() + "; correct that line, or take it out";
    } catch (const FileError& error) {
      failure = OnOneLine(error.what());
    } catch (const YAMLError& error) {
      failure = OnOneLine(prefix + Explained(error));
    } catch (const std::exception& error) {
      failure = OnOneLine(prefix + Explained(error));
    }
    messages_ += captured.Text();
  }
  messages_ += failure;
  return status;
}

void AssetMerge::SayMessages() const { vexel_yaml::SayMessages(messages_, versions_); }

const std::vector<NamedConflict>& AssetMerge::GetConflicts() {
  if (conflicts_) return *conflicts_;
  // A safe merge changes what it has read, and the elements of a list are known by what was there before.
  SceneDocuments unchanged;
  const auto is_about_list = [](const auto& record) {
    return HasElement(record.path) || IsListEdit(record.left) || IsListEdit(record.right);
  };
  const bool has_elements = std::ranges::any_of(resolver_.GetRecords(), is_about_list);
  if (has_elements) {
    const CapturedErrors said_before;
    TimerStat silent("", nullptr);
    ReadScenes(versions_.base, versions_.left, versions_.right, unchanged, threads_, silent);
  }
  const SceneDocuments& shown = has_elements ? unchanged : *documents_;
  conflicts_ = NameConflicts(resolver_, {shown.base, shown.left, shown.right, is_read_safe_.value_or(false)},
                             FindAssetNames);
  if (!versions_.mark.empty()) std::ranges::for_each(*conflicts_, [&](auto& c) { NameUndecided(c); });
  return *conflicts_;
}

void AssetMerge::NameUndecided(NamedConflict& conflict) const {
  const std::string& mark = versions_.mark;
  const bool has_marked_father = conflict.was.starts_with("below ") && conflict.was.ends_with(mark);
  if (conflict.was.starts_with("nothing") || has_marked_father) conflict.was = "undecided";
  Replace(conflict.was, mark, " (undecided)");
  for (std::string* side : {&conflict.theirs, &conflict.ours}) {
    Replace(*side, "edits " + mark + " of", "keeps");
    Replace(*side, "edits " + mark, "keeps it");
    Replace(*side, ", " + mark, "");
  }
}

std::map<std::string, std::string> AssetMerge::GetChoices() const {
  const RecordPatterns patterns(resolver_);
  std::map<std::string, std::string> choices;
  for (const RecordingConflictResolver::Record& record : resolver_.GetRecords()) {
    const char* word = record.resolution == MergeResolve::kLeft    ? "left"
                       : record.resolution == MergeResolve::kRight ? "right"
                       : record.resolution == MergeResolve::kBase  ? "base"
                                                                   : nullptr;
    if (word != nullptr) choices.emplace(patterns.For(record), word);
  }
  return choices;
}

std::set<std::string> AssetMerge::FindBaseless() const {
  const RecordPatterns patterns(resolver_);
  std::set<std::string> places;
  for (const RecordingConflictResolver::Record& record : resolver_.GetRecords()) {
    const bool is_baseless =
        record.type == ConflictType::kBothAdd && record.resolution == MergeResolve::kBase;
    if (is_baseless && is_read_safe_.value_or(false)) places.insert(patterns.For(record));
  }
  return places;
}

std::vector<std::string> AssetMerge::DropUnknownChoices(const std::set<std::string>& known) {
  const std::vector<FieldPath> unmatched = resolver_.FindUnmatchedPatterns();
  std::vector<RecordingConflictResolver::RecordResolve> kept, unknown;
  for (const auto& choice : resolver_.GetResolutions()) {
    const bool is_unknown =
        std::ranges::count(unmatched, choice.pattern) > 0 && !known.contains(PathToString(choice.pattern));
    (is_unknown ? unknown : kept).push_back(choice);
  }
  if (unknown.empty()) return {};
  resolver_.SetResolveMethodForPaths(std::move(unknown));
  std::vector<std::string> lines = DescribeUnmatchedChoices(resolver_, *merged_);
  resolver_.SetResolveMethodForPaths(std::move(kept));
  return lines;
}

std::string AssetMerge::GetRecord() const {
  RecordingConflictResolver shown = resolver_;
  // Those for several places, of which the first one counts here, stand before those for a single one.
  std::vector<RecordingConflictResolver::RecordResolve> choices = shown.GetResolutions();
  const auto single = std::stable_partition(choices.begin(), choices.end(), [](const auto& choice) {
    return std::ranges::count(choice.pattern, YAMLScalar::star) > 0;
  });
  std::reverse(choices.begin(), single);
  shown.SetResolveMethodForPaths(std::move(choices));
  std::ostringstream out;
  OutputConflictRecords(out, shown, false);
  return std::move(out).str();
}

std::string CountOfConflicts(size_t number) {
  return number == 1 ? "1 conflict" : std::to_string(number) + " conflicts";
}

}  // namespace vexel_yaml
