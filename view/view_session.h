#pragma once

#include <memory>
#include <nlohmann/json_fwd.hpp>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "view/settling.h"

namespace vexel_yaml {

/// A request that can't be carried out, with the status that HTTP has for it and a text for people.
class RequestError : public std::runtime_error {
 public:
  RequestError(int status, const std::string& message) : std::runtime_error(message), status_(status) {}
  int GetStatus() const { return status_; }

 private:
  int status_;
};

/// What went wrong, as JSON text.
std::string ErrorJson(std::string_view message);

/// All files that one window shows, and what is sent to it, as JSON text. For one thread at a time. Requests
/// that make no sense throw RequestError.
class ViewSession {
 public:
  explicit ViewSession(std::vector<ViewFile> files);
  ~ViewSession();

  /// Everything about a file; `file` is its number in digits, or empty for the first one that isn't saved.
  std::string State(std::string_view file);
  /// These take a request's body, which names the file and its revision, and return what has changed. A page
  /// that shows an older revision is refused.
  std::string Choose(std::string_view body);
  std::string Undo(std::string_view body);
  std::string Redo(std::string_view body);
  /// Returns which file comes next, if any.
  std::string Save(std::string_view body);
  /// Nothing is changed or saved from now on.
  void GiveUp() { is_given_up_ = true; }

  /// Whether every file has been saved.
  bool IsFinished() const;

 private:
  class OpenFile;

  OpenFile& Open(size_t file);
  OpenFile& OpenToChange(const nlohmann::ordered_json& request);
  size_t FirstUnsaved(size_t from) const;
  nlohmann::ordered_json Head(size_t file);
  template <typename Step>
  std::string Change(const nlohmann::ordered_json& request, Step step);

  const std::vector<ViewFile> files_;
  // Null for what nobody has looked at yet.
  std::vector<std::unique_ptr<OpenFile>> open_;
  bool is_given_up_ = false;
};

}  // namespace vexel_yaml
