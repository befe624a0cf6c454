#pragma once

#include <optional>
#include <string>

namespace vexel_yaml {

/// What was there before the set-up changed it, so that it can be taken back: a file in git's configuration
/// format, and files beside it whose names begin with its own.
class SetupState {
 public:
  explicit SetupState(std::string path) : path_(std::move(path)) {}

  const std::string& GetPath() const { return path_; }
  std::string Beside(const std::string& suffix) const { return path_ + "." + suffix; }

  std::optional<std::string> Recall(const std::string& key) const;
  void Remember(const std::string& key, const std::string& value) const;

 private:
  std::string path_;
};

/// Our lines in a file that belongs to somebody else, between two marks.
class MarkedBlock {
 public:
  /// `name` tells the file's block from others in the state.
  MarkedBlock(std::string path, std::string name, const SetupState& state)
      : path_(std::move(path)), name_(std::move(name)), state_(state) {}

  /// Whether the file has the marks. Throws CommandError where they are not a pair, since nobody could say
  /// then which lines are ours.
  bool Exists() const;

  /// Puts these lines, which end without a line break, between the marks, at the end of the file unless the
  /// marks are there already. Returns whether that changed the file. Throws CommandError where it can't.
  bool Set(const std::string& lines) const;

  /// Takes back what `Set` has done. What else was changed in the file stays.
  void Restore() const;

 private:
  std::string path_;
  std::string name_;
  const SetupState& state_;
};

}  // namespace vexel_yaml
