#pragma once

#include <string>

#include "platform/run_program.h"

namespace vexel_yaml {

/// What a repository's configuration says about merges.
struct MergeSettings {
  std::string rules = "auto";
  std::string type_info;
  /// Whether scenes are merged as scenes, and not only value by value.
  bool is_safe = true;
  /// Whether decisions are remembered for the next time that the same conflict comes, and whether nothing is
  /// left to confirm then.
  bool remembers_decisions = false;
  bool stages_remembered = false;
  /// The folder whose hooks git calls in place of those of the repository; empty for none.
  std::string hooks_folder;
};

/// Reads them in one question to git, which is under way while the caller does something else.
class SettingsQuery {
 public:
  SettingsQuery();

  /// The answer; paths start from the current folder, which is the top one. Throws CommandError for a setting
  /// that can't be understood: that must not count as not set, since other rules make another merge.
  MergeSettings Get();

 private:
  Program question_;
};

}  // namespace vexel_yaml
