#include "app/inner_main.h"
#include "platform/run_main.h"

int main(int argc, char** argv) { return vexel_yaml::RunMain(argc, argv, vexel_yaml::InnerMain); }
