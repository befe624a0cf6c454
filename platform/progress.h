#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <thread>

namespace vexel_yaml {

/// Says on a terminal what is being done that takes longer than a second, in one line of standard error that
/// rewrites itself, and is gone in the end. Where standard error is no terminal, or one that can't do that,
/// or in the background, nothing happens, and there is no thread.
///
/// Whatever else is written to the terminal through the standard streams takes the line's place until the
/// next step.
class Progress {
 public:
  static constexpr std::chrono::milliseconds kPatience{1000};

  /// Begins a task, such as "Merging Harbour.vexel", which lasts as long as the object. Inside of another one
  /// it is a part of that. `patience` is how long nothing is said.
  explicit Progress(const std::string& task, std::chrono::milliseconds patience = kPatience);
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;
  ~Progress();

  /// Names what is done now in the task that is under way, if there is one, such as "reading".
  static void Step(const std::string& step);

  /// Takes the line away, since something else is about to be written. May be called from any thread, and for
  /// every character.
  static void MakeRoom();

 private:
  void Run();
  void Draw();
  void Erase();

  const std::chrono::steady_clock::time_point start_;
  const std::chrono::milliseconds patience_;
  const std::string task_;
  std::string step_;
  bool is_done_ = false;
  bool is_drawn_ = false;
  std::condition_variable changed_;
  std::thread thread_;
};

}  // namespace vexel_yaml
