#include "view/settling.h"

#include <algorithm>
#include <iterator>
#include <stdexcept>

#include "merge/conflict_record_file.h"
#include "report/report_json.h"
#include "scene/object_links.h"
#include "scene/scene_versions.h"
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
    MakeExcerpt(whole_, FindEdited(*whole_.Copy()), files_.untouched);
    groups_.emplace(files_.untouched);
  } else {
    whole_.CopyTo(files_.untouched);
  }
  CompareVersions(files_, false);
  whole_.CopyTo(versions_);
  MergeAll();
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

bool Settling::Choose(std::vector<Choices::Change> changes) {
  const bool has_patterns = !resolutions_.empty();
  const auto is_possible = [&](const Choices::Change& change) {
    const bool is_place = places_.contains(change.path);
    if (change.choice) return is_place;
    // What nobody has chosen here is settled by a pattern, or follows from another choice.
    return choices_.Get().contains(change.path) || (is_place && has_patterns);
  };
  if (file_.is_review || changes.empty() || !std::ranges::all_of(changes, is_possible)) return false;
  for (Choices::Change& change : changes) {
    // A pattern would settle it again.
    if (!change.choice && has_patterns) change.choice = MergeResolve::kConflict;
  }
  choices_.Choose(changes);
  Merge(changes);
  return true;
}

void Settling::Undo() {
  if (choices_.CanUndo()) Merge(choices_.Undo());
}

void Settling::Redo() {
  if (choices_.CanRedo()) Merge(choices_.Redo());
}

// What was chosen on the page comes first: of several resolutions for a place the first one counts.
Resolutions Settling::AllResolutions() const {
  Resolutions all = choices_.GetResolutions();
  all.insert(all.end(), resolutions_.begin(), resolutions_.end());
  return all;
}

void Settling::Merge(const std::vector<Choices::Change>& changes) {
  ++revision_;
  std::set<const EditGroups::Group*> groups;
  for (const Choices::Change& change : changes) {
    groups.insert(groups_ ? groups_->Find(StringToPath(change.path).front()) : nullptr);
  }
  if (!files_.error.empty() || !MergeGroups(groups)) MergeAll();
}

void Settling::MergeAll() {
  if (file_.is_review) {
    files_.merged.reset(files_.read.left.Clone());
    files_.unrepaired.reset(files_.read.left.Clone());
  } else {
    MergeRead(files_, AllResolutions());
  }
  RenewNames();
  shown_.clear();
  objects_.clear();
  shown_names_.Clear();
  places_.clear();
  group_of_card_.clear();
  pending_ = 0;
  std::vector<ReportCard> cards = MakeCardsOf(files_);
  AddPlaces(cards);
  if (groups_ && !AreOfTheirGroups(cards, nullptr)) groups_.reset();
  shown_.push_back({std::move(cards)});
}

// Whether that is all there is to do. Else everything has to be merged.
bool Settling::MergeGroups(const std::set<const EditGroups::Group*>& groups) {
  // Above that the whole excerpt takes no longer.
  constexpr size_t kFewGroups = 8;
  std::unordered_set<const YAMLScalar*> renamed;
  const auto merge = [&](const EditGroups::Group* group) { return MergeGroup(*group, renamed); };
  const auto merge_all = [&](const std::set<const EditGroups::Group*>& some) {
    return !some.contains(nullptr) && some.size() <= kFewGroups && std::ranges::all_of(some, merge);
  };
  if (!merge_all(groups)) return false;
  if (renamed.empty()) return true;
  std::set<const EditGroups::Group*> showing;
  for (const YAMLScalar* file_id : shown_names_.Showing(names_->Latest(), renamed)) {
    showing.insert(groups_->Find(file_id));
  }
  // A single one has told the new names already.
  if (groups.size() == 1) showing.erase(*groups.begin());
  return merge_all(showing);
}

// Whether nothing outside of the group has to do with it. Adds the wholes that have other names or places
// now.
bool Settling::MergeGroup(const EditGroups::Group& group, std::unordered_set<const YAMLScalar*>& renamed) {
  std::unique_ptr<MergedFiles>& part = parts_[&group];
  if (part == nullptr) {
    part = std::make_unique<MergedFiles>();
    part->safe = true;
    MakeExcerpt(files_.untouched, group, part->untouched);
    CompareVersions(*part, false);
  }
  const auto is_elsewhere = [&](const YAMLScalar* file_id) { return groups_->Find(file_id) != &group; };
  Resolutions resolutions = AllResolutions();
  std::erase_if(resolutions, [&](const RecordingConflictResolver::RecordResolve& resolution) {
    return resolution.pattern.front() != YAMLScalar::star && is_elsewhere(resolution.pattern.front());
  });
  MergeRead(*part, std::move(resolutions));
  if (part->merged == nullptr) return false;
  FindRenamed(group, *part, renamed);
  TakeOver(group, *part);
  std::vector<ReportCard> cards = MakeCardsOf(*part);
  if (!AreOfTheirGroups(cards, &group)) return false;
  for (const YAMLScalar* file_id : group) ForgetPlaces(file_id);
  AddPlaces(cards);
  std::erase_if(files_.notes, [&](const SceneNote& note) { return !is_elsewhere(note.file_id); });
  std::ranges::copy_if(part->notes, std::back_inserter(files_.notes),
                       [&](const SceneNote& note) { return !is_elsewhere(note.file_id); });
  shown_.push_back({std::move(cards), &group});
  return true;
}

void Settling::FindRenamed(const EditGroups::Group& group, const MergedFiles& part,
                           std::unordered_set<const YAMLScalar*>& renamed) {
  const ObjectNames before({files_.merged.get()});
  const ObjectNames after({part.merged.get()});
  for (const YAMLScalar* file_id : group) {
    if (before.GetOwnName(file_id) != after.GetOwnName(file_id) ||
        FatherIn(*files_.merged, file_id) != FatherIn(*part.merged, file_id)) {
      renamed.insert(names_->Latest().GetWhole(file_id));
    }
  }
}

void Settling::TakeOver(const EditGroups::Group& group, const MergedFiles& part) {
  for (const YAMLScalar* file_id : group) {
    const YAMLNode* object = part.merged->Get(file_id);
    SetEntry(*files_.merged, file_id, object == nullptr ? nullptr : object->Clone());
  }
  RenewNames();
}

void Settling::RenewNames() {
  names_.emplace(
      VersionNames::Versions{&versions_.base, &versions_.left, &versions_.right, files_.merged.get()});
  names_->SetAssetNames(assets_);
}

std::vector<ReportCard> Settling::MakeCardsOf(const MergedFiles& files) {
  std::vector<ReportObject> objects = CollectReport(files, *names_, NamesInNotes(file_));
  if (FindAssets(objects)) objects = CollectReport(files, *names_, NamesInNotes(file_));
  ShowSettledByHand(objects);
  return MakeCards(std::move(objects), names_->Latest());
}

// Its record is still pending, since none of the sides counts there.
void Settling::ShowSettledByHand(std::vector<ReportObject>& objects) const {
  if (file_.settled_by_hand.empty()) return;
  for (ReportObject& object : objects) {
    for (ReportRow& row : object.rows) {
      const auto settled = file_.settled_by_hand.find(row.record_path);
      if (settled == file_.settled_by_hand.end()) continue;
      row.pending = false;
      row.state = "settled by hand";
      row.result = {ReportCell::Kind::kChanged, settled->second, {}};
    }
    object.pending = std::ranges::any_of(object.rows, &ReportRow::pending);
  }
}

// Whether each card stands for objects of one group alone, of `group` unless that is null.
bool Settling::AreOfTheirGroups(const std::vector<ReportCard>& cards, const EditGroups::Group* group) {
  return std::ranges::all_of(cards, [&](const ReportCard& card) {
    const EditGroups::Group* its_group = groups_->Find(card.objects.front().file_id);
    return its_group != nullptr && (group == nullptr || its_group == group) &&
           group_of_card_.emplace(card.file_id, its_group).first->second == its_group &&
           std::ranges::all_of(card.objects, [&](const ReportObject& object) {
             return groups_->Find(object.file_id) == its_group;
           });
  });
}

// Whether objects and values have other names now.
bool Settling::FindAssets(const std::vector<ReportObject>& objects) {
  if (file_.asset_search == nullptr) return false;
  std::set<std::string> guids;
  for (const ReportObject& object : objects) {
    guids.insert(names_->Latest().GetScriptGuid(object.file_id));
    for (const ReportRow& row : object.rows) {
      for (const ReportCell* cell : {&row.base, &row.left, &row.right, &row.result})
        CollectGuids(cell->node, guids);
    }
  }
  std::erase_if(guids,
                [&](const std::string& guid) { return guid.empty() || !looked_for_.insert(guid).second; });
  if (guids.empty()) return false;
  const size_t known = assets_.size();
  assets_.merge(file_.asset_search(guids));
  names_->SetAssetNames(assets_);
  return assets_.size() > known;
}

void Settling::AddPlaces(const std::vector<ReportCard>& cards) {
  for (const ReportCard& card : cards) {
    for (const ReportObject& object : card.objects) {
      shown_names_.Add(object);
      Places& places = objects_[object.file_id];
      for (const ReportRow& row : object.rows) {
        places.pending += row.pending ? 1 : 0;
        std::string path = ChoicePath(row);
        if (path.empty()) continue;
        ++places_[path];
        places.paths.push_back(std::move(path));
      }
      pending_ += places.pending;
    }
  }
}

void Settling::ForgetPlaces(const YAMLScalar* file_id) {
  shown_names_.Forget(file_id);
  const auto found = objects_.find(file_id);
  if (found == objects_.end()) return;
  pending_ -= found->second.pending;
  for (const std::string& path : found->second.paths) {
    if (--places_[path] == 0) places_.erase(path);
  }
  objects_.erase(found);
}

FinishedFile Settling::Finish() const {
  if (!files_.error.empty()) throw std::runtime_error("There is no result: " + files_.error);
  try {
    return FinishFile(whole_, file_.safe, AllResolutions());
  } catch (const YAMLError& error) {
    throw std::runtime_error(Explained(error));
  }
}

void Settling::Save() {
  if (file_.is_review) throw std::runtime_error("Two versions that are only compared have no result");
  if (pending_ > 0) {
    throw std::runtime_error(pending_ == 1 ? "1 conflict is not settled yet"
                                           : std::to_string(pending_) + " conflicts are not settled yet");
  }
  const FinishedFile finished = Finish();
  const auto is_by_hand = [&](const std::string& path) { return file_.settled_by_hand.contains(path); };
  if (!std::ranges::all_of(finished.pending, is_by_hand))
    throw std::runtime_error("The whole file has conflicts that its changed parts don't show");
  file_.store(finished.text, finished.record);
}

void Settling::Keep() { file_.keep(Finish().record); }

}  // namespace vexel_yaml
