#include "platform/error_channel.h"

#include <unistd.h>

#include <iostream>
#include <string>

#include "platform/error_dialog.h"

namespace vexel_yaml {

bool gHeadlessEnabled = false;
bool gHintsEnabled = false;
Mutex s_cerrLock;
std::stringstream errs;

namespace {

// Where hints follow, messages must end their lines.
bool ShowsHints() { return gHintsEnabled || isatty(STDERR_FILENO) != 0; }

}  // namespace

void ErrMsg(std::stringstream& stream) {
  AutoLock lock(s_cerrLock);
  const std::string text = stream.str();
  if (!gHeadlessEnabled) ShowErrorDialog("VexelYAMLMerge Error", text);
  std::cerr << text;
  // Some messages end without a line break, since scripts read them so; a shell prompt must not follow them.
  if (!text.empty() && text.back() != '\n' && ShowsHints()) std::cerr << '\n';
  std::cerr.flush();
  stream.clear();
}

void WriteErrorLine(std::string_view line) {
  AutoLock lock(s_cerrLock);
  std::cerr << line << '\n' << std::flush;
}

void WriteHint(std::string_view text) {
  if (!text.empty() && ShowsHints()) WriteErrorLine("hint: " + std::string(text));
}

}  // namespace vexel_yaml
