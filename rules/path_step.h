#pragma once

#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

/// Stands one level deeper in a path for its own lifetime.
class PathStep {
 public:
  PathStep(FieldPath& path, const YAMLScalar* component) : path_(path) { path_.push_back(component); }
  PathStep(const PathStep&) = delete;
  PathStep& operator=(const PathStep&) = delete;
  ~PathStep() { path_.pop_back(); }

 private:
  FieldPath& path_;
};

}  // namespace vexel_yaml
