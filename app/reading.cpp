#include "app/reading.h"

#include <memory>

#include "platform/thread.h"
#include "yaml/read_yaml.h"

namespace vexel_yaml {

void ReadFiles(const std::vector<FileToRead>& files, bool threads, TimerStat& timer) {
  DocumentCache cache;
  if (!threads) {
    for (const FileToRead& file : files) {
      TimerStat step(timer, file.label);
      ReadYAMLPath(file.path, file.objects, &cache);
    }
    return;
  }
  TimerStat step(timer, "Read base, left and right");
  std::vector<std::unique_ptr<Thread>> readers;
  for (const FileToRead& file : files) {
    readers.push_back(std::make_unique<Thread>());
    readers.back()->Start([&file, &cache] { ReadYAMLPath(file.path, file.objects, &cache); });
  }
  for (const auto& reader : readers) reader->Join();
  for (const auto& reader : readers) reader->CheckForExceptions();
}

}  // namespace vexel_yaml
