#pragma once

#include <string>

#include "git/asset_merge.h"
#include "git/repository.h"

namespace vexel_yaml {

/// A folder for the versions of files, which goes with the process.
class ScratchFolder {
 public:
  /// In the repository, where nobody else looks and where there is as much room as the files themselves take.
  /// Throws CommandError where it can't be made.
  explicit ScratchFolder(const Repository& repository);

  /// Among the system's temporary files. Throws CommandError where it can't be made.
  ScratchFolder();
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;
  ~ScratchFolder();

  /// Its absolute path.
  const std::string& GetPath() const { return path_; }

  /// Writes a file, which is empty from the next `Clear` on. Returns its path. Throws CommandError.
  std::string Write(const std::string& name, std::string_view text);

  void Clear();

 private:
  void Make(const std::string& pattern);

  std::string path_;
  std::vector<std::string> files_;
};

/// The three stages of a file that is in conflict, or was until it was staged: git remembers them then.
class StageFiles {
 public:
  /// Looks the stages up. The paths are from the top folder, which is the current one.
  explicit StageFiles(const std::string& asset);

  /// Writes them as files of the work tree, in which line ends are what the user has set. False where that
  /// are not three files, which has been said.
  bool Write(ScratchFolder& folder, AssetVersions& versions) const;

  /// Whether the file was in conflict until it was staged.
  bool IsStaged() const { return is_staged_; }

  /// Whether git still knows all three.
  bool AreComplete() const { return stages_.size() == 3; }

  /// Whether both sides have added the file.
  bool LackBase() const;

  /// A stage as a file of the work tree: "1" is base, "2" ours, "3" theirs. Empty where there is none.
  std::string TextOf(const std::string& number) const;

  /// Whether they are still the same.
  bool AreSame() const { return Stages(is_staged_) == stages_; }

  /// Puts a file that was staged back in conflict. Returns whether it is in conflict now.
  bool Unstage();

 private:
  struct Stage {
    std::string mode;
    std::string blob;
    std::string number;
    bool operator==(const Stage&) const = default;
  };
  std::vector<Stage> Stages(bool is_staged) const;

  std::string asset_;
  bool is_staged_ = false;
  std::vector<Stage> stages_;
};

}  // namespace vexel_yaml
