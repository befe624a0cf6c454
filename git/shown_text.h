#pragma once

#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace vexel_yaml {

/// What strangers have chosen, such as the names of files, in messages and in commands for people to paste.

/// The text with "\x1b" and the like for what steers a terminal and for what is not UTF-8, and "\n" for line
/// breaks.
std::string Escaped(std::string_view text);

/// The text as one word of a shell command.
std::string ShellQuoted(std::string_view text);

/// The same for a person to paste into bash, zsh or ksh, where a terminal can't show the text as it is.
std::string Typeable(std::string_view text);

/// Prints a message to standard error, or to standard output: to a terminal in one line, and to any other
/// reader as it is.
void Say(std::string_view message);
void Tell(std::string_view message);

/// The name as a part of several lines that go to standard error.
std::string Shown(const std::string& name);

/// A few of these names in a line, and how many more there are.
std::string ListOf(const std::vector<std::string>& names);

/// Says it as an error.
void Complain(std::string_view message);

/// Ends the command with this status, and with this error unless it is empty.
class CommandError : public std::runtime_error {
 public:
  explicit CommandError(const std::string& message, int status = 1)
      : std::runtime_error(message), status_(status) {}
  int GetStatus() const { return status_; }

 private:
  int status_;
};

/// Git has refused, and has said why.
inline constexpr int kGitRefused = 128;
inline constexpr int kWrongUsage = 129;

/// The error of a command that was called in a wrong way.
CommandError WrongUsage(const std::string& message);

}  // namespace vexel_yaml
