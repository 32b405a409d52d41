// The messages users see for bad or unusual input: exact text, file, line and column.
#include <gtest/gtest.h>

#include <fstream>

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
    bool wholeLineEnd =
        end == run.messages.size() || run.messages[end] == '\n' || std::string(line).back() == ' ';
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

// Lexical errors are met by the index pass and again when the selected header is parsed; the
// user must see each once. Any error in the header breaks it, and a declaration cut short
// is dropped rather than reported as a port of no type.
struct HeaderErrorCase {
  const char* label;
  std::string text;
  const char* message;
};

const HeaderErrorCase kHeaderErrors[] = {
    {"stray_character", "entity e is port (a : in bit; $ b : out bit); end;\n",
     "t.vhd:1:31: error: stray character"},
    {"unterminated_string", "entity e is generic (S : string := \"ab\n); port (a : in bit); end;\n",
     "t.vhd:1:36: error: unterminated string literal"},
    {"unterminated_comment", "entity e is port (a : in bit; /* b : out bit); end;\n",
     "t.vhd:1:31: error: unterminated block comment"},
    {"nul_in_a_string", std::string("entity e is generic (S : string := \"a\0b\"); end;\n", 48),
     "t.vhd:1:36: error: NUL byte in a string literal"},
    {"unterminated_based_literal", "entity e is port (a : in bit_vector(16#F downto 0)); end;\n",
     "t.vhd:1:37: error: unterminated based literal"},
    {"port_cut_short_after_its_name", "entity e is port (a : in bit; b",
     "t.vhd:1:32: error: expected ':', found the end of the file"},
};

class HeaderErrors : public testing::TestWithParam<HeaderErrorCase> {};

TEST_P(HeaderErrors, ArePrintedOnceAndBreakTheHeader) {
  const HeaderErrorCase& c = GetParam();
  std::string path = testing::TempDir() + "/t.vhd";
  std::ofstream(path, std::ios::binary) << c.text;
  testing::internal::CaptureStderr();
  bool broken = false;
  {
    ScanExtractor extractor;
    extractor.addDesignFile("work", path.c_str(), ScanExtractor::Vhdl);
    extractor.Parse(ScanExtractor::Vhdl);
    ASSERT_TRUE(extractor.selectDesignUnit("work", "e", ScanExtractor::SearchAllLibraries));
    extractor.getPorts();
    broken = extractor.unitHasErrors();
  }
  std::string messages = testing::internal::GetCapturedStderr();
  size_t first = messages.find(c.message);
  ASSERT_NE(first, std::string::npos) << messages;
  EXPECT_EQ(messages.find(c.message, first + 1), std::string::npos) << messages;
  EXPECT_EQ(messages.find(": error: ", messages.find(": error: ") + 1), std::string::npos)
      << messages;
  EXPECT_EQ(messages.find("type ''"), std::string::npos) << messages;
  EXPECT_TRUE(broken);
}

INSTANTIATE_TEST_SUITE_P(Vhdl, HeaderErrors, testing::ValuesIn(kHeaderErrors),
                         [](const testing::TestParamInfo<HeaderErrorCase>& info) {
                           return std::string(info.param.label);
                         });

}  // namespace
