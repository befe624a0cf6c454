#pragma once

#include <functional>
#include <string>

#include "git/conflict_records.h"
#include "git/settle.h"
#include "git/stage_files.h"

namespace vexel_yaml {

/// Resolves files that are in conflict, or were until they were staged. Nothing that it gets is owned.
class Resolving {
 public:
  Resolving(const Repository& repository, const MergeSettings& settings, const Choice& choice)
      : repository_(repository), settings_(settings), choice_(choice) {}

  /// Resolves a file, and stages it if nothing is left. Returns whether that is so, or what was chosen is
  /// kept where the choice leaves it open; what else was done, or went wrong, has been said.
  bool Resolve(const std::string& asset);

  void Sweep() const { records_.Sweep(); }

 private:
  bool IsCommitted(const std::string& asset) const;
  bool TakeAsIs(const std::string& asset);
  bool TakeText(const std::string& asset, const std::string& text);
  bool Change(const std::string& asset, const std::string& recorded,
              const std::function<bool()>& change) const;
  bool Finish(const Settlement& settlement);
  bool LeaveRest(const Settlement& settlement, StageFiles& stages);
  bool LeaveRecord(const Settlement& settlement);

  const Repository& repository_;
  const MergeSettings& settings_;
  const Choice& choice_;
  const SideNames names_ = FindSideNames(repository_);
  const ConflictRecords records_{repository_};
  ScratchFolder scratch_{repository_};
};

}  // namespace vexel_yaml
