#pragma once

#include <chrono>
#include <string>

namespace vexel_yaml {

/// Where git keeps what belongs to the work tree whose top folder is the current one.
class Repository {
 public:
  /// Finds it as git does: by GIT_DIR, else by what is in the top folder. Asks git only where that is not
  /// there, since each question to it costs as much as a small merge.
  Repository();

  /// A file of this work tree's own.
  std::string Path(const std::string& name) const { return folder_ + "/" + name; }

  /// A file that all work trees of the repository share.
  std::string CommonPath(const std::string& name) const { return common_folder_ + "/" + name; }

  /// Whether git is about to change the work tree and the index: it has locked that. A merge that only looks,
  /// such as those of git merge-tree or git show --remerge-diff, has no use for a record, and must not touch
  /// one that is there.
  bool IsChanging() const;

  /// Whether git is in the middle of a merge, a rebase, or a pick of commits.
  bool IsAtWork() const;

  /// For how long git has held the index; nothing where it doesn't.
  std::chrono::milliseconds TimeAtWork() const;

  /// Whether git holds the index right now.
  bool IsLocked() const;

  /// What tells the lock by which git holds it from others; empty where there is none.
  std::string LockMark() const;

 private:
  std::string folder_;
  std::string common_folder_;
};

}  // namespace vexel_yaml
