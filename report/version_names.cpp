#include "report/version_names.h"

#include <utility>

namespace vexel_yaml {

void VersionNames::SetAssetNames(const AssetNames& names) {
  asset_names_ = names;
  latest_.SetAssetNames(names);
  own_ = {};
}

ObjectNames& VersionNames::Own(ReportCell ReportRow::*cell) {
  const std::pair<ReportCell ReportRow::*, const VexelObjects*> columns[] = {
      {&ReportRow::base, versions_.base},
      {&ReportRow::left, versions_.left},
      {&ReportRow::right, versions_.right},
      {&ReportRow::committed, versions_.committed}};
  for (size_t i = 0; i < own_.size(); ++i) {
    if (columns[i].first != cell || columns[i].second == nullptr) continue;
    if (!own_[i]) own_[i].emplace(Before(columns[i].second)).SetAssetNames(asset_names_);
    return *own_[i];
  }
  return latest_;
}

// All versions, this one before the others.
std::vector<const VexelObjects*> VersionNames::Before(const VexelObjects* first) const {
  std::vector<const VexelObjects*> versions = {first,          versions_.result, versions_.right,
                                               versions_.left, versions_.base,   versions_.committed};
  std::erase(versions, nullptr);
  return versions;
}

}  // namespace vexel_yaml
