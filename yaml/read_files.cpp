#include "yaml/read_files.h"

#include <memory>
#include <optional>

#include "platform/thread.h"
#include "yaml/read_yaml.h"

namespace vexel_yaml {

namespace {

void ReadingThreadFunction(const FileToRead& file, DocumentCache& cache, TimerStat& timer) {
  std::optional<TimerStat> step;
  if (!file.label.empty()) step.emplace(timer, file.label);
  ReadYAMLPath(file.path, file.objects, &cache);
}

void SpawnReadingThread(Thread& thread, const FileToRead& file, DocumentCache& cache, TimerStat& timer) {
  thread.Start([&] { ReadingThreadFunction(file, cache, timer); });
}

void ReadOnThreads(const std::vector<FileToRead>& files, DocumentCache& cache, TimerStat& timer) {
  TimerStat step(timer, "Read base, left and right");
  std::vector<std::unique_ptr<Thread>> readers;
  for (const FileToRead& file : files) {
    SpawnReadingThread(*readers.emplace_back(std::make_unique<Thread>()), file, cache, step);
  }
  for (const auto& reader : readers) reader->Join();
  for (const auto& reader : readers) reader->CheckForExceptions();
}

}  // namespace

void ReadFiles(const std::vector<FileToRead>& files, bool threads, TimerStat& timer, Losses losses) {
  DocumentCache cache(losses == Losses::kRefused);
  if (threads) {
    ReadOnThreads(files, cache, timer);
  } else {
    for (const FileToRead& file : files) ReadingThreadFunction(file, cache, timer);
  }
  // Not before: the order of the lines must not depend on which thread was faster.
  for (const FileToRead& file : files) {
    if (losses == Losses::kRefused) {
      RefuseSkippedKeys(file.path, file.objects);
    } else {
      ReportSkippedKeys(file.path, file.objects);
    }
  }
}

}  // namespace vexel_yaml
