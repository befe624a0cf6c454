#include "app/file_pair_commands.h"

#include <iostream>
#include <memory>
#include <sstream>
#include <string_view>

#include "diff/strip_unchanged.h"
#include "diff/yaml_diff_output.h"
#include "fixups/file_id_collisions.h"
#include "fixups/state_machine_transitions.h"
#include "platform/error_channel.h"
#include "platform/file_replacement.h"
#include "platform/files.h"
#include "platform/keep_until_exit.h"
#include "platform/thread.h"
#include "rules/setup.h"
#include "yaml/read_files.h"

namespace vexel_yaml {

namespace {

struct FilePair {
  VexelObjects first;
  VexelObjects second;
};

// Nobody but a person at a terminal is told of a file that can't be opened or closed; one that can't be
// written is an error, since its text exists and would be lost.
void WriteResult(const std::string& path, std::string_view text) {
  if (path.empty()) {
    std::cout << text;
    return;
  }
  try {
    ReplaceFile(VexelToNativePath(path), text);
  } catch (const FileError& error) {
    if (error.GetStep() == FileError::Step::kWriting || error.GetStep() == FileError::Step::kReading) throw;
    WriteHint(error.what());
  }
}

// The diff from the first file to the second; the files are read into `files`.
const YAMLMappingDiff* PrepareDiff(const FilePairConfig& config, FilePair& files, TimerStat& timer) {
  SetupRulesAndTypes(config.rules_file, config.type_info_file, timer);
  // On threads, only both together are timed, whatever their size.
  ReadFiles({{config.threads ? "" : "Read base", config.first_path, files.first},
             {config.threads ? "" : "Read left", config.second_path, files.second}},
            config.threads && (config.timing || AreWorthThreads({config.first_path, config.second_path})),
            timer);
  {
    TimerStat step(timer, "Creating mappings");
    TimerStat preprocessing(step, "Preprocess mappings");
    PreProcess(files.first);
    PreProcess(files.second);
  }
  TimerStat step(timer, "Creating diff");
  TimerStat inner(step, "Creating left diff");
  return YAMLMappingDiff::Diff(files.first, files.second);
}

}  // namespace

int HandleStripCommand(const StripConfig& config) {
  TimerStat timer("Strip Command", config.timing ? &std::cout : nullptr);
  FilePair& files = KeepUntilExit(std::make_unique<FilePair>());
  const YAMLMappingDiff* diff = PrepareDiff(config, files, timer);
  StripUnchanged(files.second, *diff);
  StrippedTransitionsToMappings(files.second);

  TimerStat step(timer, "Output result");
  // All of it first: an object that can't be written must be found before the output is touched.
  std::ostringstream text;
  files.second.Output(text);
  WriteResult(config.output_path, text.view());
  return 0;
}

int HandleDiffCommand(const DiffConfig& config) {
  TimerStat timer("Diff Command", config.timing ? &std::cout : nullptr);
  const YAMLMappingDiff* diff = PrepareDiff(config, KeepUntilExit(std::make_unique<FilePair>()), timer);

  TimerStat step(timer, "Output diff");
  std::ostringstream text;
  YAMLDiffOutput output(text, 2);
  text << "Diff '" << config.first_path << "' vs. '" << config.second_path << "':\n";
  diff->Output(output);
  WriteResult(config.output_path, text.view());
  return 0;
}

}  // namespace vexel_yaml
