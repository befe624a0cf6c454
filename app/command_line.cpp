#include "app/command_line.h"

#include <algorithm>
#include <array>
#include <span>

#include "app/usage.h"
#include "platform/edit_distance.h"
#include "platform/error_channel.h"
#include "platform/files.h"

namespace vexel_yaml {

namespace {

struct Switch {
  std::string_view name;
  bool& target;
  bool value;
};

struct ValueOption {
  std::string_view name;
  std::string& target;
};

// Takes options from `index` on, which ends at the first argument that is none of them.
bool TakeOptions(const CommandLineArguments& arguments, size_t& index, std::span<const Switch> switches,
                 std::span<const ValueOption> value_options) {
  for (; index < arguments.size(); ++index) {
    const std::string_view argument = arguments[index];
    const auto flag = std::ranges::find(switches, argument, &Switch::name);
    if (flag != switches.end()) {
      flag->target = flag->value;
      continue;
    }
    const auto option = std::ranges::find(value_options, argument, &ValueOption::name);
    if (option == value_options.end()) return true;
    if (++index == arguments.size()) {
      errs << "Error: option " << argument << " needs a value\n";
      ErrMsg(errs);
      usage();
      return false;
    }
    option->target = arguments[index];
  }
  return true;
}

// The options that `merge` takes, for whoever mistypes one. The last one is offered, but not listed: the
// message with the list is one that scripts compare.
constexpr std::array kMergeOptions = {
    kOptionUseLeft,         kOptionUseRight, kOptionUsePremerge, kOptionHeadless, kOptionUseMergeFile,
    kOptionUseConflictFile, kOptionRules,    kOptionTypeInfo,    kOptionFallback, kOptionDescribe,
    kOptionForce,           kOptionTiming,   kOptionNoThreads,   kOptionSafe};

bool IsSideOption(std::string_view argument) {
  return argument == kOptionUseLeft || argument == kOptionUseRight || argument == kOptionUsePremerge;
}

bool TakeSideOption(std::string_view option, MergeConfig& config) {
  if (config.resolve_mode != kResolveToBase) {
    errs << "Error: Only one of then -l, -r and -p may be provided";
    ErrMsg(errs);
    usage();
    return false;
  }
  config.resolve_mode = option == kOptionUseRight ? kResolveToRight : kResolveToLeft;
  if (option == kOptionUsePremerge) config.premerge = true;
  return true;
}

// "exactly" although more paths may follow: scripts may look for the wording.
bool HasEnoughPaths(std::string_view command, size_t needed, size_t given) {
  if (given >= needed) return true;
  errs << "Error: " << command << " command takes exactly " << needed << " paths but " << given
       << " was provided.";
  ErrMsg(errs);
  return false;
}

// Fills `targets` in order with the arguments from `index` on, as far as both reach.
void TakePaths(const CommandLineArguments& arguments, size_t index, std::span<std::string* const> targets) {
  for (std::string* target : targets.first(std::min(targets.size(), arguments.size() - index))) {
    *target = arguments[index++];
  }
}

// An option behind the paths is a path, and a merge that was meant to be a safe one would be none.
void HintAtLateOptions(const CommandLineArguments& arguments, size_t first_path) {
  for (size_t i = first_path; i < arguments.size(); ++i) {
    const std::string& argument = arguments[i];
    if (std::ranges::find(kMergeOptions, argument) == kMergeOptions.end()) continue;
    gHintsEnabled = gHintsEnabled || argument == kOptionSafe;
    WriteHint("'" + argument + "' stands behind the paths, and is taken for one: options stand before them");
  }
}

bool ParseFilePairArgs(std::string_view command, const CommandLineArguments& arguments, int first,
                       FilePairConfig& config) {
  const Switch switches[] = {{kOptionTiming, config.timing, true},
                             {kOptionNoThreads, config.threads, false},
                             {kOptionHeadless, gHeadlessEnabled, true}};
  const ValueOption value_options[] = {{kOptionRules, config.rules_file},
                                       {kOptionTypeInfo, config.type_info_file}};
  size_t index = static_cast<size_t>(first);
  if (!TakeOptions(arguments, index, switches, value_options)) return false;
  if (!HasEnoughPaths(command, 2, arguments.size() - index)) return false;
  std::string* const paths[] = {&config.first_path, &config.second_path, &config.output_path};
  TakePaths(arguments, index, paths);
  return true;
}

}  // namespace

bool ParseStripArgs(const CommandLineArguments& arguments, int first, StripConfig& config) {
  return ParseFilePairArgs(kCmdStrip, arguments, first, config);
}

bool ParseDiffArgs(const CommandLineArguments& arguments, int first, DiffConfig& config) {
  return ParseFilePairArgs(kCmdDiff, arguments, first, config);
}

bool ParseMergeArgs(const CommandLineArguments& arguments, int first, MergeConfig& config) {
  const Switch switches[] = {{kOptionForce, config.force, true},   {kOptionDescribe, config.describe, true},
                             {kOptionTiming, config.timing, true}, {kOptionNoThreads, config.threads, false},
                             {kOptionSafe, config.safe, true},     {kOptionHeadless, gHeadlessEnabled, true}};
  const ValueOption value_options[] = {{kOptionUseMergeFile, config.merge_file},
                                       {kOptionUseConflictFile, config.conflict_file},
                                       {kOptionRules, config.rules_file},
                                       {kOptionTypeInfo, config.type_info_file},
                                       {kOptionFallback, config.fallback_spec_file}};
  size_t index = static_cast<size_t>(first);
  for (;;) {
    if (!TakeOptions(arguments, index, switches, value_options)) return false;
    if (index == arguments.size() || !IsSideOption(arguments[index])) break;
    if (!TakeSideOption(arguments[index++], config)) return false;
  }
  gHintsEnabled = config.safe;
  if (!HasEnoughPaths(kCmdMerge, 3, arguments.size() - index)) {
    usage();
    return false;
  }
  std::string* const paths[] = {&config.base_path,
                                &config.left_path,
                                &config.right_path,
                                &config.destination_path,
                                &config.premerge_base_destination,
                                &config.premerge_right_destination};
  TakePaths(arguments, index, paths);
  HintAtLateOptions(arguments, index);
  return true;
}

bool ReportMistypedOption(const MergeConfig& config) {
  const std::string& given = config.base_path;
  if (!given.starts_with('-') || FileExists(given)) return false;
  const auto distance = [&](std::string_view option) { return EditDistance(given, option); };
  const std::string_view meant = std::ranges::min(kMergeOptions, {}, distance);
  errs << "Error: '" << given << "' is no file and no option of merge";
  if (distance(meant) * 2 < given.size()) {
    errs << "; did you mean " << meant << "?";
  } else {
    // No option is nearer than the rest.
    errs << "; merge knows";
    for (const std::string_view option : std::span(kMergeOptions).first<kMergeOptions.size() - 1>())
      errs << ' ' << option;
  }
  errs << '\n';
  ErrMsg(errs);
  return true;
}

bool IsSubversionCall(const CommandLineArguments& arguments) { return arguments.size() == 6; }

MergeConfig SubversionMergeConfig(const CommandLineArguments& arguments) {
  MergeConfig config;
  config.base_path = arguments[1];
  config.left_path = arguments[2];
  config.right_path = arguments[3];
  config.destination_path = arguments[4];
  config.resolve_mode = kResolveToLeft;
  config.force = true;
  return config;
}

}  // namespace vexel_yaml
