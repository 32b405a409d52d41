// Whole templates through the processor, one row per template: the complete output, and either
// a clean finish or the exact message with its line. The rows are in
// template_language_cases.txt; those whose input is generated are here.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "engine/handlers_fixture.h"

namespace {

using handlers_test::Design;
using handlers_test::errorAt;
using handlers_test::kDepth;
using handlers_test::nested;
using handlers_test::Row;
using handlers_test::rowName;
using handlers_test::TemplateTest;

TEST_P(TemplateTest, WritesWholeOutputAndResult) {
  const Row& row = GetParam();
  const handlers_test::Run run = handlers_test::runOn(row.templateText, row.design);
  EXPECT_EQ(run.output, row.output);
  const bool ok = row.message.empty();
  EXPECT_EQ(run.completed, ok);
  EXPECT_EQ(run.status, ok ? 0u : 2u);
  EXPECT_EQ(run.message, ok ? handlers_test::kNoError : row.message);
  EXPECT_EQ(run.warnings, row.warning.empty() ? std::vector<std::string>{}
                                              : std::vector<std::string>{row.warning});
}

INSTANTIATE_TEST_SUITE_P(
    Cases, TemplateTest,
    ::testing::ValuesIn(handlers_test::rowsFromFile("template_language_cases.txt")), rowName);

const Design kAbc{{{"a", -1, -1, 'I'}, {"b", -1, -1, 'I'}, {"c", -1, -1, 'I'}}};
const Design kDesign{{{"clk", -1, -1, 'I'}, {"data", 7, 0, 'I'}, {"q", -1, -1, 'O'}}};

std::string unknown(const std::string& token) {
  return errorAt(1, "Keyword: " + token + " is not a valid Variable or Directive name.");
}

INSTANTIATE_TEST_SUITE_P(
    Generated, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        // The message keeps 255 bytes and its newline, never splitting a character.
        {"CutDropsCharacterAcrossLimit",
         {},
         "%" + std::string(198, 'x') + "\xc3\xa9%",
         "",
         unknown("%" + std::string(198, 'x') + "\xc3\xa9%").substr(0, 253) + "\n"},
        {"CutKeepsCharacterEndingAtLimit",
         {},
         "%" + std::string(197, 'x') + "\xc3\xa9\xc3\xa9%",
         "",
         unknown("%" + std::string(197, 'x') + "\xc3\xa9\xc3\xa9%").substr(0, 254) + "\n"},
        {"NulInValue", kAbc, std::string("@SET sigdelim=\0;\0@%iport%", 25),
         std::string("a\0;\0b\0;\0c", 9)},
        {"NineLevels", kDesign, nested(9), "x"},
        {"TenthLevel", kDesign, nested(10), "", kDepth},
        {"TenthLevelInFailedBlock", kDesign, nested(10, "@IFHAS PORT=*@", "@IFHAS PORT=zz@"), "",
         kDepth}}),
    rowName);

}  // namespace
