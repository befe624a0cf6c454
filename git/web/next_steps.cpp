#include "git/web/next_steps.h"

#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

NextStep InTerminal(const std::string& text, const std::string& purpose, const std::string& command) {
  return {text + "To " + purpose + ", paste this into the terminal that you came from, and press Enter:",
          command};
}

}  // namespace

NextStep AfterAll(const GitStep& step) {
  if (step.command.empty()) return {"Nothing is in conflict any more. Your next commit will have it."};
  return InTerminal(step.open.empty() ? "Nothing is in conflict any more. " : "", step.purpose, step.command);
}

NextStep AfterOne(const GitStep& step) {
  if (step.open.empty() || !step.command.empty()) return AfterAll(step);
  return {"Git opens the next file now."};
}

NextStep ToComeBack(const std::string& command, const std::vector<std::string>& files) {
  std::string call = command;
  for (const std::string& file : files) call += " " + Typeable(file);
  return InTerminal("", "settle it later", call);
}

}  // namespace vexel_yaml
