#include "platform/progress.h"

#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <sstream>
#include <string_view>
#include <system_error>

#include "platform/terminal_output.h"

namespace vexel_yaml {

namespace {

// The task under way, and what guards its members.
std::mutex s_lock;
Progress* s_current = nullptr;
// Whether the line may be drawn: looked at for each character that is written, so it needs no lock.
std::atomic<bool> s_may_draw{false};

bool CanShow() {
  const char* terminal = std::getenv("TERM");
  return isatty(STDERR_FILENO) != 0 && terminal != nullptr && std::string_view(terminal) != "dumb";
}

std::string OnTerminal(const std::string& text) {
  std::ostringstream out;
  {
    EscapingBuffer buffer(*out.rdbuf());
    buffer.sputn(text.data(), static_cast<std::streamsize>(text.size()));
  }
  std::string line = std::move(out).str();
  std::ranges::replace(line, '\n', ' ');
  return line;
}

// Past the streams, which others may have redirected. What can't be shown isn't missed.
void Write(std::string_view text) {
  if (write(STDERR_FILENO, text.data(), text.size()) < 0) s_may_draw = false;
}

}  // namespace

Progress::Progress(const std::string& task, std::chrono::milliseconds patience)
    : start_(std::chrono::steady_clock::now()), patience_(patience), task_(task) {
  if (!CanShow()) return;
  const std::lock_guard<std::mutex> lock(s_lock);
  if (s_current != nullptr) return;
  try {
    thread_ = std::thread(&Progress::Run, this);
  } catch (const std::system_error&) {
    return;  // Without a thread left the work goes on all the same.
  }
  s_current = this;
  s_may_draw = true;
  // Whoever has waited already is told at once, however soon the work is done.
  if (patience_ <= std::chrono::milliseconds(0)) Draw();
}

Progress::~Progress() {
  if (!thread_.joinable()) return;
  {
    const std::lock_guard<std::mutex> lock(s_lock);
    is_done_ = true;
    s_may_draw = false;
    s_current = nullptr;
    Erase();
  }
  changed_.notify_one();
  thread_.join();
}

void Progress::Step(const std::string& step) {
  const std::lock_guard<std::mutex> lock(s_lock);
  if (s_current == nullptr) return;
  s_current->step_ = step;
  s_may_draw = true;
  if (s_current->is_drawn_) s_current->Draw();
}

void Progress::MakeRoom() {
  if (!s_may_draw.load(std::memory_order_relaxed)) return;
  const std::lock_guard<std::mutex> lock(s_lock);
  s_may_draw = false;
  if (s_current != nullptr) s_current->Erase();
}

void Progress::Run() {
  std::unique_lock<std::mutex> lock(s_lock);
  auto next = start_ + patience_;
  while (!changed_.wait_until(lock, next, [this] { return is_done_; })) {
    Draw();
    next += kPatience;
  }
}

void Progress::Draw() {
  if (!s_may_draw || tcgetpgrp(STDERR_FILENO) != getpgrp()) return;
  const auto elapsed = std::chrono::steady_clock::now() - start_;
  const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(elapsed).count();
  std::string text = task_ + (step_.empty() ? "" : ": " + step_);
  if (seconds > 0) text += " (" + std::to_string(seconds) + " s)";
  // The terminal cuts what is too long for it: only it knows how wide characters are.
  Write("\r\x1b[K\x1b[?7l" + OnTerminal(text) + "\x1b[?7h");
  is_drawn_ = true;
}

void Progress::Erase() {
  if (is_drawn_) Write("\r\x1b[K");
  is_drawn_ = false;
}

}  // namespace vexel_yaml
