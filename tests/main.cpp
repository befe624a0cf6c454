#include <gtest/gtest.h>

#include "yaml/yaml_scalar.h"

int main(int argc, char** argv) {
  testing::InitGoogleTest(&argc, argv);
  vexel_yaml::initialize();
  return RUN_ALL_TESTS();
}
