#pragma once

#include <httplib.h>

#include <array>
#include <chrono>
#include <cstddef>

namespace vexel_yaml {

/// What a request's body may hold: some hundred thousand choices.
inline constexpr size_t kMostOfBody = size_t{32} << 20;

/// One connection to the page. A peer that is slow or never reads is given up after a while, and what it may
/// send is limited, so that it costs no more than a thread for that time.
class Connection final : public httplib::Stream {
 public:
  /// `socket` stays the caller's.
  explicit Connection(int socket);

  /// Lets the request's body follow its header.
  void ExpectBody();
  /// Ends the answer, and takes in what the peer still sends: closed before, the connection would be reset,
  /// and the answer lost.
  void End();

  bool is_readable() const override;
  /// False as soon as the peer is gone.
  bool is_writable() const override;
  ssize_t read(char* target, size_t size) override;
  ssize_t write(const char* source, size_t size) override;
  void get_remote_ip_and_port(std::string& ip, int& port) const override;
  void get_local_ip_and_port(std::string& ip, int& port) const override;
  socket_t socket() const override { return socket_; }

 private:
  using Clock = std::chrono::steady_clock;

  bool WaitFor(short events, Clock::time_point until) const;
  bool Fill();

  int socket_;
  Clock::time_point until_;
  size_t allowed_;
  std::array<char, 16384> buffer_;
  size_t begin_ = 0;
  size_t end_ = 0;
};

}  // namespace vexel_yaml
