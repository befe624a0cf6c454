#include "git/record_hook.h"

#include <unistd.h>

#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/executable_path.h"

namespace vexel_yaml {

namespace {

// Empty where what is there is not the repository's.
std::string HookPath(const Repository& repository) {
  const std::string folder = repository.CommonPath("hooks");
  return IsLink(folder) ? std::string() : folder + "/post-index-change";
}

bool IsOurs(const std::string& hook) {
  return !IsLink(hook) && IsFile(hook) && TextOf(hook).find("vexel-merge-git sweep") != std::string::npos;
}

std::string HookText() {
  const std::string self = ShellQuoted(ExecutablePath());
  return "#!/bin/sh\n"
         "# vexel-merge-git sweep: removes the records of conflicts that are gone, and with the last one "
         "this "
         "hook.\n"
         "if [ -x " +
         self + " ]; then exec " + self + " sweep; fi\n";
}

}  // namespace

void PlaceHook(const Repository& repository) {
  const std::string hook = HookPath(repository);
  if (hook.empty()) return;
  const std::string text = HookText();
  const bool is_there = IsLink(hook) || access(hook.c_str(), F_OK) == 0;
  if (is_there && (!IsOurs(hook) || TextOf(hook) == text)) return;
  if (MakeFoldersFor(hook)) PutFile(hook, text, 0777);
}

void TakeHookAway(const Repository& repository) {
  const std::string hook = HookPath(repository);
  if (!hook.empty() && IsOurs(hook)) unlink(hook.c_str());
}

}  // namespace vexel_yaml
