#pragma once

#include <functional>
#include <string>
#include <vector>

namespace vexel_yaml {

/// What somebody does outside of the page, for people who know no command by heart.
struct NextStep {
  std::string text;
  /// To be copied into a terminal; empty where none is needed.
  std::string command = {};
};

/// What whoever opens the page knows beyond its files. What is empty isn't said.
struct ViewGuide {
  /// How to go on. Called once everything is saved.
  std::function<NextStep()> when_saved = {};
  /// How to come back to what was given up.
  NextStep when_given_up = {};
  /// Files that the page can't show, each with what to do about it.
  std::vector<std::string> not_shown = {};
};

}  // namespace vexel_yaml
