#include "git/marked_block.h"

#include <unistd.h>

#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

constexpr std::string_view kBegin = "# vexel-merge-git begin (\"vexel-merge-git disable\" removes this)";
constexpr std::string_view kEnd = "# vexel-merge-git end";

struct Parts {
  std::string before;  ///< With the first mark.
  std::string inside;
  std::string after;  ///< With the second mark.
  std::string outside;
  bool has_block = false;
  bool ends_with_block = false;
  bool is_whole = true;
};

// Line ends may have become a network's.
std::string_view WithoutCarriageReturn(std::string_view line) {
  if (line.ends_with('\r')) line.remove_suffix(1);
  return line;
}

Parts Split(const std::string& path) {
  Parts parts;
  bool is_within = false;
  bool is_pair = true;
  const std::string text = TextOf(path);
  for (const std::string& raw : Pieces(text, '\n')) {
    const std::string line(WithoutCarriageReturn(raw));
    parts.ends_with_block = line == kEnd;
    if (line == kBegin) {
      is_pair = is_pair && !parts.has_block;
      parts.has_block = is_within = true;
      parts.before += raw + '\n';
    } else if (line == kEnd) {
      is_pair = is_pair && is_within;
      is_within = false;
      parts.after += raw + '\n';
    } else if (is_within) {
      parts.inside += line + '\n';
    } else {
      parts.outside += raw + '\n';
      (parts.has_block ? parts.after : parts.before) += raw + '\n';
    }
  }
  if (!is_pair || is_within) {
    throw CommandError("in " + path + ", the lines '" + std::string(kBegin) + "' and '" + std::string(kEnd) +
                       "' are not a pair: put that right first");
  }
  parts.is_whole = text.empty() || text.ends_with('\n');
  return parts;
}

std::string WithoutFinalNewline(std::string text) {
  if (text.ends_with('\n')) text.pop_back();
  return text;
}

}  // namespace

std::optional<std::string> SetupState::Recall(const std::string& key) const {
  const ProgramResult result = GitQuietly({"config", "-f", path_, "--get", key});
  if (result.status != 0) return std::nullopt;
  return Line(result);
}

void SetupState::Remember(const std::string& key, const std::string& value) const {
  if (Git({"config", "-f", path_, key, value}).status != 0) throw CommandError("cannot write " + path_);
}

bool MarkedBlock::Exists() const { return Split(path_).has_block; }

bool MarkedBlock::Set(const std::string& lines) const {
  const Parts parts = Split(path_);
  if (parts.has_block && WithoutFinalNewline(parts.inside) == lines) return false;
  const std::string key = "file." + name_ + ".before";
  if (parts.has_block) {
    if (!state_.Recall(key)) {
      state_.Remember(key, "marked");
      ReplaceOwnFile(state_.Beside(name_), parts.inside);
    }
    ReplaceOwnFile(path_, parts.before + lines + "\n" + parts.after);
    return true;
  }
  const bool exists = IsFile(path_);
  state_.Remember(key, !exists ? "absent" : parts.is_whole ? "there" : "open");
  if (!MakeFoldersFor(path_)) throw CommandError("cannot write " + path_);
  ReplaceOwnFile(path_, parts.outside + std::string(kBegin) + "\n" + lines + "\n" + std::string(kEnd) + "\n");
  return true;
}

void MarkedBlock::Restore() const {
  const std::optional<std::string> before = state_.Recall("file." + name_ + ".before");
  if (!before) return;
  const Parts parts = Split(path_);
  if (!parts.has_block) return;
  if (*before == "marked") {
    std::string inside = TextOf(state_.Beside(name_));
    // 1.0.1 remembered it among the settings.
    if (!IsFile(state_.Beside(name_))) {
      if (const auto block = state_.Recall("file." + name_ + ".block")) inside = *block + "\n";
    }
    ReplaceOwnFile(path_, parts.before + inside + parts.after);
    return;
  }
  // The line break in front of our block was ours, too, unless something follows now.
  const bool is_open = !parts.is_whole || (*before == "open" && parts.ends_with_block);
  ReplaceOwnFile(path_, is_open ? WithoutFinalNewline(parts.outside) : parts.outside);
  if (*before == "absent" && TextOf(path_).empty()) unlink(path_.c_str());
}

}  // namespace vexel_yaml
