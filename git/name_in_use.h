#pragma once

#include <optional>
#include <string>
#include <vector>

#include "git/repository.h"
#include "platform/run_program.h"

namespace vexel_yaml {

/// Whether the index, or a commit that git is merging, has something under a name. What is picked by hand or
/// popped from a stash, git tells nobody. It looks while the caller does something else.
class NameInUse {
 public:
  NameInUse(const Repository& repository, const std::string& path);

  /// To be called once.
  bool Get();

 private:
  // What git calls the name in each place where it may be.
  std::vector<std::string> objects_;
  // Nothing for a name with a line break, which can't be asked for in a list.
  std::optional<Program> list_;
};

}  // namespace vexel_yaml
