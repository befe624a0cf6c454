#include "git/questions.h"

#include <algorithm>
#include <map>

namespace vexel_yaml {

namespace {

std::string WordOf(Prompt::Answer answer) {
  return answer == Prompt::Answer::kTheirs ? "left" : answer == Prompt::Answer::kOurs ? "right" : "base";
}

std::string InWordsOfPeople(const std::string& word) {
  return word == "left" ? "theirs" : word == "right" ? "ours" : word;
}

}  // namespace

bool Questions::Ask(bool again) {
  if (!Begin(again)) return false;
  for (std::optional<size_t> next = FindNext(0); next; next = FindNext(*next)) {
    const Prompt::Reply reply = AskAbout(*next);
    switch (reply.answer) {
      case Prompt::Answer::kQuit:
        return true;
      case Prompt::Answer::kBack:
        if (!GoBack(*next)) return false;
        break;
      case Prompt::Answer::kSkip:
        steps_.push_back({*next, {}});
        break;
      default:
        if (!Take(*next, WordOf(reply.answer), reply.is_for_thing)) return false;
    }
  }
  return true;
}

// From the beginning again behind the last one: an answer can open an earlier question once more.
std::optional<size_t> Questions::FindNext(size_t from) const {
  const auto is_skipped = [&](size_t at) {
    return std::ranges::any_of(steps_, [&](const Step& s) { return s.at == at && s.chosen.empty(); });
  };
  for (size_t i = 0; i < questions_.size(); ++i) {
    const size_t at = (from + i) % questions_.size();
    if (IsWanted(questions_[at]) && !is_skipped(at)) return at;
  }
  return std::nullopt;
}

bool Questions::Begin(bool again) {
  if (again) {
    AssetMerge* blank = merge_({}, true);
    if (blank == nullptr) return false;
    for (const NamedConflict& conflict : blank->GetConflicts()) {
      if (!kept_.contains(conflict.place)) questions_.push_back({conflict, {}, {}, false});
    }
  }
  AssetMerge* merge = merge_({}, false);
  if (merge == nullptr) return false;
  const std::map<std::string, std::string> choices = merge->GetChoices();
  for (Question& question : questions_) {
    const auto choice = choices.find(question.conflict.place);
    if (choice != choices.end()) question.earlier = choice->second;
  }
  Update(*merge, false);
  if (!questions_.empty()) TellHeading();
  return true;
}

void Questions::TellHeading() {
  std::string text = entry_.asset + ": " +
                     CountOfConflicts(static_cast<size_t>(std::ranges::count_if(questions_, IsWanted)));
  if (!entry_.names.theirs.empty()) text += "; theirs is " + entry_.names.theirs;
  if (!entry_.names.ours.empty()) text += "; ours is " + entry_.names.ours;
  prompt_.Tell(text);
}

Prompt::Reply Questions::AskAbout(size_t at) {
  const Question& question = questions_[at];
  return prompt_.Ask({question.conflict, std::to_string(at + 1) + "/" + std::to_string(questions_.size()),
                      InWordsOfPeople(question.earlier), WantedOfThing(at).size() > 1, !steps_.empty()});
}

// A choice that the merge fails with is none.
bool Questions::Take(size_t at, const std::string& side, bool is_for_thing) {
  steps_.push_back({at, is_for_thing ? WantedOfThing(at) : std::vector<size_t>{at}});
  for (const size_t index : steps_.back().chosen) questions_[index].chosen = side;
  if (MergeAnew(true)) return true;
  TakeBack(steps_.back());
  steps_.pop_back();
  return MergeAnew(false);
}

bool Questions::GoBack(size_t& at) {
  const Step step = steps_.back();
  steps_.pop_back();
  at = step.at;
  if (step.chosen.empty()) return true;
  TakeBack(step);
  return MergeAnew(false);
}

void Questions::TakeBack(const Step& step) {
  for (const size_t index : step.chosen) questions_[index].chosen.clear();
}

bool Questions::IsWanted(const Question& question) {
  return question.chosen.empty() && (question.is_open || !question.earlier.empty());
}

std::vector<size_t> Questions::WantedOfThing(size_t at) const {
  std::vector<size_t> wanted;
  for (size_t i = 0; i < questions_.size(); ++i) {
    if (IsWanted(questions_[i]) && questions_[i].conflict.thing == questions_[at].conflict.thing) {
      wanted.push_back(i);
    }
  }
  return wanted;
}

bool Questions::MergeAnew(bool tells) {
  AssetMerge* merge = merge_(Chosen(), false);
  if (merge != nullptr) Update(*merge, tells);
  return merge != nullptr;
}

void Questions::Update(AssetMerge& merge, bool tells) {
  std::map<std::string, const NamedConflict*> open;
  for (const NamedConflict& conflict : merge.GetConflicts()) open.emplace(conflict.place, &conflict);
  const auto tell = [&](const std::string& what, const Question& question) {
    if (tells) prompt_.Tell("  " + what + question.conflict.name);
  };
  for (Question& question : questions_) {
    const bool was_open = question.is_open;
    question.is_open = open.erase(question.conflict.place) > 0;
    if (!question.chosen.empty() && question.is_open) {
      // What can't be carried out together with another choice is asked about once more.
      tell("not settled by that: ", question);
      question.chosen.clear();
    } else if (question.chosen.empty() && was_open != question.is_open) {
      tell(was_open ? "settled with it: " : "open now: ", question);
    }
  }
  for (const NamedConflict& conflict : merge.GetConflicts()) {
    if (!open.contains(conflict.place) || kept_.contains(conflict.place)) continue;
    questions_.push_back({conflict, {}, {}, true});
    tell("open now: ", questions_.back());
  }
}

std::vector<std::string> Questions::Chosen() const {
  std::vector<std::string> lines;
  for (const Question& question : questions_) {
    if (!question.chosen.empty()) lines.push_back(question.chosen + " " + question.conflict.place);
  }
  return lines;
}

}  // namespace vexel_yaml
