#pragma once

#include <cstddef>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "git/asset_merge.h"
#include "git/prompt.h"
#include "git/record_entry.h"

namespace vexel_yaml {

/// The conflicts of one file, which are asked about one after the other. Each answer is merged at once: it
/// can settle other conflicts, or bring some up.
class Questions {
 public:
  /// Merges with these lines of decisions, before those of the record; if `is_blank` without any. Null where
  /// that has failed, which has been said.
  using Merge = std::function<AssetMerge*(const std::vector<std::string>& chosen, bool is_blank)>;

  /// What stands at the places `kept` is not asked about. Neither `prompt` nor `entry`, what is remembered of
  /// the file, is owned, nor are these.
  Questions(Prompt& prompt, const RecordEntry& entry, const std::map<std::string, std::string>& kept,
            Merge merge)
      : prompt_(prompt), entry_(entry), kept_(kept), merge_(std::move(merge)) {}

  /// Asks until nothing is left or the user has had enough: about what is open or, if `again`, about all.
  /// The last merge is then the one with the answers. False where a merge has failed.
  bool Ask(bool again);

  /// Whether there is any decision among the answers.
  bool HaveDecided() const { return !Chosen().empty(); }

 private:
  struct Question {
    NamedConflict conflict;
    std::string earlier;  ///< What had been chosen for it before, as a word of a record.
    std::string chosen;   ///< What has been now.
    bool is_open;
  };
  /// What an answer has changed, to take it back.
  struct Step {
    size_t at;
    std::vector<size_t> chosen;
  };

  bool Begin(bool again);
  /// The first one from there on that is to be asked about; nothing where none is left.
  std::optional<size_t> FindNext(size_t from) const;
  void TellHeading();
  Prompt::Reply AskAbout(size_t at);
  bool Take(size_t at, const std::string& side, bool is_for_thing);
  bool GoBack(size_t& at);
  void TakeBack(const Step& step);
  /// Whether to ask about it.
  static bool IsWanted(const Question& question);
  /// Those of the object of one of them that are to be asked about.
  std::vector<size_t> WantedOfThing(size_t at) const;
  bool MergeAnew(bool tells);
  void Update(AssetMerge& merge, bool tells);
  std::vector<std::string> Chosen() const;

  Prompt& prompt_;
  const RecordEntry& entry_;
  const std::map<std::string, std::string>& kept_;
  const Merge merge_;
  std::vector<Question> questions_;
  std::vector<Step> steps_;
};

}  // namespace vexel_yaml
