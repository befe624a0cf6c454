#include "git/settings.h"

#include <algorithm>
#include <filesystem>

#include "git/git_call.h"
#include "git/shown_text.h"

namespace vexel_yaml {

namespace {

constexpr int kNothingFound = 1;

ProgramCall Question() {
  ProgramCall call = GitCall(
      {"config", "-z", "--type=path", "--get-regexp", R"(^(vexel\.rules|vexel\.typeinfo|core\.hookspath)$)"});
  // The question is asked again for each of them where this one fails.
  call.errors = ProgramCall::Errors::kDropped;
  return call;
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

}  // namespace

SettingsQuery::SettingsQuery() : question_(Question()) {}

MergeSettings SettingsQuery::Get() {
  MergeSettings settings;
  const ProgramResult answer = question_.Wait();
  if (answer.status == kNothingFound) return settings;
  if (answer.status != 0) {
    ReadAlone("vexel.rules", settings.rules);
    ReadAlone("vexel.typeInfo", settings.type_info);
    settings.has_other_hooks = GitQuietly({"config", "--get", "core.hooksPath"}).status == 0;
    return settings;
  }
  const std::vector<std::string> entries = Pieces(answer.output, '\0');
  TakeFrom(entries, "vexel.rules", "vexel.rules", settings.rules);
  TakeFrom(entries, "vexel.typeinfo", "vexel.typeInfo", settings.type_info);
  settings.has_other_hooks = std::ranges::any_of(
      entries, [](const std::string& entry) { return entry.starts_with("core.hookspath"); });
  return settings;
}

}  // namespace vexel_yaml
