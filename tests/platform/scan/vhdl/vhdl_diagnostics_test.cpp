// The messages users see for bad or unusual input: exact text, file, line and column.
#include <gtest/gtest.h>

#include "vhdl_test_support.h"

namespace {

struct MessageCase {
  const char* label;
  std::vector<std::pair<std::string, std::string>> files;
  const char* unit;
  bool found;
  std::vector<const char*> lines;  ///< each must appear in standard error as a whole line
  int errors;
};

const MessageCase kCases[] = {
    {"unconstrained_unevaluable_runaway_and_unknown",
     {{"work", "cfg_pkg.vhd"}, {"mylib", "lib_pkg.vhd"}, {"work", "pkg_user.vhd"}},
     "pkg_user",
     true,
     {"pkg_user.vhd:14:5: warning: port 'unc' has an unconstrained type; no range reported",
      "pkg_user.vhd:37:5: warning: port 'bad': cannot evaluate 'NOPE - 1 downto 0' ('NOPE' is not "
      "declared); no range reported",
      "pkg_user.vhd:38:5: warning: port 'spin': cannot evaluate 'busy_loop downto 0' (a function "
      "did not finish within 1000000 steps); no range reported",
      "pkg_user.vhd:39:14: warning: port 'ext': type 't_unknown' is not declared in any visible "
      "package; no range reported"},
     0},
    {"syntax_errors_duplicates_and_resync",
     {{"work", "errors.vhd"}},
     "broken",
     true,
     {"errors.vhd:5:8: error: expected a name after 'entity'",
      "errors.vhd:12:8: warning: entity 'dup' is already defined in library 'work' at ",
      "errors.vhd:2:20: error: expected an interface name, found ';'",
      "    port (a : in bit;; b : out bit);", "                     ^"},
     1},
    {"unreadable_files_do_not_stop_the_run",
     {{"work", "no_such_file.vhd"}, {"work", "basic.vhd"}},
     "basic",
     true,
     {"no_such_file.vhd: error: No such file or directory"},
     1},
    {"real_bounds_are_not_ranges",
     {{"work", "lexis.vhd"}},
     "lexis",
     true,
     {"lexis.vhd:18:9: warning: port 'x': cannot evaluate '2.5E1 downto 0' (the bounds of "
      "'2.5E1 downto 0' are not integers); no range reported"},
     0},
    {"missing_unit", {{"work", "basic.vhd"}}, "nowhere", false, {}, 0},
};

class Messages : public testing::TestWithParam<MessageCase> {};

TEST_P(Messages, AreReported) {
  const MessageCase& c = GetParam();
  vhdl_test::Run run = vhdl_test::extract(c.files, c.unit);
  EXPECT_EQ(run.found, c.found);
  for (const char* line : c.lines) {
    // Paths are printed as registered; compare from the file name on.
    size_t at = run.messages.find(line);
    ASSERT_NE(at, std::string::npos) << "missing: " << line << "\nin:\n" << run.messages;
    size_t end = at + std::string(line).size();
    bool wholeLineEnd = end == run.messages.size() || run.messages[end] == '\n' ||
                        std::string(line).back() == ' ';
    EXPECT_TRUE(wholeLineEnd) << line;
  }
  if (c.lines.empty()) {
    EXPECT_EQ(run.messages, "");
  }
  EXPECT_EQ(run.errors, c.errors) << run.messages;
}

INSTANTIATE_TEST_SUITE_P(Vhdl, Messages, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<MessageCase>& info) {
                           return std::string(info.param.label);
                         });

}  // namespace
