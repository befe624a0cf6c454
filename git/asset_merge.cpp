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
    } catch (const std::exception&) {
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

int AssetMerge::Merge(const AssetVersions& versions, const MergeSettings& settings,
                      const Decisions* decisions) {
  TimerStat silent("", nullptr);
  LoadRulesAndTypes(settings);
  ReadMergeDocuments(versions.base, versions.left, versions.right, documents_, true, silent);
  PrepareForDiff(documents_.base, documents_.left, documents_.right);
  diffs_ =
      CreateDiffPair({documents_.base, documents_.left}, {documents_.base, documents_.right}, true, silent);
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
  WriteObjects(*merged_, text, true);
  text_ = std::move(text).str();
  if (!resolver_.HasPendingConflicts()) return kMerged;
  conflicts_ = ListConflicts(resolver_);
  return breaks_dependency ? kBrokenDependencies : kConflicts;
}

int AssetMerge::Run(const AssetVersions& versions, const MergeSettings& settings,
                    const Decisions* decisions) {
  if (IsEmpty(versions.base)) {
    Complain("both sides have added " + versions.asset + ", so there is no base to merge it with");
    return kFailed;
  }
  const std::string prefix = "Cannot merge file '" + versions.base + "': ";
  std::string failure;
  std::string messages;
  int status = kFailed;
  {
    const CapturedErrors captured;
    try {
      status = Merge(versions, settings, decisions);
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
    messages = captured.Text();
  }
  SayMessages(messages + failure, versions);
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
