#pragma once

#include <set>
#include <string>
#include <vector>

#include "git/repository.h"

namespace vexel_yaml {

/// How somebody goes on in git who has settled conflicts.
struct GitStep {
  /// What the command does, such as "finish the merge".
  std::string purpose;
  /// For people to type, such as "git commit"; empty where git isn't in the middle of anything.
  std::string command;
  /// The files that are in conflict still, which the command is about then.
  std::vector<std::string> open = {};
};

/// Finds it. `settled` are files that git has in conflict, and which count as settled: they are about to be
/// staged.
GitStep FindNextStep(const Repository& repository, const std::set<std::string>& settled = {});

/// The same where git mergetool has asked for one file. It opens one after the other by itself up to `last`,
/// which is empty where that isn't known: as long as it goes on, the command is empty and some are open.
GitStep FindStepAfterMergetool(const Repository& repository, const std::string& settled,
                               const std::string& last);

/// Says it, if there is one.
void SayNextStep(const GitStep& step);

}  // namespace vexel_yaml
