#include "git/record_entry.h"

#include <algorithm>
#include <set>

#include "git/git_call.h"
#include "git/path_names.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kSettled = "settled";
constexpr std::string_view kPending = "pending";
// Path, two blobs and two names; 1.0.1 knew the first two.
constexpr size_t kLinesBefore = 5;

}  // namespace

size_t RecordEntry::CountPending() const {
  return static_cast<size_t>(std::ranges::count(conflicts, false, &RecordedConflict::is_settled));
}

RecordEntry ReadEntry(const std::string& path) {
  std::vector<std::string> lines = Pieces(TextOf(path), '\n');
  const size_t count = lines.size();
  lines.resize(std::max(count, kLinesBefore));
  RecordEntry entry = {UnquotedPath(lines[0]), lines[1], {lines[3], lines[4]}, {}, lines[2]};
  for (size_t i = kLinesBefore; i < count; ++i) {
    const std::vector<std::string> fields = Pieces(lines[i], '\t');
    if (fields.size() == 4)
      entry.conflicts.push_back({fields[1], fields[3], fields[2], fields[0] == kSettled});
  }
  return entry;
}

bool WriteEntry(const std::string& path, const RecordEntry& entry) {
  std::string text = QuotedPath(entry.asset) + "\n" + entry.hash + "\n" + entry.told_hash;
  text += "\n" + entry.names.theirs + "\n" + entry.names.ours + "\n";
  for (const RecordedConflict& conflict : entry.conflicts) {
    text += conflict.is_settled ? kSettled : kPending;
    text += "\t" + conflict.place + "\t" + conflict.key + "\t" + conflict.text + "\n";
  }
  return PutFile(path, text);
}

std::vector<RecordedConflict> ConflictsAfter(AssetMerge& merge, const std::string& asset,
                                             const SideNames& names,
                                             const std::vector<RecordedConflict>& earlier) {
  std::vector<RecordedConflict> conflicts;
  std::set<std::string> pending;
  for (const NamedConflict& conflict : merge.GetConflicts()) {
    pending.insert(conflict.place);
    const std::string key = HashedPath(asset + '\n' + conflict.place + '\n' + conflict.edits);
    conflicts.push_back({conflict.place, ConflictLine(conflict, names.theirs, names.ours), key, false});
  }
  for (RecordedConflict conflict : earlier) {
    conflict.is_settled = true;
    if (!pending.contains(conflict.place)) conflicts.push_back(std::move(conflict));
  }
  return conflicts;
}

}  // namespace vexel_yaml
