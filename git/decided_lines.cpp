#include "git/decided_lines.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "git/git_call.h"
#include "git/work_files.h"

namespace vexel_yaml {

namespace {

struct Decision {
  std::string word;  // Of a record file.
  std::string path;
};

std::optional<Decision> DecisionIn(std::string line) {
  if (line.ends_with('\r')) line.pop_back();
  const size_t blank = std::min(line.find(' '), line.size());
  const size_t begin = std::min(line.find_first_not_of(' ', blank), line.size());
  const std::string path = line.substr(begin, line.find(' ', begin) - begin);
  std::string word = line.substr(0, blank);
  // Records say "Left" where the user may say "left".
  std::ranges::transform(word, word.begin(), [](char c) { return c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c; });
  if (word == "theirs") word = "left";
  if (word == "ours") word = "right";
  if (path.empty() || (word != "left" && word != "right" && word != "base")) return std::nullopt;
  return Decision{word, path};
}

// The line that what people decide begins behind.
size_t FindHeading(const std::vector<std::string>& lines) {
  const auto last = std::find_if(lines.rbegin(), lines.rend(), [](const std::string& line) {
    return line == kDecidedHeading || line == std::string(kDecidedHeading) + '\r';
  });
  return last == lines.rend() ? lines.size() : static_cast<size_t>(lines.rend() - last) - 1;
}

bool IsForSeveral(const std::string& path) { return ('.' + path + '.').find(".*.") != std::string::npos; }

// Takes lines up from the last one on, and tells which ones are void.
class LaterLines {
 public:
  // Returns whether a line before has decided this already.
  bool Take(const std::string& path) {
    const bool is_void = paths_.contains(path) || std::ranges::any_of(patterns_, [&](const std::string& p) {
                           return FitsPattern(path, p);
                         });
    if (!is_void && IsForSeveral(path)) patterns_.push_back(path);
    paths_.insert(path);
    return is_void;
  }

 private:
  std::set<std::string> paths_;
  std::vector<std::string> patterns_;
};

// Empties the lines that later ones make void. Those for several places go to the end, since one of them may
// stand before a line for a single place that counts more.
void PutLatestFirst(std::vector<std::string>& lines, LaterLines later) {
  std::vector<std::string> moved;
  for (auto line = lines.rbegin(); line != lines.rend(); ++line) {
    const std::optional<Decision> decision = DecisionIn(*line);
    if (!decision) continue;
    *line = decision->word + ' ' + decision->path;
    const bool is_void = later.Take(decision->path);
    if (!is_void && IsForSeveral(decision->path)) moved.push_back(*line);
    if (is_void || IsForSeveral(decision->path)) line->clear();
  }
  lines.insert(lines.end(), moved.begin(), moved.end());
}

}  // namespace

std::string DecidedIn(const std::string& record, const std::vector<std::string>& first) {
  std::vector<std::string> lines = Pieces(TextOf(record), '\n');
  const size_t above = FindHeading(lines);
  lines.erase(lines.begin(), lines.begin() + static_cast<long>(std::min(above + 1, lines.size())));
  LaterLines later;
  for (const std::string& line : first) {
    if (const std::optional<Decision> decision = DecisionIn(line)) later.Take(decision->path);
  }
  PutLatestFirst(lines, std::move(later));
  std::string text(above - std::min(above, first.size()), '\n');
  text += std::string(kDecidedHeading) + '\n';
  for (const std::vector<std::string>& part : {first, lines}) {
    for (const std::string& line : part) text += line + '\n';
  }
  return text;
}

std::vector<std::string> DescribeCommentedChoices(const std::string& record,
                                                  const std::set<std::string>& places) {
  std::vector<std::string> descriptions;
  const std::vector<std::string> lines = Pieces(TextOf(record), '\n');
  for (size_t i = FindHeading(lines); i < lines.size(); ++i) {
    if (!lines[i].starts_with('#')) continue;
    const size_t begin = std::min(lines[i].find_first_not_of("# "), lines[i].size());
    const std::optional<Decision> decision = DecisionIn(lines[i].substr(begin));
    if (!decision || !places.contains(decision->path)) continue;
    descriptions.push_back("Warning: '" + lines[i] + "' chooses nothing: take the \"#\" off");
  }
  return descriptions;
}

// As texts: as numbers, two file IDs of 19 digits may be equal.
bool FitsPattern(const std::string& place, const std::string& pattern) {
  const std::vector<std::string> wanted = Pieces(pattern + ".", '.');
  const std::vector<std::string> given = Pieces(place + ".", '.');
  return std::ranges::equal(wanted, given,
                            [](const std::string& w, const std::string& g) { return w == "*" || w == g; });
}

}  // namespace vexel_yaml
