// Bus expansion walked one bit at a time: the bit order and bounds, the one record reused for
// every bit, and wide buses written through port lists and iterations.
#include <gtest/gtest.h>

#include <string>
#include <tuple>
#include <vector>

#include "engine/expansion_list.h"
#include "engine/handlers_fixture.h"

namespace {

TEST(ExpansionWalk, OneRecordVisitsEveryBitAndStaysDone) {
  const std::tuple<int32_t, int32_t, std::vector<int32_t>> ranges[] = {
      {2, 0, {2, 1, 0}}, {0, 2, {0, 1, 2}}, {4, 4, {4}}};
  for (const auto& [left, right, expected] : ranges) {
    SCOPED_TRACE(left);
    PortRecord bus("bus", left, right, 'O');
    bus.setMappedName("before");
    ExpansionList bits(bus);
    bus.setMappedName("after");             // the bits keep the name the bus had when made
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
      EXPECT_EQ(seen, expected);
      EXPECT_EQ(bits.next(), nullptr);
    }
  }
}

// Every bit of a wide bus in order, then the port after it, in both kinds of walk.
TEST(WideBus, ListAndIterationWriteEveryBit) {
  constexpr int32_t kWidth = 100000;
  std::string expected;
  for (int32_t i = kWidth - 1; i >= 0; --i) expected += "w_" + std::to_string(i) + "_, ";
  expected += "z";
  const handlers_test::Design design{{{"w", kWidth - 1, 0, 'I'}, {"z", -1, -1, 'O'}}};
  for (const char* templateText :
       {"@SET OUTLINEWIDTH=2000000000@@EXPANDBUS@%port%",
        "@SET OUTLINEWIDTH=2000000000@@EXPANDBUS@@ITERATE@%PORT%@ITERATOR@@ENDITERATE@"}) {
    const handlers_test::Run run = handlers_test::runOn(templateText, design);
    EXPECT_TRUE(run.completed) << templateText;
    EXPECT_TRUE(run.output == expected) << templateText;
  }
}

}  // namespace
