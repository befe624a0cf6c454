#include "git/repository.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>

#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

std::string Variable(const char* name) {
  const char* value = std::getenv(name);
  return value == nullptr ? std::string() : std::string(value);
}

// The path in a small file of git's, behind `prefix`; relative ones start from `folder`. Empty where there is
// none.
std::string PathIn(const std::string& file, const std::string& folder, const std::string& prefix) {
  std::string text = TextOf(file);
  while (text.ends_with('\n') || text.ends_with('\r')) text.pop_back();
  if (!text.starts_with(prefix)) return {};
  std::error_code error;
  const std::filesystem::path path = std::filesystem::path(folder) / text.substr(prefix.size());
  return std::filesystem::canonical(path, error).string();
}

std::string FindFolder() {
  if (std::string named = Variable("GIT_DIR"); !named.empty()) return named;
  if (IsFolder(".git")) return ".git";
  // Of a linked work tree or a submodule.
  if (std::string linked = PathIn(".git", ".", "gitdir: "); IsFolder(linked)) return linked;
  const ProgramResult result = Git({"rev-parse", "--absolute-git-dir"});
  if (result.status != 0) throw Refusal();
  return Line(result);
}

}  // namespace

Repository::Repository() : folder_(FindFolder()), common_folder_(Variable("GIT_COMMON_DIR")) {
  if (common_folder_.empty()) common_folder_ = PathIn(folder_ + "/commondir", folder_, "");
  if (common_folder_.empty()) common_folder_ = folder_;
}

bool Repository::IsLocked() const { return FileExists(Path("index.lock")); }

std::string Repository::LockMark() const {
  struct stat status = {};
  if (stat(Path("index.lock").c_str(), &status) != 0) return {};
  return std::to_string(status.st_ino) + " " + std::to_string(status.st_mtime) + "\n";
}

bool Repository::IsAtWork() const {
  for (const char* name : {"MERGE_HEAD", "CHERRY_PICK_HEAD", "REVERT_HEAD", "rebase-merge", "rebase-apply"}) {
    if (FileExists(Path(name))) return true;
  }
  return false;
}

std::chrono::milliseconds Repository::TimeAtWork() const {
  struct stat status = {};
  if (stat(Path("index.lock").c_str(), &status) != 0) return {};
  const auto since = std::chrono::system_clock::from_time_t(status.st_mtime);
  const auto elapsed = std::chrono::system_clock::now() - since;
  return std::max(std::chrono::milliseconds(0),
                  std::chrono::duration_cast<std::chrono::milliseconds>(elapsed));
}

bool Repository::IsChanging() const {
  if (!IsLocked()) return false;
  if (FileExists(".git") || !Variable("GIT_WORK_TREE").empty()) return true;
  return Line(Git({"rev-parse", "--is-inside-work-tree"})) == "true";
}

}  // namespace vexel_yaml
