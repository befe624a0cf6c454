#include "git/index_state.h"

#include "git/git_call.h"

namespace vexel_yaml {

namespace {

// A system has a limit for their length.
constexpr size_t kMostArguments = 500;

// Fields with blanks between them stand before a tab, and the path behind it.
struct IndexLine {
  std::vector<std::string> fields;
  std::string path;
};

std::vector<IndexLine> IndexLines(const std::string& output) {
  std::vector<IndexLine> lines;
  for (const std::string& entry : Pieces(output, '\0')) {
    const size_t end = entry.find('\t');
    if (end != std::string::npos) lines.push_back({Pieces(entry.substr(0, end), ' '), entry.substr(end + 1)});
  }
  return lines;
}

// Of the lines of "ls-files --stage"; files in conflict have none.
std::map<std::string, std::string> BlobsIn(const std::string& output) {
  std::map<std::string, std::string> blobs;
  for (const IndexLine& line : IndexLines(output)) {
    if (line.fields.size() == 3 && line.fields[2] == "0") blobs[line.path] = line.fields[1];
  }
  return blobs;
}

}  // namespace

std::optional<ConflictPaths> PathsInConflict(bool in_users_index) {
  ProgramCall call = GitCall({"ls-files", "-z", "-t", "--unmerged", "--resolve-undo"});
  if (!in_users_index) call.without = {kIndexVariable};
  const ProgramResult result = Ask(call);
  if (result.status != 0) return std::nullopt;
  ConflictPaths paths;
  for (IndexLine& line : IndexLines(result.output)) {
    (line.fields.front() == "U" ? paths.staged : paths.unmerged).insert(std::move(line.path));
  }
  return paths;
}

std::optional<std::map<std::string, std::string>> IndexBlobs(const std::vector<std::string>& paths,
                                                             bool in_users_index) {
  if (paths.empty()) return std::map<std::string, std::string>();
  ProgramCall call = GitCall({"--literal-pathspecs", "ls-files", "-z", "--stage", "--"});
  if (paths.size() <= kMostArguments) call.arguments.insert(call.arguments.end(), paths.begin(), paths.end());
  if (!in_users_index) call.without = {kIndexVariable};
  const ProgramResult result = Ask(call);
  if (result.status != 0) return std::nullopt;
  return BlobsIn(result.output);
}

std::set<std::string> EditedFiles(const std::vector<std::string>& paths) {
  if (paths.empty()) return {};
  ProgramCall call =
      GitCall({"--literal-pathspecs", "diff-files", "--name-only", "-z", "--no-relative", "--"});
  if (paths.size() <= kMostArguments) call.arguments.insert(call.arguments.end(), paths.begin(), paths.end());
  call.without = {kIndexVariable};
  const std::vector<std::string> edited = Pieces(Answer(call), '\0');
  return {edited.begin(), edited.end()};
}

std::map<std::string, std::string> StagedChanges(bool in_users_index) {
  ProgramCall call = GitCall({"diff-index", "--cached", "--raw", "-z", "--no-renames", "--no-abbrev",
                              "--no-relative", "HEAD", "--"});
  call.errors = ProgramCall::Errors::kDropped;
  if (!in_users_index) call.without = {kIndexVariable};
  const ProgramResult result = Ask(call);
  if (result.status != 0) {
    call.arguments = {"git", "ls-files", "-z", "--stage"};
    call.errors = ProgramCall::Errors::kShown;
    return BlobsIn(Answer(call));
  }
  std::map<std::string, std::string> blobs;
  const std::vector<std::string> pieces = Pieces(result.output, '\0');
  // Two modes, two blobs and a letter, then the path.
  for (size_t i = 0; i + 1 < pieces.size(); i += 2) {
    const std::vector<std::string> fields = Pieces(pieces[i], ' ');
    if (fields.size() < 5) continue;
    const bool is_file = fields[4] != "U" && fields[4] != "D" && fields[1].starts_with("100");
    blobs[pieces[i + 1]] = is_file ? fields[3] : std::string();
  }
  return blobs;
}

}  // namespace vexel_yaml
