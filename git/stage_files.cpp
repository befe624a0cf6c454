#include "git/stage_files.h"

#include <unistd.h>

#include <filesystem>

#include "git/conflict_messages.h"
#include "git/git_call.h"
#include "git/shown_text.h"
#include "git/undecided_places.h"
#include "git/work_files.h"
#include "platform/temporary_files.h"

namespace vexel_yaml {

ScratchFolder::ScratchFolder(const Repository& repository) { Make(repository.Path("vexel-merge.XXXXXX")); }

ScratchFolder::ScratchFolder() {
  Make((std::filesystem::temp_directory_path() / "vexel-merge.XXXXXX").string());
}

void ScratchFolder::Make(const std::string& pattern) {
  std::error_code error;
  path_ = std::filesystem::absolute(pattern, error).string();
  if (!CreateTempFolder(path_)) throw CommandError("cannot make a folder like " + pattern);
}

ScratchFolder::~ScratchFolder() {
  Clear();
  RemoveTempFile(path_);
}

std::string ScratchFolder::Write(const std::string& name, std::string_view text) {
  std::string path = path_ + "/" + name;
  files_.push_back(path);
  // Also where a signal ends the process.
  if (!RememberTempFile(path) || !PutFile(path, text)) throw CommandError("cannot write " + path);
  return path;
}

void ScratchFolder::Clear() {
  for (const std::string& file : files_) RemoveTempFile(file);
  files_.clear();
}

StageFiles::StageFiles(const std::string& asset) : asset_(asset), stages_(Stages(false)) {
  if (!stages_.empty()) return;
  is_staged_ = true;
  stages_ = Stages(true);
}

bool StageFiles::LackBase() const {
  return stages_.size() == 2 && stages_[0].number == "2" && stages_[1].number == "3";
}

std::string StageFiles::TextOf(const std::string& number) const {
  for (const Stage& stage : stages_) {
    if (stage.number == number)
      return Answer(GitCall({"cat-file", "--filters", "--path=" + asset_, stage.blob}));
  }
  return {};
}

bool StageFiles::Unstage() {
  if (!is_staged_) return true;
  // Mode 0 takes away what is staged.
  std::string lines =
      "0 " + std::string(stages_.empty() ? 40 : stages_.front().blob.size(), '0') + "\t" + asset_ + '\0';
  for (const Stage& stage : stages_) {
    lines += stage.mode + " " + stage.blob + " " + stage.number + "\t" + asset_ + '\0';
  }
  ProgramCall call = GitCall({"update-index", "-z", "--index-info"});
  call.input = std::move(lines);
  if (Ask(call).status != 0) return false;
  is_staged_ = false;
  return true;
}

std::vector<StageFiles::Stage> StageFiles::Stages(bool is_staged) const {
  std::vector<Stage> stages;
  const std::string which = is_staged ? "--resolve-undo" : "--unmerged";
  for (const std::string& entry :
       Pieces(Answer(GitCall({"ls-files", "-z", which, "--", ":(literal)" + asset_})), '\0')) {
    const size_t end = entry.find('\t');
    // Not what lies below a folder of this name.
    if (end == std::string::npos || entry.substr(end + 1) != asset_) continue;
    const std::vector<std::string> fields = Pieces(entry.substr(0, end), ' ');
    if (fields.size() == 3) stages.push_back({fields[0], fields[1], fields[2]});
  }
  return stages;
}

bool StageFiles::Write(ScratchFolder& folder, AssetVersions& versions) const {
  folder.Clear();
  versions = {asset_, {}, {}, {}};
  for (const Stage& stage : stages_) {
    if (!stage.mode.starts_with("100")) {
      Complain(asset_ + " is no file on every side: 'git add' keeps what is there, 'git rm' removes it");
      return false;
    }
    const ProgramResult text = Git({"cat-file", "--filters", "--path=" + asset_, stage.blob});
    if (text.status != 0) return false;
    const std::string name = stage.number == "1" ? "base" : stage.number == "2" ? "right" : "left";
    std::string& version = stage.number == "1"   ? versions.base
                           : stage.number == "2" ? versions.right
                                                 : versions.left;
    version = folder.Write(name, text.output);
  }
  if (versions.left.empty() || versions.right.empty()) {
    Complain(asset_ + " was removed or renamed on one side: 'git add' keeps it, 'git rm' removes it");
    return false;
  }
  if (versions.base.empty()) {
    Complain("both sides have added " + asset_ + "; take one: " + ResolveCall(asset_, "resolve --ours") +
             ", or --theirs");
    return false;
  }
  MarkUndecided(versions);
  return true;
}

}  // namespace vexel_yaml
