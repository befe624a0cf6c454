#include "git/shown_text.h"

#include <unistd.h>

#include <algorithm>
#include <iostream>
#include <sstream>

#include "platform/terminal_output.h"
#include "report/value_text.h"

namespace vexel_yaml {

namespace {

std::string Replaced(std::string_view text, char character, std::string_view by) {
  std::string result;
  for (const char c : text) {
    if (c == character) {
      result += by;
    } else {
      result += c;
    }
  }
  return result;
}

void Print(std::ostream& out, int descriptor, std::string_view message) {
  if (isatty(descriptor) != 0) {
    out << Escaped(message) << '\n';
  } else {
    out << message << '\n';
  }
  out.flush();
}

}  // namespace

std::string Escaped(std::string_view text) {
  std::ostringstream out;
  {
    EscapingBuffer buffer(*out.rdbuf());
    buffer.sputn(text.data(), static_cast<std::streamsize>(text.size()));
  }
  return Replaced(out.view(), '\n', "\\n");
}

std::string ShellQuoted(std::string_view text) { return "'" + Replaced(text, '\'', "'\\''") + "'"; }

std::string Typeable(std::string_view text) {
  if (text.find('\t') == std::string_view::npos && Escaped(text) == text) return ShellQuoted(text);
  const std::string plain = Replaced(Replaced(Replaced(text, '\\', "\\\\"), '\'', "\\'"), '\t', "\\t");
  return "$'" + Escaped(plain) + "'";
}

void Say(std::string_view message) { Print(std::cerr, STDERR_FILENO, message); }
void Tell(std::string_view message) { Print(std::cout, STDOUT_FILENO, message); }

std::string Shown(const std::string& name) { return isatty(STDERR_FILENO) != 0 ? Escaped(name) : name; }

std::string ListOf(const std::vector<std::string>& names) {
  constexpr size_t kMostNames = 5;
  // The last one has room where "1 more" would stand.
  const size_t shown = names.size() == kMostNames + 1 ? names.size() : std::min(names.size(), kMostNames);
  std::string text;
  for (size_t i = 0; i < shown; ++i) text += (i == 0 ? "" : ", ") + OnOneLine(names[i]);
  if (names.size() > shown) text += " and " + std::to_string(names.size() - shown) + " more";
  return text;
}

void Complain(std::string_view message) { Say("error: " + std::string(message)); }

CommandError WrongUsage(const std::string& message) {
  return CommandError(message + "; see vexel-merge-git --help", kWrongUsage);
}

}  // namespace vexel_yaml
