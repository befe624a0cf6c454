#include <unistd.h>

#include <algorithm>
#include <iostream>

#include "git/conflict_records.h"
#include "git/git_call.h"
#include "git/next_step.h"
#include "git/record_hook.h"
#include "git/repository.h"
#include "git/settings.h"
#include "git/setup.h"
#include "git/shown_text.h"
#include "git/work_files.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

// What is to be told of a part of the set-up, and whether that part is complete.
struct Finding {
  std::string text;
  bool is_complete;
};

Finding FindProgram() {
  const std::string folder = GetDataFilesDir();
  const std::string program = folder + "VexelYAMLMerge";
  const ProgramResult version = RunProgram(
      {.arguments = {folder + "vexel-merge-report", "--version"}, .errors = ProgramCall::Errors::kDropped});
  if (version.status != 0 || access(program.c_str(), X_OK) != 0) {
    return {"not found in " + folder.substr(0, folder.size() - 1), false};
  }
  const std::string line = Line(version);
  return {"VexelYAMLMerge " + line.substr(line.rfind(' ') + 1) + " (" + program + ")", true};
}

// For whom a key is set. Not complete where git would not get at us.
Finding FindSetting(const std::string& key) {
  const ProgramResult set = Git({"config", "--get", key});
  if (set.status != 0) return {"not set", false};
  const std::string call = CommandIn(Line(set));
  if (call.empty()) return {"set to something else: " + Line(set), false};
  // As git starts it: with another PATH, or after a move, the command may be gone.
  const ProgramResult version =
      RunProgram({.arguments = {"sh", "-c", call + " --version"}, .errors = ProgramCall::Errors::kDropped});
  if (version.status != 0) return {"set, but there is no command " + call, false};
  const std::string scope = Git({"config", "--show-scope", "--get", key}).output;
  const bool is_local = scope.starts_with("local\t") || scope.starts_with("worktree\t");
  return {is_local ? "set for this repository" : "set for all your repositories", true};
}

// Whether another line takes away the files whose names end like this.
bool IsTakenAway(const std::string& pattern) {
  // Of patterns with a folder there is no file whose name tells.
  if (!pattern.starts_with("*.") || pattern.find('/') != std::string::npos) return false;
  return OursAmong({"x" + pattern.substr(1)}).empty();
}

// The patterns that are given to us, and the files that say so.
Finding FindAttributes(const Repository& repository) {
  Finding finding = {{}, false};
  bool is_taken_away = false;
  for (const std::string& file :
       {std::string(".gitattributes"), UserAttributes(), repository.CommonPath("info/attributes")}) {
    if (!IsFile(file)) continue;
    const std::vector<std::string> given = GivenPatterns(file);
    if (given.empty()) continue;
    finding.is_complete = true;
    finding.text += (finding.text.empty() ? "" : "\n") + Joined(given) + " (" + file + ")";
    for (const std::string& pattern : given) {
      if (!IsTakenAway(pattern)) continue;
      finding.text += "\n  but not " + pattern + ": another line takes it away";
      is_taken_away = true;
    }
  }
  finding.is_complete = finding.is_complete && !is_taken_away;
  if (finding.text.empty()) finding.text = "no pattern with merge=vexel";
  return finding;
}

bool TellFile(const std::string& label, const std::string& key) {
  const ProgramResult set = Git({"config", "--type=path", "--get", key});
  if (set.status != 0) return true;
  Tell(label + Line(set));
  if (IsFile(Line(set))) return true;
  Tell("  but that file is missing");
  return false;
}

void TellConflicts(const ConflictRecords& records) {
  for (const std::string& asset : OursAmong(UnmergedBelow({}, false).value_or(std::vector<std::string>()))) {
    Tell("in conflict    " + asset);
    const std::string record = records.Find(asset);
    if (records.IsKept(record)) Tell("  its record is " + record);
  }
  const std::vector<std::string> unmerged = UnmergedBelow({}, false).value_or(std::vector<std::string>());
  for (const RecordEntry& entry : records.Entries()) {
    const bool is_told = std::ranges::find(unmerged, entry.asset) != unmerged.end();
    if (!is_told && entry.CountPending() > 0) Tell("not settled    " + entry.asset);
  }
}

}  // namespace

int RunStatus(const std::vector<std::string>& arguments) {
  if (!arguments.empty()) throw WrongUsage("unknown argument '" + arguments.front() + "'");
  GoToTop();
  const Repository repository;
  bool is_complete = true;
  const auto tell = [&](const std::string& label, const Finding& finding) {
    // Several lines, of which a terminal gets nothing that steers it.
    std::cout << label << finding.text << '\n';
    is_complete = is_complete && finding.is_complete;
  };
  tell("program        ", FindProgram());
  tell("merge driver   ", FindSetting("merge.vexel.driver"));
  tell("diff driver    ", FindSetting("diff.vexel.textconv"));
  tell("merge tool     ", FindSetting("mergetool.vexel.cmd"));
  tell("attributes     ", FindAttributes(repository));
  is_complete = TellFile("rules          ", "vexel.rules") && is_complete;
  is_complete = TellFile("typeInfo       ", "vexel.typeInfo") && is_complete;
  // Where somebody's own hook has kept ours away, records may have outlived their conflicts.
  const ConflictRecords records(repository);
  records.Sweep();
  TellConflicts(records);
  const GitStep next = FindNextStep(repository);
  if (!next.command.empty()) Tell("next           " + next.command + ", to " + next.purpose);
  const auto foreign = ForeignGuards(repository, SettingsQuery().Get().hooks_folder);
  if (!foreign.empty()) {
    Tell("hooks          your own are in use (" + Joined(foreign) +
         "): let them call 'vexel-merge-git check --staged'");
  }
  return is_complete ? 0 : 1;
}

}  // namespace vexel_yaml
