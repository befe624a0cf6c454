#pragma once

#include <string>
#include <utility>
#include <vector>

#include "git/marked_block.h"

namespace vexel_yaml {

/// Where the set-up of a repository, or of all the user's repositories, is, and what is remembered of before.
struct SetupPlaces {
  bool is_global;
  std::string scope;       ///< The option of git config.
  std::string attributes;  ///< The file of the patterns.
  std::string config;      ///< The file that git config writes.
  SetupState state;

  /// Goes to the top folder where it is not for all repositories. Throws CommandError.
  static SetupPlaces Find(bool is_global);

  /// Of whom it speaks.
  std::string Where() const { return is_global ? "all your repositories" : "this repository"; }
};

/// The whole path of vexel-merge-git.
std::string OurProgram();

/// What git is told to call, as a word of a shell command: the bare name where that is found,
/// since it survives an update of the program to another folder, and works in a configuration that several
/// machines share.
std::string CommandForGit();

/// What git's configuration gets: keys and values.
std::vector<std::pair<std::string, std::string>> WantedConfiguration();

/// The command that a value of these keys calls; empty for one that somebody else has made.
std::string CommandIn(const std::string& value);

/// The user's own attributes file; empty without a home.
std::string UserAttributes();

/// The patterns that an attributes file gives to us.
std::vector<std::string> GivenPatterns(const std::string& path);

/// The texts with blanks between them.
std::string Joined(const std::vector<std::string>& texts);

/// `enable`, `disable` and `status`, with what stands behind them. Return the exit status, and throw
/// CommandError.
int RunEnable(const std::vector<std::string>& arguments);
int RunDisable(const std::vector<std::string>& arguments);
int RunStatus(const std::vector<std::string>& arguments);

}  // namespace vexel_yaml
