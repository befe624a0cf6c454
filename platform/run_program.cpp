#include "platform/run_program.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <iostream>
#include <string_view>
#include <utility>

#ifdef __APPLE__
extern char** environ;
#endif

namespace vexel_yaml {

namespace {

struct Pipe {
  int to_read = -1;
  int to_write = -1;
};

Pipe MakePipe() {
  std::array<int, 2> ends = {-1, -1};
  if (pipe(ends.data()) != 0) return {};
  // Another program that is started meanwhile would keep it open.
  for (const int end : ends) fcntl(end, F_SETFD, FD_CLOEXEC);
  return {ends[0], ends[1]};
}

void Close(int& descriptor) {
  if (descriptor >= 0) close(descriptor);
  descriptor = -1;
}

// Ended by a null pointer, as the system wants it.
std::vector<char*> Pointers(const std::vector<std::string>& texts) {
  std::vector<char*> pointers;
  pointers.reserve(texts.size() + 1);
  for (const std::string& text : texts) pointers.push_back(const_cast<char*>(text.c_str()));
  pointers.push_back(nullptr);
  return pointers;
}

std::vector<std::string> EnvironmentOf(const ProgramCall& call) {
  std::vector<std::string> result = call.with;
  for (char** variable = environ; *variable != nullptr; ++variable) {
    const std::string_view text = *variable;
    const std::string_view name = text.substr(0, text.find('='));
    if (std::ranges::find(call.without, name) == call.without.end()) result.emplace_back(text);
  }
  return result;
}

}  // namespace

Program::Program(const ProgramCall& call) : input_(call.input.value_or("")) {
  std::cout.flush();
  Pipe input = call.input ? MakePipe() : Pipe();
  Pipe output = call.returns_output ? MakePipe() : Pipe();
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  if (call.input) posix_spawn_file_actions_adddup2(&actions, input.to_read, STDIN_FILENO);
  if (call.returns_output) posix_spawn_file_actions_adddup2(&actions, output.to_write, STDOUT_FILENO);
  if (call.errors == ProgramCall::Errors::kDropped) {
    posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
  } else if (call.errors == ProgramCall::Errors::kInOutput) {
    posix_spawn_file_actions_adddup2(&actions, STDOUT_FILENO, STDERR_FILENO);
  }
  if (!call.folder.empty()) posix_spawn_file_actions_addchdir_np(&actions, call.folder.c_str());
  posix_spawnattr_t attributes;
  posix_spawnattr_init(&attributes);
  // This process ignores it; a program that inherited that would go on for ever, writing into a closed pipe.
  sigset_t defaults;
  sigemptyset(&defaults);
  sigaddset(&defaults, SIGPIPE);
  posix_spawnattr_setsigdefault(&attributes, &defaults);
  posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF);
  const std::vector<std::string> environment = EnvironmentOf(call);
  const std::vector<char*> arguments = Pointers(call.arguments);
  const bool has_pipes = (!call.input || input.to_read >= 0) && (!call.returns_output || output.to_read >= 0);
  if (!has_pipes || posix_spawnp(&process_, arguments[0], &actions, &attributes, arguments.data(),
                                 Pointers(environment).data()) != 0) {
    process_ = -1;
  }
  posix_spawnattr_destroy(&attributes);
  posix_spawn_file_actions_destroy(&actions);
  Close(input.to_read);
  Close(output.to_write);
  input_descriptor_ = input.to_write;
  output_descriptor_ = output.to_read;
  // A program that waits before it reads must not make this one wait.
  if (input_descriptor_ >= 0) fcntl(input_descriptor_, F_SETFL, O_NONBLOCK);
}

Program::~Program() {
  Close(input_descriptor_);
  Close(output_descriptor_);
}

void Program::Exchange(std::string& output) {
  std::array<pollfd, 2> ready = {{{input_descriptor_, POLLOUT, 0}, {output_descriptor_, POLLIN, 0}}};
  if (poll(ready.data(), ready.size(), -1) < 0) return;
  if (ready[0].revents != 0) {
    const ssize_t count = write(input_descriptor_, input_.data() + written_, input_.size() - written_);
    if (count > 0) written_ += static_cast<size_t>(count);
    // A program that reads no further has its reasons, which its status tells.
    const bool failed = count < 0 && errno != EINTR && errno != EAGAIN;
    is_broken_ |= failed && errno != EPIPE;
    if (failed || written_ == input_.size()) Close(input_descriptor_);
  }
  if (ready[1].revents != 0) {
    std::array<char, 65536> piece;
    const ssize_t count = read(output_descriptor_, piece.data(), piece.size());
    if (count > 0) output.append(piece.data(), static_cast<size_t>(count));
    const bool failed = count < 0 && errno != EINTR;
    is_broken_ |= failed;
    if (failed || count == 0) Close(output_descriptor_);
  }
}

ProgramResult Program::Wait() {
  std::string output;
  while (process_ >= 0 && (input_descriptor_ >= 0 || output_descriptor_ >= 0)) Exchange(output);
  int status = 0;
  pid_t ended = -1;
  while (process_ >= 0 && (ended = waitpid(process_, &status, 0)) < 0 && errno == EINTR) {
  }
  if (ended < 0 || is_broken_) return {127, std::move(output)};
  return {WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status), std::move(output)};
}

ProgramResult RunProgram(const ProgramCall& call) { return Program(call).Wait(); }

}  // namespace vexel_yaml
