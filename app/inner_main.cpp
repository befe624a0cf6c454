#include "app/inner_main.h"

#include "app/file_pair_commands.h"
#include "app/merge_command.h"
#include "app/self_check.h"
#include "app/usage.h"
#include "platform/error_channel.h"
#include "platform/file_error.h"
#include "yaml/yaml_error.h"
#include "yaml/yaml_scalar.h"

namespace vexel_yaml {

namespace {

constexpr int kFirstOption = 2;

// Runs a command whose errors with files and of the library are reported as they are.
template <typename Argument>
int Run(int (*handle)(const Argument&), const Argument& argument) {
  try {
    return handle(argument);
  } catch (const YAMLError& error) {
    errs << error.what() << "\n";
    ErrMsg(errs);
    WriteHint(error.GetHint());
    return 1;
  } catch (const FileError& error) {
    errs << error.what() << "\n";
    ErrMsg(errs);
    return 1;
  }
}

}  // namespace

int InnerMain(const CommandLineArguments& arguments) {
  initialize();
  if (arguments.size() < 2) {
    errs << "Error: need 'merge' command specified\n";
    ErrMsg(errs);
    usage();
    return 1;
  }
  const std::string& command = arguments[1];
  if (command == kCmdStrip) {
    StripConfig config;
    return ParseStripArgs(arguments, kFirstOption, config) ? Run(HandleStripCommand, config) : 1;
  }
  if (command == kCmdDiff) {
    DiffConfig config;
    return ParseDiffArgs(arguments, kFirstOption, config) ? Run(HandleDiffCommand, config) : 1;
  }
  if (command == kCmdMerge) {
    MergeConfig config;
    return ParseMergeArgs(arguments, kFirstOption, config) ? ProcessMergeCommand(config) : 1;
  }
  if (command == kCmdUnittest) return Run(HandleUnittestCommand, arguments);
  if (command.starts_with('-')) {
    errs << "Missing command (e.g. 'merge') before option " << command;
    ErrMsg(errs);
    WriteHint("called without arguments, VexelYAMLMerge prints its version and its usage");
    return 1;
  }
  if (IsSubversionCall(arguments)) return ProcessMergeCommand(SubversionMergeConfig(arguments));
  errs << "Error: unknown command " << command;
  ErrMsg(errs);
  usage();
  return 1;
}

}  // namespace vexel_yaml
