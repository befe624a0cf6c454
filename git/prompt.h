#pragma once

#include <string>

#include "report/conflict_names.h"

namespace vexel_yaml {

/// When to print in colour.
enum class ColourUse { kAuto, kAlways, kNever };

/// Asks the user on standard output, and reads answers from standard input, a line each: from a terminal, or
/// from a pipe. The end of the input is an answer, too: to quit.
class Prompt {
 public:
  /// With kAuto, there is colour on a terminal, unless NO_COLOR, TERM or git's configuration is against it.
  explicit Prompt(ColourUse colour);

  /// What an answer can be beside help, which is given until there is one of these.
  enum class Answer { kTheirs, kOurs, kBase, kSkip, kBack, kQuit };
  struct Reply {
    Answer answer;
    /// Whether a side is to count for the whole object.
    bool is_for_thing;
  };
  struct Question {
    const NamedConflict& conflict;
    std::string number;  ///< Such as "2/5".
    std::string now;     ///< What has been chosen for it; empty for nothing.
    bool offers_thing;   ///< Whether more of its object is open.
    bool offers_back;
  };

  Reply Ask(const Question& question);

  /// One of the letters of `choices`, whose first one an empty line stands for; 'q' at the end of the input.
  char AskLetter(const std::string& text, const std::string& choices);

  /// Prints a line that belongs to the conversation.
  void Tell(const std::string& text);

  /// Whether the user has had enough, also of other files.
  bool HasQuit() const { return has_quit_; }

 private:
  void Show(const Question& question);
  void Help(const Question& question);
  /// Prints it as it is, colours and all: what comes from files is to be escaped before.
  void Print(const std::string& text);
  std::string Painted(const std::string& text, const char* colour) const;
  /// False at the end of the input.
  bool ReadLine(std::string& line);

  bool has_colour_;
  bool has_quit_ = false;
};

/// Whether somebody sits at a terminal who reads what is printed and can answer.
bool IsConversation();

}  // namespace vexel_yaml
