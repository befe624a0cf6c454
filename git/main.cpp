#include "git/git_command.h"
#include "platform/run_main.h"

int main(int argc, char** argv) { return vexel_yaml::RunMain(argc, argv, vexel_yaml::RunGitCommand); }
