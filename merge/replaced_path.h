#pragma once

#include <utility>

#include "merge/conflict_resolver.h"

namespace vexel_yaml {

/// Sets another path of a resolver for its own lifetime.
class ReplacedPath {
 public:
  ReplacedPath(ConflictResolver& resolver, FieldPath path)
      : resolver_(resolver), saved_(resolver.ExchangePath(std::move(path))) {}
  ReplacedPath(const ReplacedPath&) = delete;
  ReplacedPath& operator=(const ReplacedPath&) = delete;
  ~ReplacedPath() { resolver_.ExchangePath(std::move(saved_)); }

 private:
  ConflictResolver& resolver_;
  FieldPath saved_;
};

}  // namespace vexel_yaml
