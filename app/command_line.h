#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace vexel_yaml {

/// The program's arguments; the first one is the program's own path.
using CommandLineArguments = std::vector<std::string>;

inline constexpr std::string_view kCmdStrip = "strip";
inline constexpr std::string_view kCmdDiff = "diff";
inline constexpr std::string_view kCmdMerge = "merge";
inline constexpr std::string_view kCmdUnittest = "unittest";

inline constexpr std::string_view kOptionUseLeft = "-l";
inline constexpr std::string_view kOptionUseRight = "-r";
inline constexpr std::string_view kOptionUsePremerge = "-p";
inline constexpr std::string_view kOptionHeadless = "-h";
inline constexpr std::string_view kOptionUseMergeFile = "-i";
inline constexpr std::string_view kOptionUseConflictFile = "-o";
inline constexpr std::string_view kOptionRules = "--rules";
inline constexpr std::string_view kOptionTypeInfo = "--typeInfo";
inline constexpr std::string_view kOptionFallback = "--fallback";
inline constexpr std::string_view kOptionDescribe = "--describe";
inline constexpr std::string_view kOptionForce = "--force";
inline constexpr std::string_view kOptionTiming = "--timing";
inline constexpr std::string_view kOptionNoThreads = "--nothreads";
inline constexpr std::string_view kOptionSafe = "--safe";

inline constexpr std::string_view kDefaultSpecFile = "auto";
inline constexpr std::string_view kDefaultRulesFile = "auto";
inline constexpr std::string_view kDefaultTypeInfoFile;
/// The value of "--fallback" that switches the fallback tools off.
inline constexpr std::string_view kNoSpecFile = "none";

/// Which side a conflict is settled to where no resolution was read: base unless an option forces a side.
inline constexpr int kResolveToBase = 1;
inline constexpr int kResolveToLeft = 2;
inline constexpr int kResolveToRight = 3;

/// What `merge` was asked to do. Paths that were not given are empty.
struct MergeConfig {
  std::string base_path;
  std::string left_path;   ///< Theirs.
  std::string right_path;  ///< Mine.
  std::string destination_path;
  std::string premerge_base_destination;
  std::string premerge_right_destination;
  int resolve_mode = kResolveToBase;
  std::string merge_file;     ///< Where resolutions are read from.
  std::string conflict_file;  ///< Where conflict records are written to.
  std::string rules_file{kDefaultRulesFile};
  std::string type_info_file{kDefaultTypeInfoFile};
  std::string fallback_spec_file{kDefaultSpecFile};
  bool premerge = false;
  bool force = false;
  bool describe = false;
  bool timing = false;
  bool threads = true;
  /// Whether scenes are merged as scenes, rather than value by value.
  bool safe = false;
};

/// What a command on two files was asked to do.
struct FilePairConfig {
  std::string first_path;
  std::string second_path;
  std::string output_path;  ///< Empty for standard output.
  std::string rules_file{kDefaultRulesFile};
  std::string type_info_file{kDefaultTypeInfoFile};
  bool timing = false;
  bool threads = true;
};

struct StripConfig : FilePairConfig {};
struct DiffConfig : FilePairConfig {};

/// Parse the arguments from index `first` on: options, then paths, where the first argument that is no option
/// is the first path. They return false after an error, which has been reported. "-h" takes effect at once,
/// so that it already holds for the errors of the arguments behind it; "--safe" enables hints.
bool ParseStripArgs(const CommandLineArguments& arguments, int first, StripConfig& config);
bool ParseDiffArgs(const CommandLineArguments& arguments, int first, DiffConfig& config);
bool ParseMergeArgs(const CommandLineArguments& arguments, int first, MergeConfig& config);

/// Whether the base path is rather a mistyped option, which has been reported: it begins with "-" and names
/// no file. Such a word becomes the base path and shifts the others, so that a tool would be told to write
/// its result over an input.
bool ReportMistypedOption(const MergeConfig& config);

/// Whether Subversion called: it passes base, theirs, mine, destination and the path in the working copy,
/// without a command.
bool IsSubversionCall(const CommandLineArguments& arguments);

/// The merge that such a call asks for. Subversion passes no options, so the ones it needs are fixed:
/// conflicts go to the left side, and every kind of file is merged.
MergeConfig SubversionMergeConfig(const CommandLineArguments& arguments);

}  // namespace vexel_yaml
