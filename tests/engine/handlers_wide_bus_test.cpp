// Bus expansion walked one bit at a time: the bit order and bounds, the one record reused for
// every bit, and wide buses written through port lists and iterations.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "engine/expansion_list.h"
#include "engine/handlers_fixture.h"

namespace {

struct WalkCase {
  const char* name;
  int32_t left;
  int32_t right;
  std::vector<int32_t> bits;
};

class ExpansionWalkTest : public ::testing::TestWithParam<WalkCase> {};

TEST_P(ExpansionWalkTest, OneRecordVisitsEveryBitAndStaysDone) {
  const WalkCase& c = GetParam();
  PortRecord bus("bus", c.left, c.right, 'O');
  bus.setMappedName("before");
  ExpansionList bits(bus);
  bus.setMappedName("after");             // the bits keep the name the bus had when they were made
  for (int pass = 0; pass < 2; ++pass) {  // first() starts the walk over
    PortRecord* const record = bits.first();
    std::vector<int32_t> seen;
    for (PortRecord* bit = record; bit != nullptr; bit = bits.next()) {
      EXPECT_EQ(bit, record);
      EXPECT_EQ(bit->m_Right, bit->m_Left);
      EXPECT_EQ(bit->m_Name, "bus");
      EXPECT_EQ(bit->m_Dir, 'O');
      EXPECT_EQ(bit->m_MappedName.value_or(""), "before");
      seen.push_back(bit->m_Left);
    }
    EXPECT_EQ(seen, c.bits);
    EXPECT_EQ(bits.next(), nullptr);
  }
}

INSTANTIATE_TEST_SUITE_P(Ranges, ExpansionWalkTest,
                         ::testing::Values(WalkCase{"falling", 2, 0, {2, 1, 0}},
                                           WalkCase{"rising", 0, 2, {0, 1, 2}},
                                           WalkCase{"one_bit", 4, 4, {4}}),
                         [](const ::testing::TestParamInfo<WalkCase>& info) {
                           return std::string(info.param.name);
                         });

// Every bit of a wide bus in order, then the port after it, in both kinds of walk.
TEST(WideBus, ListAndIterationWriteEveryBit) {
  constexpr int32_t kWidth = 100000;
  std::string expected;
  for (int32_t i = kWidth - 1; i >= 0; --i) expected += "w_" + std::to_string(i) + "_, ";
  expected += "z";
  const std::vector<handlers_test::PortSpec> ports = {{"w", kWidth - 1, 0, 'I'},
                                                      {"z", -1, -1, 'O'}};
  for (const char* templateText :
       {"@SET OUTLINEWIDTH=2000000000@@EXPANDBUS@%port%",
        "@SET OUTLINEWIDTH=2000000000@@EXPANDBUS@@ITERATE@%PORT%@ITERATOR@@ENDITERATE@"}) {
    const handlers_test::Run run = handlers_test::runTemplate(templateText, ports);
    EXPECT_TRUE(run.completed) << templateText;
    EXPECT_TRUE(run.output == expected) << templateText;
  }
}

}  // namespace
