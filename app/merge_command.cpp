#include "app/merge_command.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>

#include "app/command_line.h"
#include "app/fallback_tools.h"
#include "app/merge_pipeline.h"
#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/read_whole_file.h"
#include "platform/temporary_files.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

int Report(const std::string& message) {
  errs << message;
  ErrMsg(errs);
  return 1;
}

// One that can't be opened may hold something.
bool IsKnownToBeEmpty(const std::string& path) {
  return access(path.c_str(), R_OK) == 0 && IsFileEmpty(path);
}

// Extensions are compared as they stand; of upper-case forms only those of three letters are known.
bool IsMergedStructurally(const std::string& extension) {
  static constexpr std::array<std::string_view, 6> kExtensions = {"vexel", "prefab", "meta",
                                                                  "VEX",   "PRE",    "MET"};
  return std::find(kExtensions.begin(), kExtensions.end(), extension) != kExtensions.end();
}

// A message whose text is compared by scripts, with what the system said as the hint.
int ReportTemporaryFile(const std::string& message) {
  const std::string reason = std::generic_category().message(errno);
  Report(message);
  WriteHint(reason);
  return 1;
}

// Fills `path` with a temporary file where the user named none. Returns 0, else 1.
int SetupPremergePath(std::string& path) {
  if (path.empty()) path = CreateTempFile();
  return path.empty() ? 1 : 0;
}

// Copies what a merge tool wrote. Without a destination the merge was only a check.
void OutputResultToDestination(const std::string& source, const std::string& destination, bool may_be_empty) {
  if (destination.empty()) return;
  const std::optional<std::string> text = ReadWholeFile(source);
  if (!text) throw FileError(FileError::Step::kReading, source, errno);
  if (text->empty() && !may_be_empty) {
    // A tool that ends well but writes nothing has not merged: the user must know that nothing changed.
    WriteErrorLine("The merge tool left its result empty: '" + destination + "' is unchanged");
    return;
  }
  ReplaceFile(destination, *text);
}

int FinishWithTool(int tool_result, const std::string& tool_output, const std::string& destination,
                   bool may_be_empty) {
  const int status = ExitStatusOfTool(tool_result);
  if (tool_result == 0) {
    OutputResultToDestination(tool_output, destination, may_be_empty);
  } else if (!destination.empty()) {
    WriteHint("no merge tool has settled it (status " + std::to_string(status) + "): '" + destination +
              "' is unchanged");
  }
  return status;
}

// A tool that merges by structure itself needs what the merge began with: what is handed over has one side's
// values at the conflicts.
void TellTools(const MergeConfig& config) {
  const auto set = [](const char* name, const std::string& value) { setenv(name, value.c_str(), 1); };
  set("VEXEL_BASE", config.base_path);
  set("VEXEL_LEFT", config.left_path);
  set("VEXEL_RIGHT", config.right_path);
  set("VEXEL_DESTINATION", config.destination_path);
  set("VEXEL_RULES", config.rules_file);
  set("VEXEL_TYPE_INFO", config.type_info_file);
  set("VEXEL_CHOICES", config.merge_file);
  set("VEXEL_RECORD", config.conflict_file);
  set("VEXEL_SAFE", config.safe ? "1" : "");
}

int MergeStructurally(const MergeConfig& config, const std::string& merged) {
  const int result = HandleMergeCommand(config, merged);
  const bool conflicts = result == 2 || result == 3;
  if (!conflicts || config.fallback_spec_file == kNoSpecFile) return result;
  const std::string tool_output = CreateTempFile();
  if (tool_output.empty()) {
    return ReportTemporaryFile("Couldn't create temporary output2 file for merge result");
  }
  const std::string& base = config.premerge ? config.premerge_base_destination : config.base_path;
  const std::string& right = config.premerge ? config.premerge_right_destination : config.right_path;
  TellTools(config);
  const int tool_result = FallbackMergeTool(base, merged, right, tool_output, config.fallback_spec_file);
  return FinishWithTool(tool_result, tool_output, config.destination_path, false);
}

int MergeWithTool(const MergeConfig& config, const std::string& extension, const std::string& merged) {
  if (config.fallback_spec_file == kNoSpecFile) {
    return Report("Don't know how to merge " + extension + " files. Consider specifying a specFile argument");
  }
  if (ReportMistypedOption(config)) return 1;
  // Before the tool runs, which may empty its inputs.
  const bool may_be_empty = IsKnownToBeEmpty(config.left_path) || IsKnownToBeEmpty(config.right_path);
  const int tool_result = FallbackMergeTool(config.base_path, config.left_path, config.right_path, merged,
                                            config.fallback_spec_file);
  return FinishWithTool(tool_result, merged, config.destination_path, may_be_empty);
}

int MergeWithTemporaryFiles(MergeConfig config) {
  // Only a tool needs one: what is merged without it is written beside its destination.
  const bool may_need_tool = config.fallback_spec_file != kNoSpecFile;
  const std::string merged = may_need_tool ? CreateTempFile() : std::string();
  if (may_need_tool && merged.empty()) {
    return ReportTemporaryFile("Couldn't create temporary output file for merge result");
  }
  if (config.premerge && (SetupPremergePath(config.premerge_base_destination) != 0 ||
                          SetupPremergePath(config.premerge_right_destination) != 0)) {
    return ReportTemporaryFile("Couldn't create temporary output premerge base file for merge result");
  }
  const std::string extension = GetFileExtension(config.base_path);
  if (!config.force && !IsMergedStructurally(extension)) return MergeWithTool(config, extension, merged);
  return MergeStructurally(config, merged);
}

}  // namespace

int ProcessMergeCommand(const MergeConfig& config) {
  const TempFilesGuard guard;
  try {
    return MergeWithTemporaryFiles(config);
  } catch (const YAMLError& error) {
    Report("Cannot merge file '" + config.base_path + "': " + error.what() + "\n");
    WriteHint(error.GetHint());
    return 1;
  } catch (const FileError& error) {
    return Report(std::string(error.what()) + "\n");
  }
}

}  // namespace vexel_yaml
