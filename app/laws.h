#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "app/random_scenes.h"

namespace vexel_yaml {

/// What a merge must do whatever the scenes are, checked on one triple of them after another.
class Laws {
 public:
  struct Result {
    std::string law;
    size_t checked = 0;
    size_t broken = 0;
    /// Places that the law's own exception took out of the check.
    size_t excused = 0;
    /// The smallest triple that broke the law, as text.
    std::string example;
  };

  Laws();

  /// Checks every law on `triple` and returns an empty text. Where its lists can't be matched, which a merge
  /// reports as an error, it returns the reason: equal elements at both ends of a list that gets shorter
  /// can't be told apart. Throws what diffing, merging and writing throw otherwise.
  std::string Check(const SceneTriple& triple);

  const std::vector<Result>& GetResults() const { return results_; }

 private:
  void CheckSide(const SceneTriple& triple, VexelObjects& side);
  void CheckBothSides(const SceneTriple& triple);
  void Expect(size_t law, bool holds, const SceneTriple& triple);

  std::vector<Result> results_;
};

}  // namespace vexel_yaml
