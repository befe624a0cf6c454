#include "app/merge_command.h"

#include <algorithm>
#include <array>
#include <string>
#include <string_view>

#include "app/fallback_tools.h"
#include "app/merge_pipeline.h"
#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/temporary_files.h"
#include "yaml/yaml_error.h"

namespace vexel_yaml {

namespace {

int Report(const std::string& message) {
  errs << message;
  ErrMsg(errs);
  return 1;
}

// Extensions are compared as they stand; of upper-case forms only those of three letters are known.
bool IsMergedStructurally(const std::string& extension) {
  static constexpr std::array<std::string_view, 6> kExtensions = {"vexel", "prefab", "meta",
                                                                  "VEX",   "PRE",    "MET"};
  return std::find(kExtensions.begin(), kExtensions.end(), extension) != kExtensions.end();
}

// Fills `path` with a temporary file where the user named none.
bool SetupPremergePath(std::string& path) {
  if (path.empty()) path = CreateTempFile();
  return !path.empty();
}

// Without a destination the merge was only a check.
void OutputResultToDestination(const std::string& source, const std::string& destination) {
  if (!destination.empty()) CopyFileContent(source, destination);
}

// A tool that ends well but writes nothing has not merged: the user must know that nothing changed.
int FinishWithTool(int tool_result, const std::string& tool_output, const std::string& destination) {
  if (tool_result != 0) return ExitStatusOfTool(tool_result);
  if (IsFileEmpty(tool_output)) {
    if (!destination.empty())
      WriteErrorLine("The merge tool left its result empty: '" + destination + "' is unchanged");
    return 0;
  }
  OutputResultToDestination(tool_output, destination);
  return 0;
}

int MergeStructurally(const MergeConfig& config, const std::string& merged) {
  const int result = HandleMergeCommand(config, merged);
  const bool conflicts = result == 2 || result == 3;
  if (result != 0 && !conflicts) return result;
  if (!conflicts || config.fallback_spec_file == kNoSpecFile) {
    OutputResultToDestination(merged, config.destination_path);
    return result;
  }
  const std::string tool_output = CreateTempFile();
  if (tool_output.empty()) return Report("Couldn't create temporary output2 file for merge result");
  const std::string& base = config.premerge ? config.premerge_base_destination : config.base_path;
  const std::string& right = config.premerge ? config.premerge_right_destination : config.right_path;
  const int tool_result = FallbackMergeTool(base, merged, right, tool_output, config.fallback_spec_file);
  return FinishWithTool(tool_result, tool_output, config.destination_path);
}

int MergeWithTool(const MergeConfig& config, const std::string& extension, const std::string& merged) {
  if (config.fallback_spec_file == kNoSpecFile) {
    return Report("Don't know how to merge " + extension + " files. Consider specifying a specFile argument");
  }
  const int tool_result = FallbackMergeTool(config.base_path, config.left_path, config.right_path, merged,
                                            config.fallback_spec_file);
  return FinishWithTool(tool_result, merged, config.destination_path);
}

int MergeIntoTemporaryFile(MergeConfig config) {
  const std::string merged = CreateTempFile();
  if (merged.empty()) return Report("Couldn't create temporary output file for merge result");
  if (config.premerge && (!SetupPremergePath(config.premerge_base_destination) ||
                          !SetupPremergePath(config.premerge_right_destination))) {
    return Report("Couldn't create temporary output premerge base file for merge result");
  }
  const std::string extension = GetFileExtension(config.base_path);
  if (!config.force && !IsMergedStructurally(extension)) return MergeWithTool(config, extension, merged);
  return MergeStructurally(config, merged);
}

}  // namespace

int ProcessMergeCommand(const MergeConfig& config) {
  const TempFilesGuard guard;
  try {
    return MergeIntoTemporaryFile(config);
  } catch (const YAMLError& error) {
    Report("Cannot merge file '" + config.base_path + "': " + error.what() + "\n");
    WriteHint(error.GetHint());
    return 1;
  } catch (const FileError& error) {
    return Report(std::string(error.what()) + "\n");
  }
}

}  // namespace vexel_yaml
