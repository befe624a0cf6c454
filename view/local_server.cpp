#include "view/local_server.h"

#include <fcntl.h>
#include <sys/random.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <condition_variable>
#include <stdexcept>
#include <system_error>
#include <thread>

#include "platform/error_channel.h"
#include "view/connection.h"

namespace vexel_yaml {

namespace {

constexpr size_t kSecretLength = 32;
// A browser has a handful to one address.
constexpr size_t kMostConnections = 128;

std::string MakeSecret() {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::array<unsigned char, kSecretLength / 2> bytes;
  if (getentropy(bytes.data(), bytes.size()) != 0) {
    throw std::system_error(errno, std::generic_category(), "No random numbers");
  }
  std::string secret;
  for (const unsigned char byte : bytes) {
    secret += kDigits[byte >> 4];
    secret += kDigits[byte & 15];
  }
  return secret;
}

// In a time that doesn't tell how much of a guess is right.
bool IsSame(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  unsigned difference = 0;
  for (size_t i = 0; i < a.size(); ++i) difference |= static_cast<unsigned>(a[i] ^ b[i]);
  return difference == 0;
}

// A thread for each connection, so that none waits for another. The server closes those that are too many.
class ConnectionThreads final : public httplib::TaskQueue {
 public:
  explicit ConnectionThreads(std::function<void()> when_ending) : when_ending_(std::move(when_ending)) {}

  void enqueue(std::function<void()> serve) override {
    {
      const std::lock_guard lock(mutex_);
      ++running_;
    }
    const auto run = [this, serve] {
      serve();
      const std::lock_guard lock(mutex_);
      --running_;
      ended_.notify_all();
    };
    try {
      std::thread(run).detach();
    } catch (const std::system_error&) {
      run();
    }
  }

  void shutdown() override {
    when_ending_();
    std::unique_lock lock(mutex_);
    ended_.wait(lock, [this] { return running_ == 0; });
  }

 private:
  const std::function<void()> when_ending_;
  std::mutex mutex_;
  std::condition_variable ended_;
  size_t running_ = 0;
};

}  // namespace

LocalServer::LocalServer() : secret_(MakeSecret()), ticket_(MakeSecret()) {
  set_address_family(AF_INET);
  // Without the library's own SO_REUSEPORT, by which two servers would share a port and its requests.
  set_socket_options([](socket_t socket) {
    const int on = 1;
    setsockopt(socket, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
    fcntl(socket, F_SETFD, FD_CLOEXEC);
  });
  set_payload_max_length(kMostOfBody);
  set_pre_routing_handler([this](const httplib::Request& request, httplib::Response& response) {
    return Judge(request, response);
  });
  // Without it what went wrong would be told in a header.
  set_exception_handler([](const httplib::Request&, httplib::Response& response, const std::exception_ptr&) {
    response.status = 500;
  });
}

void LocalServer::Bind(int port) {
  constexpr const char* kLoopback = "127.0.0.1";
  if (port == 0) {
    port_ = bind_to_any_port(kLoopback);
  } else if (bind_to_port(kLoopback, port)) {
    port_ = port;
  }
  // The library's own backlog is five, and who finds it full tries again after a second.
  if (port_ > 0 && ::listen(svr_sock_, SOMAXCONN) == 0) return;
  throw std::runtime_error(port == 0 ? "Cannot open a port for the page"
                                     : "Cannot open port " + std::to_string(port) + " for the page");
}

std::string LocalServer::GetAddress() const {
  return "http://127.0.0.1:" + std::to_string(port_) + '/' + secret_ + '/';
}

std::string LocalServer::GetOneTimeAddress() {
  const AutoLock lock(mutex_);
  return "http://127.0.0.1:" + std::to_string(port_) + '/' + ticket_;
}

std::string_view LocalServer::GetPlace(const httplib::Request& request) const {
  return std::string_view(request.path).substr(kSecretLength + 2);
}

void LocalServer::Serve(std::function<void()> when_ending) {
  const auto close = [this, when_ending = std::move(when_ending)] {
    {
      const AutoLock lock(mutex_);
      is_closed_ = true;
      if (!is_ending_) WriteErrorLine("No more requests of the page can be accepted");
    }
    when_ending();
  };
  new_task_queue = [close] { return new ConnectionThreads(close); };
  listen_after_bind();
}

void LocalServer::End() {
  const auto is_closed = [this] {
    const AutoLock lock(mutex_);
    return is_closed_;
  };
  // Not before it has begun, which the library would not notice.
  while (!is_running() && !is_closed()) std::this_thread::sleep_for(std::chrono::milliseconds(1));
  {
    const AutoLock lock(mutex_);
    is_ending_ = true;
    // What is being answered may be finished.
    for (const OpenConnection& connection : connections_) ::shutdown(connection.socket, SHUT_RD);
  }
  // Where the library has ended by itself it would close a descriptor that may be another's by now.
  if (!is_closed()) stop();
}

bool LocalServer::IsTrusted(const httplib::Request& request) const {
  const std::string_view path = request.path;
  return path.size() >= kSecretLength + 2 && path[0] == '/' && path[kSecretLength + 1] == '/' &&
         IsSame(path.substr(1, kSecretLength), secret_);
}

bool LocalServer::process_and_close_socket(socket_t socket) {
  std::list<OpenConnection>::iterator place;
  {
    const AutoLock lock(mutex_);
    if (connections_.size() >= kMostConnections) CloseOldest();
    place = connections_.insert(connections_.end(), {socket});
    if (is_ending_) ::shutdown(socket, SHUT_RD);
  }
  // Not for the programs that saving starts.
  fcntl(socket, F_SETFD, FD_CLOEXEC);
  Connection connection(socket);
  bool is_closed = false;
  const bool is_done = process_request(connection, true, is_closed, [&](httplib::Request& request) {
    // The library would send each of them, thousands of times the whole for one request.
    request.ranges.clear();
    if (!IsTrusted(request)) return;
    const AutoLock lock(mutex_);
    place->is_trusted = true;
    connection.ExpectBody();
  });
  if (is_done) connection.End();
  const AutoLock lock(mutex_);
  connections_.erase(place);
  close(socket);
  return is_done;
}

void LocalServer::CloseOldest() {
  const auto oldest = std::ranges::find(connections_, false, &OpenConnection::is_trusted);
  if (oldest == connections_.end()) return;
  ::shutdown(oldest->socket, SHUT_RDWR);
  // It is closed by its own thread, and is no longer the oldest.
  oldest->is_trusted = true;
}

bool LocalServer::IsFromHere(const httplib::Request& request) const {
  const std::string port = ':' + std::to_string(port_);
  const auto is_own = [&](std::string_view host) {
    // Which is the port of an address that names none.
    if (port_ == 80 && (host == "127.0.0.1" || host == "localhost")) return true;
    return host == "127.0.0.1" + port || host == "localhost" + port;
  };
  if (request.get_header_value_count("Host") != 1 || !is_own(request.get_header_value("Host"))) return false;
  if (request.has_header("Origin")) {
    constexpr std::string_view kScheme = "http://";
    const std::string origin = request.get_header_value("Origin");
    if (!origin.starts_with(kScheme) || !is_own(std::string_view(origin).substr(kScheme.size())))
      return false;
  }
  const std::string site = request.get_header_value("Sec-Fetch-Site");
  return site.empty() || site == "same-origin" || site == "none";
}

bool LocalServer::TakeTicket(std::string_view path) {
  const AutoLock lock(mutex_);
  if (ticket_.empty() || !path.starts_with('/') || !IsSame(path.substr(1), ticket_)) return false;
  ticket_.clear();
  return true;
}

httplib::Server::HandlerResponse LocalServer::Judge(const httplib::Request& request,
                                                    httplib::Response& response) {
  if (IsFromPage(request) && (request.method == "GET" || request.method == "POST")) {
    return HandlerResponse::Unhandled;
  }
  const bool is_trusted = IsTrusted(request);
  response.status = is_trusted ? 403 : 404;
  if (!is_trusted && request.method == "GET" && IsFromHere(request) && TakeTicket(request.path)) {
    response.set_redirect('/' + secret_ + '/', 303);
  }
  return HandlerResponse::Handled;
}

}  // namespace vexel_yaml
