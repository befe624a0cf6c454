#include "platform/run_main.h"
#include "view/view_command.h"

int main(int argc, char** argv) { return vexel_yaml::RunMain(argc, argv, vexel_yaml::RunView); }
