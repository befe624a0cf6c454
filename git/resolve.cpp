#include "git/resolve.h"

#include <optional>

#include "git/git_call.h"
#include "git/next_step.h"
#include "git/nothing_open.h"
#include "git/page_call.h"
#include "git/repository.h"
#include "git/resolve_arguments.h"
#include "git/resolving.h"
#include "git/shown_text.h"
#include "platform/file_error.h"

namespace vexel_yaml {

namespace {

// How somebody wants to settle who hasn't said it. An editor is no place to begin.
void AskForWay(ResolveArguments& arguments, Prompt& prompt) {
  const char way =
      CanShowPage()
          ? prompt.AskLetter(
                "Settle on a page in the browser (w), here, conflict by conflict (p), or in the "
                "editor (e) [w,p,e,q]? ",
                "wpeq")
          : prompt.AskLetter("Settle here, conflict by conflict (p), or in the editor (e) [p,e,q]? ", "peq");
  if (way == 'q') throw CommandError("nothing is settled; to go on later: vexel-merge-git resolve");
  arguments.asks = way == 'p';
  arguments.shows_page = way == 'w';
}

std::vector<std::string> CallFor(const Choice& choice, const std::set<std::string>& assets) {
  std::vector<std::string> arguments = {"--web"};
  if (choice.force) arguments.emplace_back("--force");
  arguments.emplace_back("--");
  arguments.insert(arguments.end(), assets.begin(), assets.end());
  return arguments;
}

}  // namespace

int RunResolve(const std::vector<std::string>& arguments) {
  ResolveArguments parsed = ParseResolve(arguments);
  if (parsed.shows_page) GoOnOnPage("resolve", arguments);
  Choice& choice = parsed.choice;
  const bool is_free = choice.side.empty() && !parsed.asks && !choice.as_is;
  const bool can_ask = is_free && IsConversation();
  if (parsed.files.empty() && !parsed.asks && !is_free)
    throw WrongUsage("a side and --as-is need a file, or . for all that is in conflict");
  bool is_done = true;
  const std::set<std::string> assets = FindConflicts(parsed, is_done);
  GoToTop();
  if (assets.empty() && parsed.files.empty()) return SayNothingOpen();
  if (parsed.files.empty() && is_free && !can_ask)
    throw CommandError("nobody can be asked without a terminal: say --web or -p, or name a file and a side");
  std::optional<Prompt> prompt;
  if (!assets.empty() && (parsed.asks || can_ask)) prompt.emplace(parsed.colour);
  if (prompt && can_ask) AskForWay(parsed, *prompt);
  if (parsed.shows_page) GoOnOnPage("resolve", CallFor(choice, assets));
  if (parsed.asks && prompt) choice.prompt = &*prompt;
  const MergeSettings settings = SettingsQuery().Get();
  const Repository repository;
  Resolving resolving(repository, settings, choice);
  bool is_any_done = false;
  for (const std::string& asset : assets) {
    try {
      const bool is_resolved = resolving.Resolve(asset);
      is_any_done |= is_resolved;
      is_done &= is_resolved;
    } catch (const FileError& error) {
      // The others can be settled all the same.
      Complain(error.what());
      is_done = false;
    }
    if (prompt && prompt->HasQuit()) {
      is_done = is_done && asset == *assets.rbegin();
      break;
    }
  }
  resolving.Sweep();
  if (is_any_done || (prompt && prompt->HasQuit())) SayNextStep(FindNextStep(repository));
  return is_done ? 0 : 1;
}

int RunSweep(const std::vector<std::string>& arguments) {
  GoToTop();
  const Repository repository;
  ConflictRecords(repository).Sweep(!arguments.empty() && arguments.front() == "--committed");
  return 0;
}

}  // namespace vexel_yaml
