#include "git/record_hook.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <string_view>

#include "git/setup.h"
#include "git/shown_text.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

struct Hook {
  std::string_view name;
  std::string_view command;
  std::string_view purpose;
  // Whether it stops commits.
  bool is_guard;
};

constexpr std::string_view kFirstGuard = "pre-commit";

// Git commits what a rebase has stopped for without asking the hook that is meant for that, but not without
// the one for messages, and what comes as a patch only with one of its own.
constexpr std::array<Hook, 5> kHooks = {{
    {"post-index-change", "sweep",
     "removes the records of conflicts that are gone, and with the last one this hook", false},
    {"post-commit", "sweep --committed", "removes the records of conflicts that are committed", false},
    {kFirstGuard, "check --staged --conflicts",
     "stops a commit of what nobody has settled; goes with the last record", true},
    {"prepare-commit-msg", "check --staged --conflicts --in-rebase",
     "does so in a rebase, where git asks no other hook", true},
    {"pre-applypatch", "check --staged --conflicts", "does so with patches", true},
}};

bool IsThere(const std::string& path) { return IsLink(path) || access(path.c_str(), F_OK) == 0; }

// Empty where what is there is not the repository's.
std::string HookPath(const Repository& repository, const Hook& hook) {
  const std::string folder = repository.CommonPath("hooks");
  return IsLink(folder) ? std::string() : folder + "/" + std::string(hook.name);
}

std::string Mark(const Hook& hook) { return "# vexel-merge-git " + std::string(hook.command) + ": "; }

bool IsOurs(const std::string& path, const Hook& hook) {
  return !IsLink(path) && IsFile(path) && TextOf(path).find(Mark(hook)) != std::string::npos;
}

// Our lines, and the line before them. Whoever adds some has them run.
constexpr std::string_view kShell = "#!/bin/sh\n";
std::string HookLines(const Hook& hook) {
  const std::string self = ShellQuoted(OurProgram());
  return Mark(hook) + std::string(hook.purpose) + ".\n" + "if [ -x " + self + " ]; then " + self + " " +
         std::string(hook.command) + " || exit; fi\n";
}

// What somebody else has written into a hook of ours, also of one that stands for another version of us.
std::string WithoutOurLines(const std::string& text, const Hook& hook) {
  const size_t begin = text.find(Mark(hook));
  if (begin == std::string::npos) return text;
  const size_t second = text.find('\n', begin);
  const size_t end = second == std::string::npos ? second : text.find('\n', second + 1);
  return text.substr(0, begin) + (end == std::string::npos ? std::string() : text.substr(end + 1));
}

// False where it can't.
bool PlaceHook(const std::string& path, const Hook& hook) {
  const std::string lines = HookLines(hook);
  if (!IsThere(path)) return MakeFoldersFor(path) && PutFile(path, std::string(kShell) + lines, 0777);
  if (!IsOurs(path, hook) || TextOf(path).find(lines) != std::string::npos) return true;
  std::string rest = WithoutOurLines(TextOf(path), hook);
  const size_t end = rest.find('\n');
  rest.insert(end == std::string::npos ? 0 : end + 1, lines);
  return PutFile(path, rest, 0777);
}

void TakeAway(const std::string& path, const Hook& hook) {
  const std::string rest = WithoutOurLines(TextOf(path), hook);
  if (rest == kShell) {
    unlink(path.c_str());
  } else {
    PutFile(path, rest);
  }
}

}  // namespace

bool PlaceHooks(const Repository& repository) {
  bool are_placed = true;
  for (const Hook& hook : kHooks) {
    const std::string path = HookPath(repository, hook);
    if (!path.empty()) are_placed = PlaceHook(path, hook) && are_placed;
  }
  return are_placed;
}

bool HaveHooks(const Repository& repository) {
  return std::ranges::any_of(kHooks, [&](const Hook& hook) {
    const std::string path = HookPath(repository, hook);
    return !path.empty() && IsOurs(path, hook);
  });
}

void TakeHooksAway(const Repository& repository) {
  for (const Hook& hook : kHooks) {
    const std::string path = HookPath(repository, hook);
    if (!path.empty() && IsOurs(path, hook)) TakeAway(path, hook);
  }
}

std::vector<std::string> ForeignGuards(const Repository& repository, const std::string& other_folder) {
  const std::string own_folder = repository.CommonPath("hooks");
  const bool is_foreign = !other_folder.empty() || IsLink(own_folder);
  std::vector<std::string> names;
  for (const Hook& hook : kHooks) {
    const std::string path =
        (other_folder.empty() ? own_folder : other_folder) + "/" + std::string(hook.name);
    const bool is_missing = is_foreign && hook.name == kFirstGuard;
    if (!hook.is_guard || (!IsThere(path) && !is_missing)) continue;
    if (TextOf(path).find("vexel-merge-git check") == std::string::npos) names.emplace_back(hook.name);
  }
  return names;
}

}  // namespace vexel_yaml
