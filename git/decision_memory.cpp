#include "git/decision_memory.h"

#include <sys/stat.h>

#include <chrono>
#include <filesystem>

#include "git/git_call.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

constexpr std::chrono::hours kAge{60 * 24};

}  // namespace

DecisionMemory::DecisionMemory(const Repository& repository)
    : folder_(repository.CommonPath("vexel-merge-decisions")) {}

std::vector<std::string> DecisionMemory::Recall(const std::vector<RecordedConflict>& conflicts) const {
  std::vector<std::string> lines;
  if (!IsFolder(folder_)) return lines;
  for (const RecordedConflict& conflict : conflicts) {
    const std::string path = folder_ + "/" + conflict.key;
    if (conflict.is_settled || !IsFile(path)) continue;
    const std::string word = TextOf(path);
    if (word != "left" && word != "right" && word != "base") continue;
    lines.push_back(word + " " + conflict.place);
    std::error_code error;
    std::filesystem::last_write_time(path, std::filesystem::file_time_type::clock::now(), error);
  }
  return lines;
}

void DecisionMemory::Remember(const std::vector<RecordedConflict>& conflicts,
                              const std::map<std::string, std::string>& choices) const {
  ForgetOld();
  for (const RecordedConflict& conflict : conflicts) {
    const auto choice = choices.find(conflict.place);
    if (!conflict.is_settled || choice == choices.end()) continue;
    mkdir(folder_.c_str(), 0777);
    // Without a memory, people are asked again.
    PutFile(folder_ + "/" + conflict.key, choice->second);
  }
}

void DecisionMemory::ForgetOld() const {
  if (!IsFolder(folder_)) return;
  const auto oldest = std::filesystem::file_time_type::clock::now() - kAge;
  std::error_code error;
  for (const auto& file : std::filesystem::directory_iterator(folder_, error)) {
    const auto used = file.last_write_time(error);
    if (!error && used < oldest) std::filesystem::remove(file.path(), error);
  }
}

}  // namespace vexel_yaml
