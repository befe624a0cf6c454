#include "app/usage.h"

#include <iostream>
#include <string_view>

namespace vexel_yaml {

namespace {

// The blanks at line ends are part of the text, which scripts may compare.
constexpr std::string_view kUsage =
    "Vexel YAML Merge Tool for scene or prefab files - version " VEXEL_VERSION
    "\n"
    "usage: VexelYAMLMerge merge  [-l|-r|-p|-h] [-i file] [-o file]\n"
    "                             [--rules rulesfile]\n"
    "                             [--fallback fallbackspecfile] \n"
    "                             [--force] [--describe]\n"
    "                             <base> <left> <right> [dest]\n"
    "                             [premerge base dest] [premerge right dest]\n"
    "       VexelYAMLMerge strip <left> <right>\n"
    "\n"
    "       -l         Resolve merge conflicts using left  (theirs)\n"
    "       -r         Resolve merge conflicts using right (mine)\n"
    "       -i file    Resolve merge conflicts using merge file\n"
    "       -o file    File to write merge conflicts into\n"
    "       -p         Use premerging\n"
    "       -h         Use 'headless' mode (no error dialogs)\n"
    "       --rules    A files with merge rules\n"
    "       --typeInfo A file with type information on objects in asset files\n"
    "       --fallback Spec file defining fallback tools on conflicts if not using\n"
    "                  builtin. Can be set to 'none' to disable fallback.\n"
    "       --force    Force merging even on unknown file extensions\n"
    "       --describe Include description of what has been done in the -o file.\n"
    "\n"
    "  The -l and -r options will first try to use the -i file if provided to\n"
    "  determine how to resolve and next fallback to either left, right\n"
    "  or base (default).\n"
    "  This is useful for using this tool as a first premerge pass before running \n"
    "  another merge tool as fallback.\n"
    "\n"
    "  For doing a normal premerge use the -p option. This will create a new left \n"
    "  (theirs) file that contains all non-conflicting merges and the left side \n"
    "  values for where there are conflicts. The same will be done the base file and\n"
    "  right file and put into a temporary file unless [premerge base dest] / \n"
    "  [premerge right dest] is specified in which case that will be used instead.\n"
    "  As a result the fallback merge tool will not show the original left,right or base\n"
    "  files but the premerged ones which contains only conflicts that this tool\n"
    "  could not handle.\n"
    "\n"
    "  The fallback tool does not use any of the options. Vexel ships with a default\n"
    "  fallback specfile that is used if nothing else is specified. Vexel also ships\n"
    "  with a default rules file that is used if nothing else is specified.\n"
    "  In order to be able to use this tool with subversion any invocation with 1st\n"
    "  argument not 'merge' is taken as being called from subversion which\n"
    "  hard codes parameters.\n"
    "\n"
    "  There is also an experimental 'diff' command which takes two files and outputs\n"
    "  the changes between the two files in a custom format. Do not rely on this\n"
    "  format to be stable as it will likely change.\n";

}  // namespace

void usage() { std::cout << kUsage; }

}  // namespace vexel_yaml
