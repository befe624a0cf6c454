#pragma once

#include <sstream>
#include <string_view>

#include "platform/mutex.h"

namespace vexel_yaml {

/// Set by "-h": messages go to standard error only, never to a dialog.
extern bool gHeadlessEnabled;

/// Whether hints are shown wherever standard error goes to; set by "--safe".
extern bool gHintsEnabled;

/// Guards the error channel.
extern Mutex s_cerrLock;

/// Where the commands collect the text of a message before they call `ErrMsg`.
extern std::stringstream errs;

/// Shows everything collected in `stream` so far: on standard error and, unless headless, in a dialog
/// where the system has one. The text stays in the stream, so the next call shows it again; the stream's
/// error flags are reset. Where hints are shown an open last line is ended.
void ErrMsg(std::stringstream& stream);

/// Writes one line to standard error, from any thread, without a dialog and without touching `errs`.
void WriteErrorLine(std::string_view line);

/// Writes "hint: " and `text` as a line behind a message, from any thread, where a person reads standard
/// error on a terminal or hints are enabled. Elsewhere, and for an empty text, it writes nothing: scripts
/// compare the messages, and neither the dialog nor `errs` gets to see a hint.
void WriteHint(std::string_view text);

}  // namespace vexel_yaml
