#include "git/record_hook.h"

#include <unistd.h>

#include <array>
#include <string_view>

#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/executable_path.h"

namespace vexel_yaml {

namespace {

struct Hook {
  std::string_view name;
  std::string_view command;
  std::string_view purpose;
};

// Git commits what a rebase has stopped for without asking the hook that is meant for that, but not without
// the one for messages.
constexpr std::array<Hook, 4> kHooks = {{
    {"post-index-change", "sweep",
     "removes the records of conflicts that are gone, and with the last one this hook"},
    {"post-commit", "sweep --committed", "removes the records of conflicts that are committed"},
    {"pre-commit", "check --staged --conflicts",
     "stops a commit of what nobody has settled; goes with the last record"},
    {"prepare-commit-msg", "check --staged --conflicts --in-rebase",
     "does so in a rebase, where git asks no other hook"},
}};

// Empty where what is there is not the repository's.
std::string HookPath(const Repository& repository, const Hook& hook) {
  const std::string folder = repository.CommonPath("hooks");
  return IsLink(folder) ? std::string() : folder + "/" + std::string(hook.name);
}

std::string Mark(const Hook& hook) { return "# vexel-merge-git " + std::string(hook.command) + ": "; }

bool IsOurs(const std::string& path, const Hook& hook) {
  return !IsLink(path) && IsFile(path) && TextOf(path).find(Mark(hook)) != std::string::npos;
}

std::string HookText(const Hook& hook) {
  const std::string self = ShellQuoted(ExecutablePath());
  return "#!/bin/sh\n" + Mark(hook) + std::string(hook.purpose) + ".\n" + "if [ -x " + self +
         " ]; then exec " + self + " " + std::string(hook.command) + "; fi\n";
}

void PlaceHook(const std::string& path, const Hook& hook) {
  const std::string text = HookText(hook);
  const bool is_there = IsLink(path) || access(path.c_str(), F_OK) == 0;
  if (is_there && (!IsOurs(path, hook) || TextOf(path) == text)) return;
  if (MakeFoldersFor(path)) PutFile(path, text, 0777);
}

}  // namespace

void PlaceHooks(const Repository& repository) {
  for (const Hook& hook : kHooks) {
    if (const std::string path = HookPath(repository, hook); !path.empty()) PlaceHook(path, hook);
  }
}

void TakeHooksAway(const Repository& repository) {
  for (const Hook& hook : kHooks) {
    const std::string path = HookPath(repository, hook);
    if (!path.empty() && IsOurs(path, hook)) unlink(path.c_str());
  }
}

}  // namespace vexel_yaml
