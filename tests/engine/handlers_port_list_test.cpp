// Port-list variables, bus expansion and the text of one port.
#include <gtest/gtest.h>

#include <climits>
#include <memory>

#include "engine/handlers_fixture.h"
#include "engine/keyword_table.h"

namespace {

using handlers_test::PortSpec;
using handlers_test::runTemplate;

const std::vector<PortSpec> kMixed = {
    {"data", 7, 0, 'I'}, {"en", -1, -1, 'I'}, {"q", -1, -1, 'O'}};

struct ListCase {
  const char* name;
  const char* templateText;
  std::vector<PortSpec> ports;
  const char* expected;
};

class PortListTest : public ::testing::TestWithParam<ListCase> {};

TEST_P(PortListTest, WritesWholeOutput) {
  const ListCase& c = GetParam();
  const handlers_test::Run run = runTemplate(c.templateText, c.ports);
  EXPECT_EQ(run.output, c.expected);
  EXPECT_EQ(run.status, 0u) << run.message;
  EXPECT_TRUE(run.completed);
}

const std::vector<PortSpec> kAbc = {{"a", -1, -1, 'I'}, {"b", -1, -1, 'I'}, {"c", -1, -1, 'I'}};
const std::vector<PortSpec> kEveryDirection = {
    {"ib", 3, 0, 'I'}, {"is", -1, -1, 'I'}, {"ob", 0, 1, 'O'}, {"os", -1, -1, 'O'},
    {"bb", 2, 2, 'B'}, {"bs", -1, -1, 'B'}, {"nb", 1, 0, 'N'}, {"ns", -1, -1, 'N'}};
const std::vector<PortSpec> kFormats = {
    {"data", 7, 0, 'I'}, {"addr", 0, 3, 'I'}, {"en", -1, -1, 'I'}, {"x", 0, 0, 'I'}};

INSTANTIATE_TEST_SUITE_P(
    Lists, PortListTest,
    ::testing::Values(
        ListCase{"iport", "%iport%", kAbc, "a, b, c"},
        ListCase{"one_port_no_delimiter", "[%iport%]", {{"a", -1, -1, 'I'}}, "[a]"},
        ListCase{"no_port_of_kind", "x%oport%y", kAbc, "xy"},
        ListCase{"node_never_built", "%node%|%signal%", kAbc, "|a, b, c"},
        ListCase{"ibusport", "%ibusport%", kMixed, "data"},
        ListCase{"iscalarport", "%iscalarport%", kMixed, "en"},
        ListCase{"iport_mixed", "%iport%", kMixed, "data, en"},
        ListCase{"obport", "%obport%", kMixed, "q"},
        ListCase{"busport", "%busport%", kMixed, "data"},
        ListCase{"scalarport", "%scalarport%", kMixed, "en, q"},
        ListCase{"signal", "%signal%", kMixed, "data, en, q"},
        ListCase{"obport_keeps_list_order", "%obport%",
                 {{"x", -1, -1, 'O'}, {"y", -1, -1, 'B'}, {"z", -1, -1, 'O'}}, "x, y, z"},
        ListCase{"all_seventeen_kinds",
                 "%iport%;%ibusport%;%iscalarport%;%oport%;%obusport%;%oscalarport%;"
                 "%bport%;%bbusport%;%bscalarport%;%obport%;%obbusport%;%obscalarport%;"
                 "%port%;%busport%;%scalarport%;%node%;%signal%",
                 kEveryDirection,
                 "ib, is;ib;is;ob, os;ob;os;bb, bs;bb;bs;ob, os, bb, bs;ob, bb;os, bs;"
                 "ib, is, ob, os, bb, bs;ib, ob, bb;is, os, bs;nb, ns;"
                 "ib, is, ob, os, bb, bs, nb, ns"},
        ListCase{"expanded_iport", "@EXPANDBUS@%iport%", kMixed,
                 "data_7_, data_6_, data_5_, data_4_, data_3_, data_2_, data_1_, data_0_, en"},
        ListCase{"expansion_switched_off_again", "@EXPANDBUS@@NOEXPANDBUS@%ibusport%", kMixed,
                 "data"},
        ListCase{"default_texts", "%port%", kFormats, "data, addr, en, x"},
        ListCase{"showrange_prefix", "@SHOWRANGE@%port%", kFormats,
                 "[7:0] data, [0:3] addr, en, [0:0] x"},
        ListCase{"showrange_postfix", "@SET SHOWRANGE=AsPostfix@%port%", kFormats,
                 "data[7:0], addr[0:3], en, x[0:0]"},
        ListCase{"postfix_remembered", "@SET SHOWRANGE=AsPostfix@@NOSHOWRANGE@%ibusport%|"
                 "@SHOWRANGE@%ibusport%", {{"data", 7, 0, 'I'}}, "data|data[7:0]"},
        ListCase{"expansion_order_and_single_bit", "@EXPANDBUS@%port%", kFormats,
                 "data_7_, data_6_, data_5_, data_4_, data_3_, data_2_, data_1_, data_0_, "
                 "addr_0_, addr_1_, addr_2_, addr_3_, en, x_0_"},
        ListCase{"expansion_ignores_showrange", "@EXPANDBUS@@SHOWRANGE@%ibusport%",
                 {{"addr", 0, 3, 'I'}}, "addr_0_, addr_1_, addr_2_, addr_3_"},
        ListCase{"bus_brackets", "@SET BUSLEFT=(@@SET BUSRIGHT=)@@EXPANDBUS@%port%",
                 {{"data", 7, 6, 'I'}}, "data(7), data(6)"},
        ListCase{"bus_no_brackets", "@SET BUSLEFT=@@SET BUSRIGHT=@@EXPANDBUS@%port%",
                 {{"data", 7, 6, 'I'}}, "data7, data6"},
        ListCase{"negative_bits", "@EXPANDBUS@%port%", {{"n", 3, -2, 'I'}},
                 "n_3_, n_2_, n_1_, n_0_, n, n_-2_"},
        ListCase{"negative_range_shown", "@SHOWRANGE@%port%", {{"n", 3, -2, 'I'}},
                 "[3:-2] n"},
        ListCase{"upcase_bit", "@UPCASE@@EXPANDBUS@%port%", {{"data", 7, 7, 'I'}}, "DATA_7_"},
        ListCase{"lowcase_range", "@LOWCASE@@SET SHOWRANGE=AsPostfix@%port%",
                 {{"DATA", 7, 0, 'I'}}, "data[7:0]"},
        ListCase{"invcase_delimiter_untouched", "@INVCASE@@SET SIGDELIM=aB@%port%",
                 {{"Data", -1, -1, 'I'}, {"x", -1, -1, 'I'}}, "dATAaBX"},
        ListCase{"wrap_after_delimiter", "@SET OUTLINEWIDTH=10@%port%",
                 {{"alpha", -1, -1, 'I'}, {"beta", -1, -1, 'I'}, {"gamma", -1, -1, 'I'}},
                 "alpha, beta, \ngamma"},
        ListCase{"wrap_width_zero", "@SET OUTLINEWIDTH=0@%port%", kAbc, "a, \nb, \nc"}),
    [](const ::testing::TestParamInfo<ListCase>& info) { return std::string(info.param.name); });

}  // namespace

namespace {

struct ExpandCase {
  const char* name;
  int32_t left;
  int32_t right;
  std::vector<int32_t> bits;
};

class ExpandBusTest : public ::testing::TestWithParam<ExpandCase> {};

TEST_P(ExpandBusTest, BitsRunFromLeftToRightInclusive) {
  const ExpandCase& c = GetParam();
  StbDataList data(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
  Forge forge(nullptr, nullptr, nullptr, &data);
  PortRecord bus("bus", c.left, c.right, 'B');
  bus.setMappedName("m");
  std::unique_ptr<ExpansionList> bits = forge.expandBus(bus);
  std::vector<int32_t> seen;
  for (PortRecord* bit = bits->first(); bit != nullptr; bit = bits->next()) {
    EXPECT_EQ(bit->m_Name, "bus");
    EXPECT_EQ(bit->m_Left, bit->m_Right);
    EXPECT_EQ(bit->m_Dir, 'B');
    EXPECT_EQ(bit->m_MappedName.value_or(""), "m");
    seen.push_back(bit->m_Left);
  }
  EXPECT_EQ(seen, c.bits);
}

INSTANTIATE_TEST_SUITE_P(
    Ranges, ExpandBusTest,
    ::testing::Values(ExpandCase{"falling", 3, 0, {3, 2, 1, 0}},
                      ExpandCase{"rising", 0, 2, {0, 1, 2}},
                      ExpandCase{"one_bit", 5, 5, {5}},
                      ExpandCase{"through_minus_one", 1, -2, {1, 0, -1, -2}},
                      ExpandCase{"top_of_range", INT32_MAX - 1, INT32_MAX, {INT32_MAX - 1, INT32_MAX}},
                      ExpandCase{"bottom_of_range", INT32_MIN + 1, INT32_MIN,
                                 {INT32_MIN + 1, INT32_MIN}}),
    [](const ::testing::TestParamInfo<ExpandCase>& info) { return std::string(info.param.name); });

// The walk behind port lists and iterations, driven directly.
TEST(SelectPort, WalksKindThenStaysExhausted) {
  StbDataList data(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
  handlers_test::fillPorts(data, {{"a", -1, -1, 'O'}, {"d", 1, 0, 'I'}, {"e", -1, -1, 'I'}});
  Forge forge(nullptr, nullptr, nullptr, &data);
  forge.m_ExpandBus = true;
  std::string seen;
  for (PortRecord* p = forge.selectPort(kKwIPort, true); p != nullptr;
       p = forge.selectPort(kKwIPort, false)) {
    seen += p->m_Name + std::to_string(p->m_Left) + " ";
    forge.m_ExpandBus = false;  // a bus already being handed out keeps coming as bits
  }
  EXPECT_EQ(seen, "d1 d0 e-1 ");
  EXPECT_EQ(forge.selectPort(kKwIPort, false), nullptr);
  EXPECT_EQ(forge.m_Expansion, nullptr);
  EXPECT_EQ(forge.selectPort(kKwOPort, true)->m_Name, "a");
  EXPECT_EQ(forge.selectPort(kKwNode, true), nullptr);
  EXPECT_EQ(forge.selectPort(kKwModule, true), nullptr);
}

TEST(SelectPort, SearchesLeaveTheWalkAlone) {
  StbDataList data(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
  handlers_test::fillPorts(data, {{"d", 1, 0, 'I'}, {"e", -1, -1, 'I'}});
  Forge forge(nullptr, nullptr, nullptr, &data);
  forge.m_ExpandBus = true;
  PortRecord* bit = forge.selectPort(kKwPort, true);
  ASSERT_NE(bit, nullptr);
  EXPECT_EQ(forge.searchPort(kKwSignal, true)->m_Name, "d");
  EXPECT_EQ(forge.searchPort(kKwSignal, false)->m_Name, "e");
  EXPECT_EQ(forge.searchPort(kKwSignal, false), nullptr);
  EXPECT_EQ(forge.searchPort(kKwSignal, false), nullptr);
  EXPECT_EQ(bit->m_Left, 1);
  EXPECT_EQ(forge.selectPort(kKwPort, false)->m_Left, 0);
  EXPECT_EQ(forge.selectPort(kKwPort, false)->m_Name, "e");
}

}  // namespace
