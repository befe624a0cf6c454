#pragma once

#include <string>

namespace vexel_yaml {

class Repository;

/// While no other process of ours is in here, from whichever work tree of the repository.
///
/// One that was killed may have left the lock: nobody holds it for long, so that after ten seconds it doesn't
/// count any more. Who waits is told after one.
class FolderLock {
 public:
  explicit FolderLock(const Repository& repository);
  FolderLock(const FolderLock&) = delete;
  FolderLock& operator=(const FolderLock&) = delete;
  ~FolderLock();

 private:
  std::string path_;
};

}  // namespace vexel_yaml
