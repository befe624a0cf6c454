#include "git/side_names.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include "git/git_call.h"
#include "git/work_files.h"
#include "report/value_text.h"

#ifdef __APPLE__
extern char** environ;
#endif

namespace vexel_yaml {

namespace {

constexpr size_t kMostOfName = 60;

bool IsHash(std::string_view text) {
  return text.size() >= 40 && text.find_first_not_of("0123456789abcdef") == std::string_view::npos;
}

// Git names a commit that was given by its hash by that.
std::string Readable(std::string_view name) {
  return IsHash(name) ? std::string(name.substr(0, 10)) : Shortened(OnOneLine(name), kMostOfName);
}

std::string FirstLine(const std::string& path) {
  const std::string text = TextOf(path);
  return text.substr(0, text.find('\n'));
}

std::string WithoutPrefix(const std::string& name, std::string_view prefix) {
  return name.starts_with(prefix) ? name.substr(prefix.size()) : name;
}

// The branch whose tip a commit is, or else the commit.
std::string BranchAt(const std::string& commit) {
  if (commit.empty()) return {};
  const ProgramResult branches =
      RunProgram(QuietCall({"for-each-ref", "--count=1", "--format=%(refname:short)", "--points-at=" + commit,
                            "refs/heads", "refs/remotes"}));
  const std::string branch = Line(branches);
  return Readable(branch.empty() ? commit : branch);
}

// A line of a list of steps: a word, a commit, and its subject, before which newer versions of git put "# ".
struct Step {
  std::string word;
  std::string commit;
  std::string subject;
};

Step StepIn(const std::string& line) {
  const size_t word = std::min(line.find(' '), line.size());
  const size_t commit = std::min(line.find(' ', word + 1), line.size());
  if (commit <= word) return {line, {}, {}};
  const std::string subject = commit < line.size() ? line.substr(commit + 1) : std::string();
  return {line.substr(0, word), line.substr(word + 1, commit - word - 1), WithoutPrefix(subject, "# ")};
}

std::string Quoted(const std::string& subject) {
  return '"' + Shortened(OnOneLine(subject), kMostOfName) + '"';
}

std::string MergedHead() {
  constexpr std::string_view kVariable = "GITHEAD_";
  std::string name;
  for (char** variable = environ; *variable != nullptr; ++variable) {
    const std::string_view text = *variable;
    if (!text.starts_with(kVariable)) continue;
    if (!name.empty()) return {};
    name = Readable(text.substr(std::min(text.find('=') + 1, text.size())));
  }
  return name;
}

std::vector<std::string> StepsDone(const Repository& repository, const std::string& folder) {
  return Pieces(TextOf(repository.Path(folder + "/done")), '\n');
}

// Whether it is the rebase that merges, and not what somebody does where it has stopped for an edit, or what
// was stashed before it and comes back at its end.
bool IsAtStep(const Repository& repository, const std::string& folder) {
  if (!IsFile(repository.Path(folder + "/head-name")) || IsFile(repository.Path(folder + "/amend"))) {
    return false;
  }
  const std::vector<std::string> done = StepsDone(repository, folder);
  const std::string commit = done.empty() ? std::string() : StepIn(done.back()).commit;
  const std::string rewritten = '\n' + TextOf(repository.Path(folder + "/rewritten-list"));
  return commit.empty() || rewritten.find('\n' + commit) == std::string::npos;
}

// As the user has named it, which only the log of HEAD knows: several branches can be there.
std::string NewBase(const Repository& repository, const std::string& folder) {
  constexpr std::string_view kStart = "(start): checkout ";
  const std::string onto = FirstLine(repository.Path(folder + "/onto"));
  std::vector<std::string> log = Pieces(TextOf(repository.Path("logs/HEAD")), '\n');
  const auto start = std::find_if(log.rbegin(), log.rend(), [&](const std::string& line) {
    return line.find(kStart) != std::string::npos;
  });
  // Old commit, new commit, who and when, a tab, and what was done.
  const bool is_this = start != log.rend() && start->find(' ' + onto + ' ') != std::string::npos;
  return is_this ? Readable(start->substr(start->find(kStart) + kStart.size())) : BranchAt(onto);
}

SideNames InRebase(const Repository& repository, const std::string& folder) {
  const std::string branch =
      Readable(WithoutPrefix(FirstLine(repository.Path(folder + "/head-name")), "refs/heads/"));
  const std::vector<std::string> done = StepsDone(repository, folder);
  const std::string subject = done.empty() ? std::string() : StepIn(done.back()).subject;
  return {(subject.empty() ? "a commit" : Quoted(subject)) + " of " + branch + ", which is rebased",
          NewBase(repository, folder) + ", its new base"};
}

std::string Picked(const Step& step) {
  const std::string commit = step.subject.empty() ? Readable(step.commit) : Quoted(step.subject);
  return step.word == "revert" ? "without " + commit : commit;
}

}  // namespace

SideNames NamesInMessage(const std::string& message) {
  constexpr std::string_view kInto = " into ";
  const size_t begin = std::min(message.find('\''), message.size());
  const size_t end = message.find('\'', begin + 1);
  // Others write messages with apostrophes, too.
  const std::string_view what = std::string_view(message).substr(0, begin);
  const bool is_gits = what.ends_with("branch ") || what.ends_with("branches ") || what.ends_with("tag ") ||
                       what.ends_with("commit ");
  if (!message.starts_with("Merge ") || !is_gits || end == std::string::npos) return {};
  const size_t into = message.find(kInto, end);
  return {Readable(message.substr(begin + 1, end - begin - 1)),
          into == std::string::npos ? std::string() : Readable(message.substr(into + kInto.size()))};
}

std::string MergingRebase(const Repository& repository) {
  for (const char* folder : {"rebase-merge", "rebase-apply"}) {
    if (IsAtStep(repository, folder)) return folder;
  }
  return {};
}

SideNames FindSideNames(const Repository& repository) {
  if (const std::string head = MergedHead(); !head.empty()) return {head, {}};
  if (const std::string folder = MergingRebase(repository); !folder.empty())
    return InRebase(repository, folder);
  if (const std::string step = FirstLine(repository.Path("sequencer/todo")); !step.empty())
    return {Picked(StepIn(step)), {}};
  // Once a merge has stopped.
  if (const std::string head = FirstLine(repository.Path("MERGE_HEAD")); !head.empty()) {
    const std::string branch = NamesInMessage(FirstLine(repository.Path("MERGE_MSG"))).theirs;
    return {branch.empty() ? BranchAt(head) : branch, {}};
  }
  for (const auto& [file, word] :
       {std::pair("CHERRY_PICK_HEAD", "pick"), std::pair("REVERT_HEAD", "revert")}) {
    const std::string head = FirstLine(repository.Path(file));
    if (head.empty()) continue;
    return {Picked({word, head, Line(RunProgram(QuietCall({"show", "--no-patch", "--format=%s", head})))}),
            {}};
  }
  return {};
}

}  // namespace vexel_yaml
