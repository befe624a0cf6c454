#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

namespace vexel_yaml {

/// A program to be run, without a shell in between.
struct ProgramCall {
  /// The program, which is looked for in PATH, and what it is told.
  std::vector<std::string> arguments;
  /// What it reads; where nothing is given, it shares this process's standard input.
  std::optional<std::string> input = std::nullopt;
  /// Whether its output is returned; else it goes where this process's goes.
  bool returns_output = true;
  /// What becomes of its messages.
  enum class Errors { kShown, kDropped, kInOutput };
  Errors errors = Errors::kShown;
  /// Where it runs; empty for the current folder.
  std::string folder = {};
  /// Variables that it doesn't get, and "NAME=value" that it gets in addition.
  std::vector<std::string> without = {};
  std::vector<std::string> with = {};
};

struct ProgramResult {
  /// As a shell has it: 127 for a program that can't be started, 128 and the number for a signal. Also 127
  /// where its input can't be handed over or its output can't be read to the end: a part is not the whole.
  int status;
  std::string output;
};

/// A running program. What it was started for is done when `Wait` returns; without it, it is left alone.
class Program {
 public:
  explicit Program(const ProgramCall& call);
  Program(const Program&) = delete;
  Program& operator=(const Program&) = delete;
  ~Program();

  /// Hands the input over, takes the output, and waits for the end. To be called once.
  ProgramResult Wait();

 private:
  /// One step: whatever of input and output is ready.
  void Exchange(std::string& output);

  std::string input_;
  size_t written_ = 0;
  bool is_broken_ = false;
  int input_descriptor_ = -1;
  int output_descriptor_ = -1;
  pid_t process_ = -1;
};

/// Runs the program to its end.
ProgramResult RunProgram(const ProgramCall& call);

}  // namespace vexel_yaml
