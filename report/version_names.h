#pragma once

#include <array>
#include <optional>

#include "report/object_names.h"
#include "report/report_model.h"

namespace vexel_yaml {

/// What the things of a report are called: they may have another name in each version.
class VersionNames {
 public:
  /// A version may be null.
  struct Versions {
    const VexelObjects* base;
    const VexelObjects* left;
    const VexelObjects* right;
    const VexelObjects* result = nullptr;
    const VexelObjects* committed = nullptr;
  };
  explicit VersionNames(const Versions& versions) : versions_(versions), latest_(Before(nullptr)) {}

  void SetAssetNames(const AssetNames& names);

  /// As the result has them, or else a side.
  ObjectNames& Latest() { return latest_; }

  /// For this cell of each row, as its version has them; what that lacks, as the others have it.
  CellNames In(ReportCell ReportRow::*cell) { return {latest_, Own(cell)}; }

 private:
  ObjectNames& Own(ReportCell ReportRow::*cell);
  std::vector<const VexelObjects*> Before(const VexelObjects* first) const;

  Versions versions_;
  AssetNames asset_names_;
  ObjectNames latest_;
  // As they are asked for: those of base, left, right and what was committed.
  std::array<std::optional<ObjectNames>, 4> own_;
};

}  // namespace vexel_yaml
