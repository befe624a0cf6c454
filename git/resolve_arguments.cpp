#include "git/resolve_arguments.h"

#include "git/git_call.h"
#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

// The side that an option names, as a word of a record; empty for another option.
std::string SideNamedBy(const std::string& option) {
  if (option == "--left" || option == "--theirs") return "left";
  if (option == "--right" || option == "--ours") return "right";
  return option == "--base" ? "base" : "";
}

ColourUse ColourNamed(const std::string& word) {
  if (word == "auto") return ColourUse::kAuto;
  if (word == "always") return ColourUse::kAlways;
  if (word == "never") return ColourUse::kNever;
  throw WrongUsage("--color is auto, always or never");
}

// The file of this name that was in conflict before it was staged.
std::vector<std::string> StagedConflict(const std::string& pathspec) {
  const ProgramResult found = Git({"ls-files", "-z", "--resolve-undo", "--full-name", "--", pathspec});
  std::set<std::string> paths;
  for (const std::string& entry : Pieces(found.output, '\0'))
    paths.insert(entry.substr(entry.find('\t') + 1));
  return paths.size() == 1 ? std::vector<std::string>(paths.begin(), paths.end())
                           : std::vector<std::string>();
}

// The conflicts of ours that somebody means who names a path, from here or, as git prints it, from the top.
std::vector<std::string> NamedConflicts(const std::string& path, const std::string& top, bool reopens) {
  for (const char* magic : {":(literal)", ":(top,literal)"}) {
    std::vector<std::string> named =
        OursAmong(UnmergedBelow({magic + path}).value_or(std::vector<std::string>()), top);
    if (!named.empty()) return named;
  }
  if (!reopens) return {};
  // One that is settled and staged can be settled otherwise, if it is meant for sure.
  for (const char* magic : {":(literal)", ":(top,literal)"}) {
    const std::vector<std::string> staged = OursAmong(StagedConflict(magic + path), top);
    if (!staged.empty()) return staged;
  }
  return {};
}

}  // namespace

// The options may stand anywhere before "--".
ResolveArguments ParseResolve(const std::vector<std::string>& arguments) {
  ResolveArguments parsed;
  Choice& choice = parsed.choice;
  for (auto argument = arguments.begin(); argument != arguments.end(); ++argument) {
    if (const std::string side = SideNamedBy(*argument); !side.empty()) {
      if (!choice.side.empty()) throw WrongUsage("only one of --theirs, --ours and --base can be given");
      choice.side = side;
    } else if (*argument == "--path") {
      if (++argument == arguments.end()) throw WrongUsage("--path needs a value");
      choice.pattern = *argument;
    } else if (argument->starts_with("--path=")) {
      choice.pattern = argument->substr(7);
    } else if (*argument == "--force") {
      choice.force = true;
    } else if (*argument == "-p") {
      parsed.asks = true;
    } else if (*argument == "--web") {
      parsed.shows_page = true;
    } else if (*argument == "--no-browser") {
      parsed.opens_browser = false;
    } else if (*argument == "--port") {
      if (++argument == arguments.end()) throw WrongUsage("--port needs a value");
      parsed.port = *argument;
    } else if (argument->starts_with("--color=")) {
      parsed.colour = ColourNamed(argument->substr(8));
    } else if (*argument == "--as-is") {
      choice.as_is = true;
    } else if (*argument == "--") {
      parsed.files.insert(parsed.files.end(), argument + 1, arguments.end());
      break;
    } else if (argument->starts_with('-')) {
      throw WrongUsage("unknown option '" + *argument + "'");
    } else {
      parsed.files.push_back(*argument);
    }
  }
  if (!choice.pattern.empty() && choice.side.empty())
    throw WrongUsage("--path goes with --theirs, --ours or --base");
  if (!choice.side.empty() && parsed.asks) throw WrongUsage("-p asks for the side: name none");
  if (choice.as_is && (!choice.side.empty() || parsed.asks || parsed.shows_page))
    throw WrongUsage("--as-is goes with no choice");
  if (parsed.shows_page && (parsed.asks || !choice.side.empty()))
    throw WrongUsage("--web goes neither with -p nor with a side");
  if (!parsed.shows_page && (!parsed.port.empty() || !parsed.opens_browser))
    throw WrongUsage("--port and --no-browser go with --web");
  return parsed;
}

std::set<std::string> FindConflicts(const ResolveArguments& arguments, bool& is_complete) {
  const std::vector<std::string>& files = arguments.files;
  const bool reopens = !files.empty() || arguments.asks || arguments.shows_page;
  const std::string top = TopFolder();
  std::set<std::string> assets;
  for (const std::string& file : files.empty() ? std::vector<std::string>{top} : files) {
    const std::vector<std::string> named = NamedConflicts(file, top, reopens);
    if (named.empty() && !files.empty()) {
      Complain(file + " is not in conflict, or has no attribute merge=vexel");
      is_complete = false;
    }
    assets.insert(named.begin(), named.end());
  }
  return assets;
}

}  // namespace vexel_yaml
