#include "view/connection.h"

#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>

namespace vexel_yaml {

using std::chrono::milliseconds;
using std::chrono::seconds;

namespace {

constexpr size_t kMostOfHeader = size_t{64} << 10;
constexpr seconds kTimeForHeader{5};
constexpr seconds kTimeForBody{30};
constexpr seconds kTimeForWriting{10};
constexpr milliseconds kTimeForEnd{500};

#ifdef MSG_NOSIGNAL
constexpr int kSendFlags = MSG_NOSIGNAL;
#else
constexpr int kSendFlags = 0;
#endif

}  // namespace

Connection::Connection(int socket)
    : socket_(socket), until_(Clock::now() + kTimeForHeader), allowed_(kMostOfHeader) {}

void Connection::ExpectBody() {
  until_ = Clock::now() + kTimeForBody;
  // With some room for what stands between the chunks of a body.
  allowed_ = 2 * kMostOfBody;
}

void Connection::End() {
  shutdown(socket_, SHUT_WR);
  until_ = Clock::now() + kTimeForEnd;
  allowed_ = 2 * kMostOfBody;
  begin_ = end_;
  while (Fill()) begin_ = end_;
}

bool Connection::WaitFor(short events, Clock::time_point until) const {
  while (true) {
    const auto left = std::chrono::ceil<milliseconds>(until - Clock::now());
    if (left <= milliseconds(0)) return false;
    pollfd waiting = {socket_, events, 0};
    const int ready = poll(&waiting, 1, static_cast<int>(left.count()));
    if (ready > 0) return true;
    if (ready < 0 && errno != EINTR) return false;
  }
}

bool Connection::Fill() {
  while (WaitFor(POLLIN, until_)) {
    const ssize_t count = recv(socket_, buffer_.data(), std::min(buffer_.size(), allowed_), 0);
    if (count < 0 && (errno == EINTR || errno == EAGAIN)) continue;
    if (count <= 0) return false;
    allowed_ -= static_cast<size_t>(count);
    begin_ = 0;
    end_ = static_cast<size_t>(count);
    return true;
  }
  return false;
}

bool Connection::is_readable() const { return begin_ < end_ || WaitFor(POLLIN, until_); }

bool Connection::is_writable() const {
  char byte = 0;
  const ssize_t count = recv(socket_, &byte, 1, MSG_PEEK | MSG_DONTWAIT);
  return count > 0 || (count < 0 && (errno == EAGAIN || errno == EINTR));
}

ssize_t Connection::read(char* target, size_t size) {
  if (begin_ == end_ && !Fill()) return -1;
  const size_t count = std::min(size, end_ - begin_);
  std::copy_n(buffer_.begin() + static_cast<ptrdiff_t>(begin_), count, target);
  begin_ += count;
  return static_cast<ssize_t>(count);
}

ssize_t Connection::write(const char* source, size_t size) {
  const Clock::time_point until = Clock::now() + kTimeForWriting;
  while (WaitFor(POLLOUT, until)) {
    const ssize_t count = send(socket_, source, size, kSendFlags | MSG_DONTWAIT);
    if (count >= 0) return count;
    if (errno != EINTR && errno != EAGAIN) return -1;
  }
  return -1;
}

void Connection::get_remote_ip_and_port(std::string& ip, int& port) const {
  ip = "127.0.0.1";
  port = 0;
}

void Connection::get_local_ip_and_port(std::string& ip, int& port) const { get_remote_ip_and_port(ip, port); }

}  // namespace vexel_yaml
