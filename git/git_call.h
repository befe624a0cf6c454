#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "git/shown_text.h"
#include "platform/run_program.h"

namespace vexel_yaml {

/// What git has answered, also by its status. That it can't be run, or its output not be read, is no answer:
/// then this throws CommandError.
ProgramResult Answered(ProgramResult result);

/// Runs git, and returns that.
ProgramResult Ask(const ProgramCall& call);

/// What git prints. Throws CommandError where it fails, since no output would be an answer, too.
std::string Answer(const ProgramCall& call);

/// `Ask`, with git's errors shown.
ProgramResult Git(std::vector<std::string> arguments);

/// The same without its errors.
ProgramResult GitQuietly(std::vector<std::string> arguments);

/// How `Git` and `GitQuietly` call git.
ProgramCall GitCall(std::vector<std::string> arguments);
ProgramCall QuietCall(std::vector<std::string> arguments);

/// What git printed as one line, which may hold line breaks itself.
std::string Line(const ProgramResult& result);

/// The pieces of a text that each end in `end`.
std::vector<std::string> Pieces(std::string_view text, char end);

/// The unmerged paths that the path specifications match, or all of them below the current folder, sorted,
/// from the top folder. Nothing where git fails. A command of the user may be at work on another index, which
/// counts only if `in_users_index`.
std::optional<std::vector<std::string>> UnmergedBelow(const std::vector<std::string>& pathspecs,
                                                      bool in_users_index = true);

/// Those of the paths, in the same order, that the attributes give to us. `top` is the work tree's folder.
std::vector<std::string> OursAmong(const std::vector<std::string>& paths, const std::string& top = ".");

/// Takes the process to the work tree's top folder. Throws CommandError with kGitRefused where there is none.
void GoToTop();

/// That folder.
std::string TopFolder();

/// Prints the blob that git would make of a text that is this path's content in the work tree.
ProgramCall HashCall(const std::string& path, std::string text);

/// What that has printed; empty where it has failed.
std::string HashIn(const ProgramResult& result);

/// What ends a command for which git has failed, and has said why.
CommandError Refusal();

/// The variable that names another index.
inline constexpr char kIndexVariable[] = "GIT_INDEX_FILE";

}  // namespace vexel_yaml
