#pragma once

#include <optional>
#include <string>
#include <vector>

#include "git/repository.h"
#include "platform/run_program.h"

namespace vexel_yaml {

/// Whether a commit that git is merging has something under a name. What is picked by hand or popped from a
/// stash, it tells nobody. Git looks while the caller does something else.
class CommitsAtHand {
 public:
  CommitsAtHand(const Repository& repository, const std::string& path);

  /// To be called once.
  bool HaveIt();

 private:
  // What git calls the name in each of the commits.
  std::vector<std::string> objects_;
  // Nothing for a name with a line break, which can't be asked for in a list.
  std::optional<Program> list_;
};

}  // namespace vexel_yaml
