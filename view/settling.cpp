#include "view/settling.h"

#include <algorithm>
#include <stdexcept>

#include "merge/conflict_record_file.h"
#include "report/report_json.h"
#include "view/finished_file.h"
#include "view/scene_excerpt.h"

namespace vexel_yaml {

namespace {

using Resolutions = std::vector<RecordingConflictResolver::RecordResolve>;

SideWords NamesInNotes(const ViewFile& file) {
  return {file.theirs_name.empty() ? "Their side" : file.theirs_name,
          file.ours_name.empty() ? "Our side" : file.ours_name};
}

}  // namespace

Settling::Settling(const ViewFile& file) : file_(file) {
  ReportConfig config;
  config.base_path = file.base_path;
  config.left_path = file.left_path;
  // Against itself a version has no changes.
  config.right_path = file.is_review ? file.base_path : file.right_path;
  config.safe = file.safe || file.is_review;
  ReadVersions(config, whole_);
  files_.safe = config.safe;
  if (file.safe && !file.is_review) {
    MakeExcerpt(whole_, files_.untouched);
  } else {
    whole_.CopyTo(files_.untouched);
  }
  CompareVersions(files_, false);
  whole_.CopyTo(shown_);
  Merge();
  TakeOverResolutions();
}

// A choice from before that is about one place alone can be taken back like one of the page.
void Settling::TakeOverResolutions() {
  for (auto given = resolutions_.begin(); given != resolutions_.end();) {
    const std::string path = PathToString(given->pattern);
    if (std::ranges::find(given->pattern, YAMLScalar::star) != given->pattern.end()) return;
    if (!places_.contains(path)) {
      ++given;
      continue;
    }
    choices_.Begin(path, given->resolution);
    given = resolutions_.erase(given);
  }
}

bool Settling::Choose(const std::vector<Choices::Change>& changes) {
  const auto is_possible = [&](const Choices::Change& change) {
    return places_.contains(change.path) || (!change.choice && choices_.Get().contains(change.path));
  };
  if (file_.is_review || changes.empty() || !std::ranges::all_of(changes, is_possible)) return false;
  choices_.Choose(changes);
  Merge();
  return true;
}

void Settling::Undo() {
  if (!choices_.CanUndo()) return;
  choices_.Undo();
  Merge();
}

void Settling::Redo() {
  if (!choices_.CanRedo()) return;
  choices_.Redo();
  Merge();
}

// What was chosen on the page comes first: of several resolutions for a place the first one counts.
Resolutions Settling::AllResolutions() const {
  Resolutions all = choices_.GetResolutions();
  all.insert(all.end(), resolutions_.begin(), resolutions_.end());
  return all;
}

void Settling::Merge() {
  ++revision_;
  names_.reset();
  if (file_.is_review) {
    files_.merged.reset(files_.read.left.Clone());
    files_.unrepaired.reset(files_.read.left.Clone());
  } else {
    MergeRead(files_, AllResolutions());
  }
  std::vector<const VexelObjects*> versions = {&shown_.right, &shown_.left, &shown_.base};
  if (files_.merged != nullptr) versions.insert(versions.begin(), files_.merged.get());
  names_.emplace(std::move(versions));
  std::vector<ReportObject> objects = CollectReport(files_, *names_, NamesInNotes(file_));
  FindScripts(objects);
  for (ReportObject& object : objects) object.class_name = names_->GetClass(object.file_id);
  CountConflicts(objects);
  cards_ = MakeCards(std::move(objects), *names_);
}

void Settling::FindScripts(const std::vector<ReportObject>& objects) {
  if (file_.script_search == nullptr) return;
  std::set<std::string> unknown;
  for (const ReportObject& object : objects) {
    const std::string guid = names_->GetScriptGuid(object.file_id);
    if (!guid.empty() && looked_for_.insert(guid).second) unknown.insert(guid);
  }
  if (!unknown.empty()) scripts_.merge(file_.script_search(unknown));
  names_->SetScriptClasses(scripts_);
}

void Settling::CountConflicts(const std::vector<ReportObject>& objects) {
  pending_ = 0;
  places_.clear();
  for (const ReportObject& object : objects) {
    for (const ReportRow& row : object.rows) {
      pending_ += row.pending ? 1 : 0;
      std::string path = ChoicePath(row);
      if (!path.empty()) places_.insert(std::move(path));
    }
  }
}

void Settling::Save() {
  if (file_.is_review) throw std::runtime_error("Two versions that are only compared have no result");
  if (!files_.error.empty()) throw std::runtime_error("There is no result: " + files_.error);
  if (pending_ > 0) {
    throw std::runtime_error(pending_ == 1 ? "1 conflict is not settled yet"
                                           : std::to_string(pending_) + " conflicts are not settled yet");
  }
  try {
    const FinishedFile finished = FinishFile(whole_, file_.safe, AllResolutions());
    if (finished.has_pending)
      throw std::runtime_error("The whole file has conflicts that its changed parts don't show");
    file_.store(finished.text, finished.record);
  } catch (const YAMLError& error) {
    throw std::runtime_error(Explained(error));
  }
}

}  // namespace vexel_yaml
