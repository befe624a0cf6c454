#include "yaml/type_info.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/yaml_text.h"

namespace vexel_yaml {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::string Entry(const std::string& id, const std::string& name, const std::string& is_multi) {
  return "- {id: " + id + ", name: " + name + ", ismulti: " + is_multi +
         ", baseid: 2, requires: '72000000', conflicts: ''}\n";
}

TEST(ReadCompactSerializedSet, ReadsWholeGroupsLowestByteFirst) {
  EXPECT_THAT(ReadCompactSerializedSet("e9030000FFFFFFFFfeffffff72000000A"), ElementsAre(-2, -1, 114, 1001));
  EXPECT_THAT(ReadCompactSerializedSet("7200000"), IsEmpty());
  EXPECT_THROW(ReadCompactSerializedSet("7200 000"), std::runtime_error);
  EXPECT_THROW(ReadCompactSerializedSet("+1000000"), std::runtime_error);
}

TEST(YAMLTypeInfoManager, KnowsWhatTheLastFileSaidFirst) {
  const std::string header = "--- !v!0 &1\nMergeTypeInfo:\n";
  YAMLTypeInfoManager manager;
  manager.Read(*ObjectsFromText(header + Entry("23", "Renderer", "1")));
  manager.Read(*ObjectsFromText(header + Entry("33", "Filter", "2") + Entry("33", "Other", "1")));

  EXPECT_EQ(manager.GetTypeInfo(YAMLScalar::Lookup("23")), nullptr);
  const YAMLTypeInfo* const filter = manager.GetTypeInfo(YAMLScalar::Lookup("33"));
  EXPECT_EQ(filter->type_name->GetText(), "Filter");
  EXPECT_FALSE(filter->is_multi_instance);
  EXPECT_THAT(filter->requires_types, ElementsAre(YAMLScalar::Lookup("114")));
}

}  // namespace
}  // namespace vexel_yaml
