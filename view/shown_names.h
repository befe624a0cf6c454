#pragma once

#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "report/object_names.h"
#include "report/report_model.h"

namespace vexel_yaml {

/// Which objects the cards of others show by name, so that these can be told anew when a choice renames or
/// moves something.
class ShownNames {
 public:
  void Add(const ReportObject& object);
  void Forget(const YAMLScalar* file_id) { named_.erase(file_id); }
  void Clear() { named_.clear(); }

  /// The objects whose rows or paths have the name of one of `renamed`, which are wholes (see ObjectNames),
  /// or of something below it.
  std::vector<const YAMLScalar*> Showing(const ObjectNames& names,
                                         const std::unordered_set<const YAMLScalar*>& renamed) const;

 private:
  std::unordered_map<const YAMLScalar*, std::unordered_set<const YAMLScalar*>> named_;
};

}  // namespace vexel_yaml
