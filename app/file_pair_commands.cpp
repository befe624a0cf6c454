#include "app/file_pair_commands.h"

#include <fstream>
#include <iostream>
#include <memory>

#include "diff/strip_unchanged.h"
#include "diff/yaml_diff_output.h"
#include "fixups/state_machine_transitions.h"
#include "platform/files.h"
#include "rules/setup.h"
#include "yaml/read_files.h"

namespace vexel_yaml {

namespace {

struct FilePair {
  VexelObjects first;
  VexelObjects second;
};

// Where a result goes: the named file, or standard output.
class Output {
 public:
  explicit Output(const std::string& path) {
    if (!path.empty()) file_.open(VexelToNativePath(path), std::ios::binary | std::ios::trunc);
    stream_ = path.empty() ? &std::cout : &file_;
  }
  std::ostream& Stream() { return *stream_; }

 private:
  std::ofstream file_;
  std::ostream* stream_;
};

// The diff from the first file to the second; the files are read into `files`.
const YAMLMappingDiff* PrepareDiff(const FilePairConfig& config, FilePair& files, TimerStat& timer) {
  SetupRulesAndTypes(config.rules_file, config.type_info_file, timer);
  // On threads, only both together are timed.
  ReadFiles({{config.threads ? "" : "Read base", config.first_path, files.first},
             {config.threads ? "" : "Read left", config.second_path, files.second}},
            config.threads, timer);
  {
    TimerStat step(timer, "Creating mappings");
    TimerStat preprocessing(step, "Preprocess mappings");
    TransitionsToSequences(files.first);
    TransitionsToSequences(files.second);
  }
  TimerStat step(timer, "Creating diff");
  TimerStat inner(step, "Creating left diff");
  return YAMLMappingDiff::Diff(files.first, files.second);
}

// Kept until the process ends, as the merge keeps its documents.
FilePair& NewFilePair() {
  static auto& pairs = *new std::vector<std::unique_ptr<FilePair>>;
  return *pairs.emplace_back(std::make_unique<FilePair>());
}

}  // namespace

int HandleStripCommand(const StripConfig& config) {
  TimerStat timer("Strip Command", config.timing ? &std::cout : nullptr);
  FilePair& files = NewFilePair();
  const YAMLMappingDiff* diff = PrepareDiff(config, files, timer);
  StripUnchanged(files.second, *diff);
  TransitionsToMappings(files.second);

  TimerStat step(timer, "Output result");
  files.second.Output(Output(config.output_path).Stream());
  return 0;
}

int HandleDiffCommand(const DiffConfig& config) {
  TimerStat timer("Diff Command", config.timing ? &std::cout : nullptr);
  const YAMLMappingDiff* diff = PrepareDiff(config, NewFilePair(), timer);

  TimerStat step(timer, "Output diff");
  Output output(config.output_path);
  YAMLDiffOutput text(output.Stream(), 2);
  output.Stream() << "Diff '" << config.first_path << "' vs. '" << config.second_path << "':\n";
  diff->Output(text);
  return 0;
}

}  // namespace vexel_yaml
