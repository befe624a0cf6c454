#pragma once

#include <memory>
#include <nlohmann/json_fwd.hpp>
#include <string>
#include <string_view>
#include <vector>

#include "view/page_request.h"
#include "view/settling.h"
#include "view/view_guide.h"

namespace vexel_yaml {

/// What went wrong, as JSON text.
std::string ErrorJson(std::string_view message);

/// All files that one window shows, and what is sent to it, as JSON text. For one thread at a time. Requests
/// that make no sense throw RequestError.
class ViewSession {
 public:
  /// Reads files until one can be read, and throws RequestError with what is wrong with the first if none
  /// can.
  ViewSession(std::vector<ViewFile> files, ViewGuide guide);
  ~ViewSession();

  /// Everything about a file; `file` is its number in digits, or empty for the first one that isn't saved.
  /// One that can't be read has an error in place of cards.
  std::string State(std::string_view file);
  /// What the list of files says of one, which is read for that.
  std::string Summary(std::string_view file);
  /// These take a request's body, which names the file and its revision, and return what has changed. A page
  /// that shows an older revision is refused.
  std::string Choose(std::string_view body);
  std::string Undo(std::string_view body);
  std::string Redo(std::string_view body);
  /// Returns which file comes next, if any. Where none does, it is over, and how to go on is said.
  std::string Save(std::string_view body);
  /// Keeps what is settled so far, and leaves the rest open. Returns what the page is to know then.
  std::string Keep(std::string_view body);
  /// Ends it, and keeps what is settled so far if the body says so. Returns what isn't saved, and how to come
  /// back to it.
  std::string GiveUp(std::string_view body);
  /// The same for whoever has closed the page, where that can be kept. Returns what went wrong.
  std::vector<std::string> KeepUnsaved();

  /// Whether nothing can be changed or saved any more.
  bool IsOver() const { return is_over_; }
  /// Whether every file has been saved.
  bool IsFinished() const;
  /// Whether a file has choices that were made here and are not saved.
  bool HasUnsavedChoices() const;
  /// What can't be read, as far as that was tried, and why.
  std::vector<std::string> GetUnread() const;

 private:
  class OpenFile;

  // Null for a file that can't be read.
  OpenFile* TryToOpen(size_t file);
  OpenFile& Open(size_t file);
  OpenFile& OpenToChange(const nlohmann::ordered_json& request);
  // Goes around once; the number of all files where nothing is left.
  size_t FirstToSettle(size_t from = 0);
  nlohmann::ordered_json Head(size_t file);
  nlohmann::ordered_json Entry(size_t file) const;
  size_t NumberOf(std::string_view file);
  template <typename Step>
  std::string Change(const nlohmann::ordered_json& request, Step step);

  const std::vector<ViewFile> files_;
  const ViewGuide guide_;
  // Null for what can't be read, or nobody has looked at yet.
  std::vector<std::unique_ptr<OpenFile>> open_;
  // Empty for what can be read, or nobody has looked at yet.
  std::vector<std::string> errors_;
  bool is_over_ = false;
};

}  // namespace vexel_yaml
