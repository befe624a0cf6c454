#include "git/all_or_nothing.h"

#include <unistd.h>

#include <map>
#include <optional>
#include <stdexcept>

#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/ending_signals.h"

namespace vexel_yaml {

namespace {

// Nothing where there is none; what is no file of its own is left out, and never written.
std::map<std::string, std::optional<std::string>> TextsOf(const std::vector<std::string>& paths) {
  std::map<std::string, std::optional<std::string>> texts;
  for (const std::string& path : paths) {
    if (IsLink(path) || IsFolder(path)) continue;
    texts[path] = IsFile(path) ? std::optional(TextOf(path)) : std::nullopt;
  }
  return texts;
}

bool PutBack(const std::string& path, const std::optional<std::string>& text) {
  if (!text) return unlink(path.c_str()) == 0 || !IsFile(path);
  return (IsFile(path) && TextOf(path) == *text) || PutFile(path, *text);
}

}  // namespace

bool AllOrNothing(const std::vector<std::string>& paths, const std::function<bool()>& change) {
  const SignalsHeld held;
  const auto before = TextsOf(paths);
  try {
    if (change()) return true;
  } catch (const std::runtime_error& error) {
    if (*error.what() != '\0') Complain(error.what());
  }
  for (const auto& [path, text] : before) {
    if (!PutBack(path, text)) Complain("cannot put back " + path);
  }
  return false;
}

}  // namespace vexel_yaml
