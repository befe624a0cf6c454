#include "git/settings.h"

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <string_view>

#include "git/git_call.h"
#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

constexpr int kNothingFound = 1;

ProgramCall Question() {
  // The question is asked again for each of them where this one fails.
  return QuietCall({"config", "-z", "--type=path", "--get-regexp",
                    R"(^(vexel\.(rules|typeinfo|safe)|core\.hookspath|rerere\.(enabled|autoupdate))$)"});
}

std::string PathSetting(const std::string& value, const std::string& key) {
  if (value.empty()) throw CommandError(key + " in git's configuration must be a path");
  return (std::filesystem::current_path() / value).string();
}

// Leaves `target` as it is where the key is not set.
void ReadAlone(const std::string& key, std::string& target) {
  const ProgramResult result = Git({"config", "--type=path", "--get", key});
  if (result.status != kNothingFound) target = PathSetting(result.status == 0 ? Line(result) : "", key);
}

// The same of an answer in which the last value of each key counts.
void TakeFrom(const std::vector<std::string>& entries, const std::string& key, const std::string& shown_key,
              std::string& target) {
  const auto last = std::find_if(entries.rbegin(), entries.rend(),
                                 [&](const std::string& entry) { return entry.starts_with(key + '\n'); });
  if (last != entries.rend()) target = PathSetting(last->substr(key.size() + 1), shown_key);
}

// Also of a word that git would take for true or false.
bool IsTrue(std::string_view value, const std::string& key) {
  std::string word(value);
  std::ranges::transform(word, word.begin(),
                         [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  for (const char* yes : {"true", "yes", "on"}) {
    if (word == yes) return true;
  }
  for (const char* no : {"false", "no", "off", "0", ""}) {
    if (word == no) return false;
  }
  if (word.find_first_not_of("0123456789") == std::string::npos) return true;
  throw CommandError(key + " in git's configuration must be true or false");
}

void ReadAlone(const std::string& key, bool& target) {
  const ProgramResult result = Git({"config", "--type=bool", "--get", key});
  if (result.status == 0) target = Line(result) == "true";
  if (result.status > kNothingFound)
    throw CommandError(key + " in git's configuration must be true or false");
}

// A key without a value is true.
void TakeFrom(const std::vector<std::string>& entries, const std::string& key, bool& target) {
  const auto last = std::find_if(entries.rbegin(), entries.rend(), [&](const std::string& entry) {
    return entry == key || entry.starts_with(key + '\n');
  });
  if (last != entries.rend()) target = *last == key || IsTrue(last->substr(key.size() + 1), key);
}

}  // namespace

SettingsQuery::SettingsQuery() : question_(Question()) {}

MergeSettings SettingsQuery::Get() {
  MergeSettings settings;
  const ProgramResult answer = question_.Wait();
  if (answer.status == kNothingFound) return settings;
  if (answer.status != 0) {
    ReadAlone("vexel.rules", settings.rules);
    ReadAlone("vexel.typeInfo", settings.type_info);
    ReadAlone("vexel.safe", settings.is_safe);
    ReadAlone("rerere.enabled", settings.remembers_decisions);
    ReadAlone("rerere.autoUpdate", settings.stages_remembered);
    ReadAlone("core.hooksPath", settings.hooks_folder);
    return settings;
  }
  const std::vector<std::string> entries = Pieces(answer.output, '\0');
  TakeFrom(entries, "vexel.rules", "vexel.rules", settings.rules);
  TakeFrom(entries, "vexel.typeinfo", "vexel.typeInfo", settings.type_info);
  TakeFrom(entries, "vexel.safe", settings.is_safe);
  TakeFrom(entries, "rerere.enabled", settings.remembers_decisions);
  TakeFrom(entries, "rerere.autoupdate", settings.stages_remembered);
  TakeFrom(entries, "core.hookspath", "core.hooksPath", settings.hooks_folder);
  return settings;
}

}  // namespace vexel_yaml
