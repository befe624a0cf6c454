#include "view/view_session.h"

#include <algorithm>
#include <charconv>
#include <iterator>
#include <nlohmann/json.hpp>
#include <set>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "report/named_note.h"
#include "report/object_counts.h"
#include "report/report_json.h"
#include "report/value_text.h"
#include "view/card_order.h"
#include "view/page_request.h"

namespace vexel_yaml {

namespace {

using Json = nlohmann::ordered_json;

std::string Dump(const Json& json) { return json.dump(-1, ' ', false, Json::error_handler_t::replace); }

// The cards are JSON text already, of which there may be megabytes.
std::string WithCards(const Json& head, std::string_view key, const std::vector<std::string_view>& cards) {
  std::string text = Dump(head);
  text.pop_back();
  text.append(",\"").append(key).append("\":[");
  for (size_t i = 0; i < cards.size(); ++i) text.append(i == 0 ? "" : ",").append(cards[i]);
  return text + "]}";
}

}  // namespace

std::string ErrorJson(std::string_view message) { return Dump({{"error", OnOneLine(message)}}); }

// One file, and what the page has been told of it.
class ViewSession::OpenFile {
 public:
  explicit OpenFile(const ViewFile& file) : settling_(file) { TakeCards(); }

  // Returns the keys of the cards that are new or other than before.
  std::vector<std::string> TakeCards() {
    std::set<const YAMLScalar*> changed;
    for (Settling::Shown& merged : settling_.TakeShown()) {
      order_.Arrange(merged.cards);
      std::unordered_map<const YAMLScalar*, Told> before = Forget(merged.group);
      for (ReportCard& card : merged.cards) {
        const YAMLScalar* key = card.file_id;
        const auto known = before.find(key);
        // Most cards are as they were, and making JSON of them would take as long as the merge.
        const bool is_same = known != before.end() && known->second.card == card;
        std::string text = is_same ? std::move(known->second.text) : CardJson(card, settling_.GetNames());
        if (!is_same) changed.insert(key);
        told_.insert_or_assign(key, Told{std::move(card), std::move(text)});
      }
    }
    keys_.clear();
    std::vector<std::string> changed_keys;
    for (const YAMLScalar* key : order_.GetKeys()) {
      if (!told_.contains(key)) continue;
      keys_.push_back(Cleaned(key->GetText()));
      if (changed.contains(key)) changed_keys.push_back(keys_.back());
      numbers_[keys_.back()] = key;
    }
    return changed_keys;
  }

  Settling& GetSettling() { return settling_; }
  bool HasUnsavedChoices() const {
    const bool has_any =
        kept_revision_ == 0 ? settling_.GetChoices().CanUndo() : kept_revision_ != settling_.GetRevision();
    return !is_saved_ && has_any;
  }
  ObjectCounts Count() const {
    ObjectCounts counts;
    for (const auto& [key, told] : told_) counts.Add(told.card);
    return counts;
  }
  const std::vector<std::string>& GetKeys() const { return keys_; }
  const std::string& GetText(const std::string& key) const { return told_.at(numbers_.at(key)).text; }
  bool IsSaved() const { return is_saved_; }
  void Save() {
    settling_.Save();
    is_saved_ = true;
  }
  void Keep() {
    settling_.Keep();
    kept_revision_ = settling_.GetRevision();
  }

 private:
  struct Told {
    ReportCard card;
    std::string text;
  };

  // Takes out the cards of a group, or all.
  std::unordered_map<const YAMLScalar*, Told> Forget(const EditGroups::Group* group) {
    if (group == nullptr) return std::exchange(told_, {});
    std::unordered_map<const YAMLScalar*, Told> forgotten;
    const std::unordered_set<const YAMLScalar*> gone(group->begin(), group->end());
    for (auto told = told_.begin(); told != told_.end();) {
      const auto next = std::next(told);
      // A card is of one group.
      if (gone.contains(told->second.card.objects.front().file_id)) forgotten.insert(told_.extract(told));
      told = next;
    }
    return forgotten;
  }

  Settling settling_;
  CardOrder order_;
  // What the page was told, by the cards' file IDs.
  std::unordered_map<const YAMLScalar*, Told> told_;
  // The cards' keys in their order, and which file IDs they stand for.
  std::vector<std::string> keys_;
  std::unordered_map<std::string, const YAMLScalar*> numbers_;
  bool is_saved_ = false;
  // 0 where nothing was kept.
  size_t kept_revision_ = 0;
};

namespace {

// With the file that people know in place of its versions, where these are temporary.
std::string InKnownWords(std::string text, const ViewFile& file) {
  const std::pair<std::string, std::string> versions[] = {
      {file.base_path, "before"}, {file.left_path, "theirs"}, {file.right_path, "ours"}};
  for (const auto& [path, side] : versions) {
    if (!file.has_temporary_paths || path.empty()) continue;
    const std::string known = file.title + (file.is_review ? "" : " (" + side + ")");
    for (size_t at = 0; (at = text.find(path, at)) != std::string::npos; at += known.size())
      text.replace(at, path.size(), known);
  }
  return OnOneLine(text);
}

Json JsonOf(const NextStep& step) {
  return {{"text", OnOneLine(step.text)}, {"command", OnOneLine(step.command)}};
}

Json NamesOf(const ViewFile& file) {
  const auto base = OnOneLine(file.base_name);
  const auto theirs = OnOneLine(file.theirs_name);
  if (file.is_review) return {{"base", base}, {"result", theirs}};
  return {{"base", base}, {"theirs", theirs}, {"ours", OnOneLine(file.ours_name)}};
}

Json HeadOf(const ViewFile& file) {
  return {{"version", kReportJsonVersion},
          {"mode", file.is_review ? "review" : "merge"},
          {"title", OnOneLine(file.title)},
          {"names", NamesOf(file)}};
}

Json StandOf(const ViewFile& file, Settling& settling) {
  Json notes = Json::array();
  if (!file.note.empty()) notes.push_back(OnOneLine(file.note));
  for (const SceneNote& note : settling.GetNotes())
    notes.push_back(NamedNote(note.text, settling.GetNames().Latest()));
  return {{"revision", settling.GetRevision()},
          {"pending", settling.CountPending()},
          {"conflicts", settling.CountConflicts()},
          {"can_undo", settling.GetChoices().CanUndo()},
          {"can_redo", settling.GetChoices().CanRedo()},
          {"error", InKnownWords(settling.GetError(), file)},
          {"notes", std::move(notes)}};
}

// Of a file that can't be read.
Json NothingFor(const std::string& error) {
  return {{"revision", 0},     {"pending", 0},   {"conflicts", 0},        {"can_undo", false},
          {"can_redo", false}, {"error", error}, {"notes", Json::array()}};
}

}  // namespace

ViewSession::ViewSession(std::vector<ViewFile> files, ViewGuide guide)
    : files_(std::move(files)), guide_(std::move(guide)), open_(files_.size()), errors_(files_.size()) {
  Open(FirstToSettle() % files_.size());
}

ViewSession::~ViewSession() = default;

ViewSession::OpenFile* ViewSession::TryToOpen(size_t file) {
  if (file >= files_.size()) throw RequestError(404, "There is no such file");
  if (open_[file] != nullptr || !errors_[file].empty()) return open_[file].get();
  try {
    open_[file] = std::make_unique<OpenFile>(files_[file]);
  } catch (const std::bad_alloc&) {
    throw;
  } catch (const YAMLError& error) {
    errors_[file] = InKnownWords(Explained(error), files_[file]);
  } catch (const std::exception& error) {
    errors_[file] = InKnownWords(Explained(error), files_[file]);
  }
  return open_[file].get();
}

ViewSession::OpenFile& ViewSession::Open(size_t file) {
  OpenFile* open = TryToOpen(file);
  if (open == nullptr) throw RequestError(409, OnOneLine(files_[file].title) + ": " + errors_[file]);
  return *open;
}

size_t ViewSession::FirstToSettle(size_t from) {
  for (size_t i = 0; i < files_.size(); ++i) {
    const size_t file = (from + i) % files_.size();
    const OpenFile* open = TryToOpen(file);
    if (open != nullptr && !open->IsSaved()) return file;
  }
  return files_.size();
}

std::vector<std::string> ViewSession::GetUnread() const {
  std::vector<std::string> unread;
  for (size_t i = 0; i < files_.size(); ++i) {
    if (!errors_[i].empty()) unread.push_back(OnOneLine(files_[i].title) + ": " + errors_[i]);
  }
  return unread;
}

bool ViewSession::IsFinished() const {
  return std::ranges::all_of(open_, [](const auto& open) { return open != nullptr && open->IsSaved(); });
}

bool ViewSession::HasUnsavedChoices() const {
  return std::ranges::any_of(open_,
                             [](const auto& open) { return open != nullptr && open->HasUnsavedChoices(); });
}

Json ViewSession::Head(size_t file) {
  OpenFile* shown = TryToOpen(file);
  Json head = HeadOf(files_[file]);
  head.update(shown == nullptr ? NothingFor(errors_[file]) : StandOf(files_[file], shown->GetSettling()));
  Json files = Json::array();
  for (size_t i = 0; i < files_.size(); ++i) files.push_back(Entry(i));
  head["files"] = std::move(files);
  head["file"] = file;
  head["not_shown"] = Json::array();
  for (const std::string& other : guide_.not_shown) head["not_shown"].push_back(OnOneLine(other));
  return head;
}

Json ViewSession::Entry(size_t file) const {
  OpenFile* open = open_[file].get();
  const std::optional<size_t>& known = files_[file].known_pending;
  Json entry = {{"title", OnOneLine(files_[file].title)},
                {"pending", known ? Json(*known) : Json()},
                {"saved", open != nullptr && open->IsSaved()},
                {"error", errors_[file]},
                {"unsaved", open != nullptr && open->HasUnsavedChoices()},
                {"can_keep", files_[file].keep != nullptr}};
  if (open == nullptr) return entry;
  entry["pending"] = open->GetSettling().CountPending();
  const ObjectCounts counts = open->Count();
  entry["objects"] = {{"added", counts.added}, {"changed", counts.changed}, {"removed", counts.removed}};
  return entry;
}

size_t ViewSession::NumberOf(std::string_view file) {
  if (file.empty()) return FirstToSettle() % files_.size();
  size_t number = 0;
  const char* const end = file.data() + file.size();
  const auto [rest, error] = std::from_chars(file.data(), end, number);
  if (error != std::errc() || rest != end) throw RequestError(400, "file is no number");
  return number;
}

std::string ViewSession::Summary(std::string_view file) {
  const size_t number = NumberOf(file);
  TryToOpen(number);
  return Dump(Entry(number));
}

std::string ViewSession::State(std::string_view file) {
  const size_t number = NumberOf(file);
  const OpenFile* open = TryToOpen(number);
  std::vector<std::string_view> cards;
  if (open != nullptr) {
    for (const std::string& key : open->GetKeys()) cards.push_back(open->GetText(key));
  }
  return WithCards(Head(number), "cards", cards);
}

ViewSession::OpenFile& ViewSession::OpenToChange(const Json& request) {
  const size_t file = NumberAt(request, "file");
  const size_t revision = NumberAt(request, "revision");
  if (is_over_) throw RequestError(409, "It was given up, or saved");
  OpenFile& open = Open(file);
  if (files_[file].is_review)
    throw RequestError(409, "Two versions are compared: there is nothing to choose");
  if (open.IsSaved()) throw RequestError(409, "The file is saved already");
  if (revision != open.GetSettling().GetRevision())
    throw RequestError(409, "Another window has changed something meanwhile: look at it again");
  return open;
}

template <typename Step>
std::string ViewSession::Change(const Json& request, Step step) {
  OpenFile& open = OpenToChange(request);
  const std::vector<std::string> before = open.GetKeys();
  step(open.GetSettling());
  const std::vector<std::string> changed = open.TakeCards();
  Json head = Head(NumberAt(request, "file"));
  Json gone = Json::array();
  const std::unordered_set<std::string> there(open.GetKeys().begin(), open.GetKeys().end());
  for (const std::string& key : before) {
    if (!there.contains(key)) gone.push_back(key);
  }
  head["gone"] = std::move(gone);
  if (open.GetKeys() != before) head["order"] = open.GetKeys();
  std::vector<std::string_view> cards;
  for (const std::string& key : changed) cards.push_back(open.GetText(key));
  return WithCards(head, "changed", cards);
}

std::string ViewSession::Choose(std::string_view body) {
  const Json request = ParseRequest(body);
  const std::vector<Choices::Change> changes = ChangesIn(request);
  return Change(request, [&](Settling& settling) {
    if (!settling.Choose(changes))
      throw RequestError(400, "One of these places is no conflict, or is settled by another choice");
  });
}

std::string ViewSession::Undo(std::string_view body) {
  return Change(ParseRequest(body), [](Settling& settling) { settling.Undo(); });
}

std::string ViewSession::Redo(std::string_view body) {
  return Change(ParseRequest(body), [](Settling& settling) { settling.Redo(); });
}

std::string ViewSession::Keep(std::string_view body) {
  const Json request = ParseRequest(body);
  OpenFile& open = OpenToChange(request);
  const size_t file = NumberAt(request, "file");
  if (files_[file].keep == nullptr) throw RequestError(409, "Nothing is written before all is settled");
  OrRefuse([&] { open.Keep(); });
  return Dump(Head(file));
}

std::vector<std::string> ViewSession::KeepUnsaved() {
  std::vector<std::string> errors;
  for (size_t i = 0; i < files_.size(); ++i) {
    if (files_[i].keep == nullptr || open_[i] == nullptr || !open_[i]->HasUnsavedChoices()) continue;
    try {
      open_[i]->Keep();
    } catch (const std::runtime_error& error) {
      errors.push_back(OnOneLine(files_[i].title) + ": " + OnOneLine(error.what()));
    }
  }
  return errors;
}

std::string ViewSession::GiveUp(std::string_view body) {
  if (is_over_) throw RequestError(409, "It was given up, or saved");
  if (ParseRequest(body).value("keep", false)) {
    const std::vector<std::string> errors = KeepUnsaved();
    if (!errors.empty()) throw RequestError(409, errors.front());
  }
  is_over_ = true;
  Json left = Json::array();
  for (size_t i = 0; i < files_.size(); ++i) {
    if (!files_[i].is_review && !(open_[i] != nullptr && open_[i]->IsSaved()))
      left.push_back(OnOneLine(files_[i].title));
  }
  return Dump({{"left", std::move(left)}, {"next_step", JsonOf(guide_.when_given_up)}});
}

std::string ViewSession::Save(std::string_view body) {
  const Json request = ParseRequest(body);
  OpenFile& open = OpenToChange(request);
  OrRefuse([&] { open.Save(); });
  const size_t next = FirstToSettle(NumberAt(request, "file"));
  is_over_ = next == files_.size();
  Json answer = {{"saved", true}, {"next", is_over_ ? Json() : Json(next)}, {"unread", GetUnread()}};
  try {
    if (is_over_ && guide_.when_saved) answer["next_step"] = JsonOf(guide_.when_saved());
  } catch (const std::runtime_error&) {
    // What is saved is saved, also where nobody knows how to go on.
  }
  return Dump(answer);
}

}  // namespace vexel_yaml
