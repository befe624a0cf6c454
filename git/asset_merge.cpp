#include "git/asset_merge.h"

#include <exception>
#include <iostream>
#include <new>
#include <sstream>

#include "fixups/post_process.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "merge/conflict_record_file.h"
#include "platform/file_error.h"
#include "platform/thread.h"
#include "report/merged_files.h"
#include "report/value_text.h"
#include "rules/setup.h"
#include "yaml/write_objects.h"

namespace vexel_yaml {

namespace {

// A mistake in what the user has decided, which says its line.
class DecisionError : public std::runtime_error {
  using std::runtime_error::runtime_error;
};

// What is written to standard error in its lifetime, for messages that name temporary files.
class CapturedErrors {
 public:
  CapturedErrors() : previous_(std::cerr.rdbuf(text_.rdbuf())) {}
  CapturedErrors(const CapturedErrors&) = delete;
  CapturedErrors& operator=(const CapturedErrors&) = delete;
  ~CapturedErrors() { std::cerr.rdbuf(previous_); }

  std::string Text() const { return text_.str(); }

 private:
  std::ostringstream text_;
  std::streambuf* previous_;
};

// Both stay loaded, and can be loaded only once a process: what is wrong with them is wrong for every merge.
void LoadRulesAndTypes(const MergeSettings& settings) {
  static const std::exception_ptr failure = [&]() -> std::exception_ptr {
    try {
      TimerStat silent("", nullptr);
      SetupRulesAndTypes(settings.rules, settings.type_info, silent);
      return nullptr;
    } catch (...) {
      return std::current_exception();
    }
  }();
  if (failure) std::rethrow_exception(failure);
}

void Replace(std::string& text, const std::string& name, const std::string& by) {
  for (size_t at = 0; (at = text.find(name, at)) != std::string::npos; at += by.size()) {
    text.replace(at, name.size(), by);
  }
}

}  // namespace

void SayMessages(std::string messages, const AssetVersions& versions) {
  if (messages.empty()) return;
  if (messages.ends_with('\n')) messages.pop_back();
  const std::string asset = "'" + Shown(versions.asset) + "'";
  Replace(messages, "'" + versions.base + "'", asset);
  Replace(messages, "'" + versions.left + "'", asset + " (theirs)");
  Replace(messages, "'" + versions.right + "'", asset + " (ours)");
  std::cerr << messages << '\n' << std::flush;
}

bool AssetVersions::HasAsset() const { return IsAsset(right) || IsAsset(left) || IsAsset(base); }

void AssetMerge::Read() {
  is_read_ = true;
  const CapturedErrors captured;
  try {
    TimerStat silent("", nullptr);
    threads_ = AreWorthThreads({versions_.base, versions_.left, versions_.right});
    ReadMergeDocuments(versions_.base, versions_.left, versions_.right, documents_, threads_, silent);
  } catch (...) {
    read_failure_ = std::current_exception();
  }
  messages_ = captured.Text();
}

int AssetMerge::Merge(const MergeSettings& settings, const Decisions* decisions) {
  TimerStat silent("", nullptr);
  // What is wrong with these is told first.
  LoadRulesAndTypes(settings);
  if (read_failure_) std::rethrow_exception(read_failure_);
  PrepareForDiff(documents_.base, documents_.left, documents_.right);
  diffs_ = CreateDiffPair({documents_.base, documents_.left}, {documents_.base, documents_.right}, threads_,
                          silent);
  if (decisions != nullptr) {
    std::istringstream stream(decisions->text);
    try {
      InputConflictRecords(stream, resolver_);
    } catch (const YAMLError& error) {
      throw DecisionError(Shown(decisions->record) + ": " + OnOneLine(error.what()));
    }
  }
  merged_ = MergeIntoCopy(documents_.base, diffs_, resolver_, silent);
  const bool breaks_dependency = PostProcess(*merged_, documents_.left, documents_.right, resolver_);
  std::ostringstream text;
  WriteObjects(*merged_, text, threads_);
  text_ = std::move(text).str();
  if (!resolver_.HasPendingConflicts()) return kMerged;
  conflicts_ = ListConflicts(resolver_);
  return breaks_dependency ? kBrokenDependencies : kConflicts;
}

int AssetMerge::Run(const MergeSettings& settings, const Decisions* decisions) {
  if (IsEmpty(versions_.base)) {
    Complain("both sides have added " + versions_.asset + ", so there is no base to merge it with");
    return kFailed;
  }
  if (!is_read_) Read();
  const std::string prefix = "Cannot merge file '" + versions_.base + "': ";
  std::string failure;
  int status = kFailed;
  {
    const CapturedErrors captured;
    try {
      status = Merge(settings, decisions);
    } catch (const std::bad_alloc&) {
      throw;
    } catch (const DecisionError& error) {
      failure = error.what();
    } catch (const FileError& error) {
      failure = OnOneLine(error.what());
    } catch (const YAMLError& error) {
      failure = OnOneLine(prefix + Explained(error));
    } catch (const std::exception& error) {
      failure = OnOneLine(prefix + Explained(error));
    }
    messages_ += captured.Text();
  }
  SayMessages(messages_ + failure, versions_);
  return status;
}

std::string AssetMerge::GetRecord() const {
  std::ostringstream out;
  OutputConflictRecords(out, resolver_, false);
  return std::move(out).str();
}

void SayConflicts(const std::string& asset, const std::vector<ListedConflict>& conflicts) {
  const std::string name = Shown(asset);
  for (const ListedConflict& conflict : conflicts) {
    std::cerr << "CONFLICT " << name << ": " << conflict.place << ": left " << conflict.left << ", right "
              << conflict.right << '\n';
  }
  std::cerr.flush();
}

std::string Count(const std::vector<ListedConflict>& conflicts) {
  return conflicts.size() == 1 ? "1 conflict" : std::to_string(conflicts.size()) + " conflicts";
}

}  // namespace vexel_yaml
