#include "git/prompt.h"

#include <unistd.h>

#include <cstdlib>
#include <iostream>
#include <string_view>

#include "git/git_call.h"
#include "git/shown_text.h"
#include "platform/descriptor_buffer.h"

namespace vexel_yaml {

namespace {

constexpr char kBold[] = "\x1b[1m";
constexpr char kTheirs[] = "\x1b[35m";
constexpr char kOurs[] = "\x1b[36m";
constexpr char kPrompt[] = "\x1b[1;34m";
constexpr char kPlain[] = "\x1b[m";

bool WantsColour() {
  const char* no_colour = std::getenv("NO_COLOR");
  const char* terminal = std::getenv("TERM");
  if (no_colour != nullptr && *no_colour != '\0') return false;
  if (isatty(STDOUT_FILENO) == 0 || terminal == nullptr || std::string_view(terminal) == "dumb") return false;
  return Line(GitQuietly({"config", "--get-colorbool", "color.interactive", "true"})) != "false";
}

std::string Letters(const Prompt::Question& question) {
  std::string letters = "t,o,b";
  if (question.offers_thing) letters += ",T,O,B";
  letters += ",s";
  if (question.offers_back) letters += ",k";
  return letters + ",q,?";
}

}  // namespace

Prompt::Prompt(ColourUse colour)
    : has_colour_(colour == ColourUse::kAlways || (colour == ColourUse::kAuto && WantsColour())) {}

Prompt::Reply Prompt::Ask(const Question& question) {
  Show(question);
  const std::string letters = Letters(question);
  while (true) {
    Print(Painted("theirs, ours or base [" + letters + "]? ", kPrompt));
    std::string line;
    if (!ReadLine(line)) return {Answer::kQuit, false};
    // Whoever has learnt the letters for a whole object may use them for the last conflict of it, too.
    const bool is_known = (letters + "TOB").find(line) != std::string::npos;
    const char letter = line.size() == 1 && is_known ? line[0] : '?';
    const bool is_for_thing = letter >= 'A' && letter <= 'Z';
    switch (letter) {
      case 't':
      case 'T':
        return {Answer::kTheirs, is_for_thing};
      case 'o':
      case 'O':
        return {Answer::kOurs, is_for_thing};
      case 'b':
      case 'B':
        return {Answer::kBase, is_for_thing};
      case 's':
        return {Answer::kSkip, false};
      case 'k':
        return {Answer::kBack, false};
      case 'q':
        has_quit_ = true;
        return {Answer::kQuit, false};
      default:
        if (line == "k") {
          Tell("This is the first one: there is none before.");
        } else {
          Help(question);
        }
    }
  }
}

char Prompt::AskLetter(const std::string& text, const std::string& choices) {
  std::string line;
  do {
    Print(Painted(text, kPrompt));
    if (!ReadLine(line)) return 'q';
    if (line.empty()) return choices.front();
  } while (line.size() != 1 || choices.find(line) == std::string::npos);
  return line.front();
}

void Prompt::Show(const Question& question) {
  const NamedConflict& conflict = question.conflict;
  std::string text = "\n" + Painted("(" + question.number + ") " + Escaped(conflict.name), kBold) + "\n";
  if (!conflict.was.empty()) text += "  was     " + Escaped(conflict.was) + "\n";
  text += Painted("  theirs  " + Escaped(conflict.theirs), kTheirs) + "\n";
  text += Painted("  ours    " + Escaped(conflict.ours), kOurs) + "\n";
  if (!question.now.empty()) text += "  now     " + question.now + "\n";
  Print(text);
}

void Prompt::Help(const Question& question) {
  std::string text =
      "t - take theirs here\n"
      "o - take ours here\n"
      "b - take base here, what it was before both\n";
  if (question.offers_thing) text += "T, O, B - the same for all that is open in this object\n";
  text += question.now.empty() ? "s - skip this one, and leave it open\n" : "s - leave it as it is now\n";
  if (question.offers_back) text += "k - go back to the one before, and take that answer back\n";
  Print(text + "q - quit, and keep what is settled\n? - show this help\n");
}

void Prompt::Tell(const std::string& text) { Print(Escaped(text) + "\n"); }

void Prompt::Print(const std::string& text) {
  // The stream would escape the colours on a terminal, as it should what comes from files.
  std::cout.flush();
  DescriptorBuffer out(STDOUT_FILENO);
  out.sputn(text.data(), static_cast<std::streamsize>(text.size()));
  out.pubsync();
}

std::string Prompt::Painted(const std::string& text, const char* colour) const {
  return has_colour_ ? colour + text + kPlain : text;
}

bool Prompt::ReadLine(std::string& line) {
  if (std::getline(std::cin, line)) {
    if (line.ends_with('\r')) line.pop_back();
    return true;
  }
  Print("\n");
  has_quit_ = true;
  return false;
}

bool IsConversation() { return isatty(STDIN_FILENO) != 0 && isatty(STDOUT_FILENO) != 0; }

}  // namespace vexel_yaml
