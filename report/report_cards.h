#pragma once

#include <string>
#include <vector>

#include "report/report_model.h"

namespace vexel_yaml {

/// What people take for one thing: a game object with its components, a prefab instance with what it brings
/// along, or an object that stands for itself.
struct ReportCard {
  const YAMLScalar* file_id;
  std::string name;
  std::string path;
  std::string class_name;
  std::vector<ReportObject> objects;

  bool operator==(const ReportCard& other) const = default;
};

/// In the order of the objects; those of a card are in an order that doesn't change as conflicts are settled.
std::vector<ReportCard> MakeCards(std::vector<ReportObject> objects, ObjectNames& names);

}  // namespace vexel_yaml
