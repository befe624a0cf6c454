#include "git/folder_lock.h"

#include <unistd.h>

#include <chrono>
#include <thread>

#include "git/repository.h"
#include "git/shown_text.h"
#include "platform/temporary_files.h"

namespace vexel_yaml {

FolderLock::FolderLock(const Repository& repository) : path_(repository.CommonPath("vexel-merge.lock")) {
  for (int tries = 1; !MakeTempFolder(path_) && tries <= 100; ++tries) {
    if (tries == 10) {
      Say("waiting for " + path_ + ": another vexel-merge-git has it, or one that was killed has left it");
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(100));
  }
}

FolderLock::~FolderLock() {
  rmdir(path_.c_str());
  ForgetTempFile(path_);
}

}  // namespace vexel_yaml
