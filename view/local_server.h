#pragma once

#include <httplib.h>

#include <functional>
#include <list>
#include <string>
#include <string_view>

#include "platform/mutex.h"

namespace vexel_yaml {

/// A web server for one person's browser on the same machine.
///
/// Every page that a browser has open can send requests to it, and so can every program of the machine. So an
/// address holds a secret that only the person has been told, and what comes in the name of another page is
/// refused.
///
/// The library waits for each connection on a thread of its own. Where many are held open, the oldest ones
/// that have not shown the secret are closed, and those that have stay.
class LocalServer final : public httplib::Server {
 public:
  LocalServer();

  /// Binds to `port` of the loopback interface, or to any where it is 0. Throws std::runtime_error.
  void Bind(int port);
  int GetPort() const { return port_; }

  /// Where the page is, for a person.
  std::string GetAddress() const;
  /// The same for the command line of another program, which everybody on the machine can read: it leads to
  /// the page once.
  std::string GetOneTimeAddress();

  /// What follows the secret in a request's path.
  std::string_view GetPlace(const httplib::Request& request) const;

  /// Whether a request shows the secret, and doesn't come from another page.
  bool IsFromPage(const httplib::Request& request) const { return IsTrusted(request) && IsFromHere(request); }

  /// Serves until `End`. To be called once, after `Bind`. `when_ending` is called as soon as nobody new is
  /// let in, be it that the system refuses to.
  void Serve(std::function<void()> when_ending);
  /// From any thread. Ends what goes on.
  void End();

 private:
  struct OpenConnection {
    int socket;
    bool is_trusted = false;
  };

  bool process_and_close_socket(socket_t socket) override;
  HandlerResponse Judge(const httplib::Request& request, httplib::Response& response);
  bool IsTrusted(const httplib::Request& request) const;
  bool IsFromHere(const httplib::Request& request) const;
  bool TakeTicket(std::string_view path);
  void CloseOldest();

  const std::string secret_;
  std::string ticket_;
  int port_ = 0;
  Mutex mutex_;
  // The oldest ones first.
  std::list<OpenConnection> connections_;
  bool is_ending_ = false;
  // By itself or because of `End`.
  bool is_closed_ = false;
};

}  // namespace vexel_yaml
