#include "view/view_server.h"

#include <chrono>
#include <condition_variable>
#include <iostream>
#include <mutex>
#include <optional>
#include <stdexcept>

#include "platform/display.h"
#include "platform/error_channel.h"
#include "platform/thread.h"
#include "view/local_server.h"
#include "view/open_browser.h"
#include "view/page_files.h"
#include "view/view_session.h"

namespace vexel_yaml {

namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::seconds;

// Long enough for the page to be loaded again.
constexpr seconds kTimeWithoutPage{5};
constexpr seconds kHeartbeat{1};
// By how much a page's good-bye may come before it is noticed that it has gone.
constexpr seconds kTimeToGo{10};

// For how long the page is shown.
class Lifetime {
 public:
  explicit Lifetime(seconds idle) : idle_(idle) {}

  void NoteRequest() {
    const std::lock_guard lock(mutex_);
    last_request_ = Clock::now();
  }

  void PageCame() {
    const std::lock_guard lock(mutex_);
    ++pages_;
    bye_.reset();
  }

  void PageWent() {
    const std::lock_guard lock(mutex_);
    --pages_;
    gone_since_ = Clock::now();
    changed_.notify_all();
  }

  // A page that is closed or loaded again says so; one whose connection has broken can't.
  void PageSaidBye() {
    const std::lock_guard lock(mutex_);
    bye_ = Clock::now();
    changed_.notify_all();
  }

  void SetUnsaved(bool has_unsaved) {
    const std::lock_guard lock(mutex_);
    has_unsaved_ = has_unsaved;
  }

  void End() {
    const std::lock_guard lock(mutex_);
    is_ended_ = true;
    changed_.notify_all();
  }

  // Until then or a heartbeat long; whether it goes on.
  bool WaitForHeartbeat() {
    std::unique_lock lock(mutex_);
    return !changed_.wait_for(lock, kHeartbeat, [this] { return is_ended_; });
  }

  void WaitForEnd() {
    std::unique_lock lock(mutex_);
    while (!is_ended_) {
      const Clock::time_point now = Clock::now();
      if (now >= last_request_ + idle_) return;
      if (IsClosed(now)) return;
      changed_.wait_for(lock, seconds(1));
    }
  }

 private:
  // For good: whoever has made choices comes back for them when the connection has broken.
  bool IsClosed(Clock::time_point now) const {
    if (!gone_since_ || pages_ > 0 || now < *gone_since_ + kTimeWithoutPage) return false;
    return !has_unsaved_ || (bye_ && *bye_ + kTimeToGo >= *gone_since_);
  }

  std::mutex mutex_;
  std::condition_variable changed_;
  const seconds idle_;
  Clock::time_point last_request_ = Clock::now();
  std::optional<Clock::time_point> gone_since_;
  std::optional<Clock::time_point> bye_;
  bool has_unsaved_ = false;
  int pages_ = 0;
  bool is_ended_ = false;
};

// What the page asks for.
class ViewServer {
 public:
  ViewServer(std::vector<ViewFile> files, const ViewServerOptions& options, ViewGuide guide)
      : is_review_(files.front().is_review),
        session_(std::move(files), std::move(guide)),
        lifetime_(seconds(options.idle_seconds)) {
    server_.set_default_headers({{"Content-Security-Policy", Policy()},
                                 {"X-Content-Type-Options", "nosniff"},
                                 {"X-Frame-Options", "DENY"},
                                 {"Referrer-Policy", "no-referrer"},
                                 {"Cache-Control", "no-store"},
                                 {"Cross-Origin-Opener-Policy", "same-origin"},
                                 {"Cross-Origin-Resource-Policy", "same-origin"},
                                 {"Cross-Origin-Embedder-Policy", "require-corp"}});
    server_.Get(".*", [this](const Request& request, Response& response) { OnGet(request, response); });
    server_.Post(".*", [this](const Request& request, Response& response) { OnPost(request, response); });
    server_.set_error_handler([this](const Request& request, Response& response) {
      if (!server_.IsFromPage(request) || response.status == 403 || !response.body.empty()) return;
      const bool is_large = response.status == 413;
      response.set_content(ErrorJson(is_large ? "These are too many choices at once" : "This can't be done"),
                           "application/json");
    });
    server_.Bind(options.port);
  }

  int Run(bool opens_browser) {
    std::cout << server_.GetAddress() << std::endl;
    // Not with the whole work done, when the output is flushed at the end.
    if (!std::cout) throw std::runtime_error("Cannot print the address of the page");
    Thread serving;
    serving.Start([this] { server_.Serve([this] { lifetime_.End(); }); });
    if (opens_browser && !(HasDisplay() && OpenBrowser(server_.GetOneTimeAddress()))) {
      const std::string port = std::to_string(server_.GetPort());
      WriteErrorLine("Open this address in a browser. From another machine, first: ssh -L " + port +
                     ":127.0.0.1:" + port + " and this machine's name");
    }
    lifetime_.WaitForEnd();
    lifetime_.End();
    server_.End();
    serving.Join();
    if (!session_.IsOver()) {
      for (const std::string& error : session_.KeepUnsaved()) WriteErrorLine(error);
    }
    const std::vector<std::string> unread = session_.GetUnread();
    for (const std::string& error : unread) WriteErrorLine(error);
    return session_.IsFinished() || (is_review_ && unread.empty()) ? 0 : 1;
  }

 private:
  using Request = httplib::Request;
  using Response = httplib::Response;

  static std::string Policy() {
    return "default-src 'none'; style-src '" + std::string(kViewStyleHash) + "'; script-src '" +
           std::string(kViewScriptHash) +
           "'; connect-src 'self'; img-src data:; base-uri 'none'; form-action 'none'; frame-ancestors "
           "'none'";
  }

  // Answers with what `answer` returns, or with what speaks against it.
  template <typename Answer>
  void Reply(Response& response, Answer answer) {
    const std::lock_guard lock(mutex_);
    try {
      response.set_content(answer(), "application/json");
    } catch (const RequestError& error) {
      response.status = error.GetStatus();
      response.set_content(ErrorJson(error.what()), "application/json");
    }
    lifetime_.SetUnsaved(session_.HasUnsavedChoices());
  }

  void OnGet(const Request& request, Response& response) {
    lifetime_.NoteRequest();
    const std::string_view place = server_.GetPlace(request);
    if (place.empty()) {
      response.set_content(kViewPage.data(), kViewPage.size(), "text/html; charset=utf-8");
    } else if (place == "state") {
      Reply(response, [&] { return session_.State(request.get_param_value("file")); });
    } else if (place == "summary") {
      Reply(response, [&] { return session_.Summary(request.get_param_value("file")); });
    } else if (place == "events") {
      SendEvents(response);
    } else {
      response.status = 404;
    }
  }

  void OnPost(const Request& request, Response& response) {
    lifetime_.NoteRequest();
    const std::string_view place = server_.GetPlace(request);
    const std::string_view body = request.body;
    if (!request.get_header_value("Content-Type").starts_with("application/json")) {
      response.status = 400;
      response.set_content(ErrorJson("The request is no JSON"), "application/json");
    } else if (place == "bye") {
      lifetime_.PageSaidBye();
      response.set_content("{}", "application/json");
    } else if (place == "choose") {
      Reply(response, [&] { return session_.Choose(body); });
    } else if (place == "undo") {
      Reply(response, [&] { return session_.Undo(body); });
    } else if (place == "redo") {
      Reply(response, [&] { return session_.Redo(body); });
    } else if (place == "save") {
      Reply(response, [&] {
        std::string saved = session_.Save(body);
        if (session_.IsOver()) lifetime_.End();
        return saved;
      });
    } else if (place == "keep") {
      Reply(response, [&] { return session_.Keep(body); });
    } else if (place == "give-up") {
      Reply(response, [&] {
        std::string left = session_.GiveUp(body);
        lifetime_.End();
        return left;
      });
    } else {
      response.status = 404;
    }
  }

  // Tells the page that the program is there, and the program that the page is.
  void SendEvents(Response& response) {
    lifetime_.PageCame();
    response.set_chunked_content_provider(
        "text/event-stream",
        [this](size_t offset, httplib::DataSink& sink) {
          // A browser by itself waits longer before it connects again than a page may be away.
          const std::string_view event = offset == 0 ? "retry: 500\n\n" : ":\n\n";
          if (!sink.write(event.data(), event.size())) return false;
          if (!lifetime_.WaitForHeartbeat()) sink.done();
          return true;
        },
        [this](bool) { lifetime_.PageWent(); });
  }

  const bool is_review_;
  // Held by whoever uses the session.
  std::mutex mutex_;
  ViewSession session_;
  Lifetime lifetime_;
  LocalServer server_;
};

}  // namespace

int RunViewServer(std::vector<ViewFile> files, const ViewServerOptions& options, ViewGuide guide) {
  return ViewServer(std::move(files), options, std::move(guide)).Run(options.opens_browser);
}

}  // namespace vexel_yaml
