#include "platform/run_main.h"
#include "report/report_command.h"

int main(int argc, char** argv) { return vexel_yaml::RunMain(argc, argv, vexel_yaml::RunReport); }
