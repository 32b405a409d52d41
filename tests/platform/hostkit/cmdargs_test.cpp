// Command-line parser: the grammar read from the usage text, the occurrences and arguments it
// hands back, and the exact lines it writes when the command line does not fit.
#include <gtest/gtest.h>

#include <initializer_list>
#include <string>
#include <vector>

#include "platform/hostkit.h"

namespace {

const char kUsage[] =
    "pinforge {-lib <libname> {<vhdfile>}} \t[-lang vhdl|verilog] \t[-module <module_name>] "
    "[-prj <project>] [-template <template_file>] \t[-o <stbfile>] [-err <errfile>] "
    "[-deleteonerror] [--nodelist] [--a] [--inc]";

// Owns the words so that the parser sees a writable argv like main's.
class Argv {
 public:
  Argv(std::initializer_list<const char*> words) : m_Words(words.begin(), words.end()) {
    for (std::string& word : m_Words) m_Pointers.push_back(word.data());
    m_Pointers.push_back(nullptr);
  }
  int argc() const { return static_cast<int>(m_Words.size()); }
  char** argv() { return m_Pointers.data(); }

 private:
  std::vector<std::string> m_Words;
  std::vector<char*> m_Pointers;
};

struct Parsed {
  std::string out;
  std::string err;
  bool error;
  bool usage;
};

Parsed parse(const char* usage, std::initializer_list<const char*> words) {
  Argv args(words);
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  UT_CMDARGS parser(args.argc(), args.argv(), usage, nullptr, 0);
  Parsed result;
  result.err = testing::internal::GetCapturedStderr();
  result.out = testing::internal::GetCapturedStdout();
  result.error = parser.iserror();
  result.usage = parser.gaveusage();
  return result;
}

std::vector<std::string> arguments(const UT_CMDSWINFO* info) {
  std::vector<std::string> words;
  for (uint16_t i = 0; info != nullptr && info->getargtxt(i) != nullptr; ++i)
    words.emplace_back(info->getargtxt(i));
  return words;
}

using Words = std::vector<std::string>;

TEST(CmdArgs, LibraryGroupRepeatsWithAnyNumberOfFiles) {
  Argv args({"pinforge", "-lib", "work", "a.vhd", "b.vhd", "-module", "top", "-lib", "lib2",
             "c.vhd", "-lib", "empty"});
  UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
  ASSERT_FALSE(parser.iserror());
  EXPECT_FALSE(parser.gaveusage());
  EXPECT_EQ(arguments(parser.getsw("-lib", 0)), (Words{"work", "a.vhd", "b.vhd"}));
  EXPECT_EQ(arguments(parser.getsw("-lib", 1)), (Words{"lib2", "c.vhd"}));
  EXPECT_EQ(arguments(parser.getsw("-lib", 2)), (Words{"empty"}));
  EXPECT_EQ(parser.getsw("-lib", 3), nullptr);
  EXPECT_EQ(arguments(parser.getsw("-module", 0)), (Words{"top"}));
  EXPECT_EQ(parser.getsw("-lib", 0)->getargtxt(3), nullptr);
}

TEST(CmdArgs, FullCommandLine) {
  Argv args({"pinforge", "-lib", "work", "x.vhd", "-lang", "VHDL", "-module", "m", "-prj", "p",
             "-template", "t.stb", "-o", "out.txt", "-err", "e.log", "-deleteonerror",
             "--nodelist", "-a", "--inc"});
  UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
  ASSERT_FALSE(parser.iserror());
  const struct {
    const char* name;
    Words expected;
  } cases[] = {
      {"-lang", {"VHDL"}},   {"-module", {"m"}},   {"-prj", {"p"}},
      {"-template", {"t.stb"}}, {"-o", {"out.txt"}}, {"-err", {"e.log"}},
      {"-deleteonerror", {}}, {"-nodelist", {}},   {"--a", {}},
      {"-inc", {}},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.name);
    EXPECT_TRUE(parser.findsw(c.name));
    ASSERT_NE(parser.getsw(c.name, 0), nullptr);
    EXPECT_EQ(arguments(parser.getsw(c.name, 0)), c.expected);
  }
}

TEST(CmdArgs, OneAndTwoDashSpellingsNameOneSwitch) {
  const struct {
    const char* given;
    const char* asked;
  } cases[] = {
      {"-a", "--a"},           {"--a", "-a"},     {"-nodelist", "--nodelist"},
      {"--nodelist", "-nodelist"}, {"--module", "-module"}, {"-inc", "--inc"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.given);
    const bool takesArgument = std::string(c.asked).find("module") != std::string::npos;
    Argv args({"pinforge", c.given, takesArgument ? "top" : "--inc"});
    UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
    ASSERT_FALSE(parser.iserror());
    EXPECT_TRUE(parser.findsw(c.asked));
    EXPECT_FALSE(parser.findsw("-prj"));
    EXPECT_EQ(parser.getsw("-prj", 0), nullptr);
  }
}

TEST(CmdArgs, RepeatedSingleSwitchKeepsEveryOccurrence) {
  Argv args({"pinforge", "-module", "first", "-module", "second"});
  UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
  ASSERT_FALSE(parser.iserror());
  EXPECT_EQ(arguments(parser.getsw("-module", 0)), (Words{"first"}));
  EXPECT_EQ(arguments(parser.getsw("-module", 1)), (Words{"second"}));
}

TEST(CmdArgs, ValuesOfAlternativesAreNotEnforced) {
  Argv args({"pinforge", "-lang", "klingon"});
  UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
  ASSERT_FALSE(parser.iserror());
  EXPECT_EQ(arguments(parser.getsw("-lang", 0)), (Words{"klingon"}));
}

TEST(CmdArgs, MismatchesExplainThemselvesThenShowUsage) {
  const std::string usageLine = std::string("Usage: ") + kUsage + "\n";
  const struct {
    std::initializer_list<const char*> words;
    const char* reason;
  } cases[] = {
      {{"pinforge", "-foo"}, "unknown switch -foo"},
      {{"pinforge", "-module"}, "switch -module needs an argument <module_name>"},
      {{"pinforge", "-module", "-prj", "p"}, "switch -module needs an argument <module_name>"},
      {{"pinforge", "-lib"}, "switch -lib needs an argument <libname>"},
      {{"pinforge", "-lib", "-module", "m"}, "switch -lib needs an argument <libname>"},
      {{"pinforge", "--lang"}, "switch --lang needs an argument vhdl|verilog"},
      {{"pinforge", "stray"}, "argument stray does not belong to any switch"},
      {{"pinforge", "-module", "m", "x"}, "argument x does not belong to any switch"},
      {{"pinforge", "-deleteonerror", "yes"}, "argument yes does not belong to any switch"},
      {{"pinforge", "-prj", "p", "-", "q"}, "unknown switch -"},
      {{"pinforge", "-module", "m", "-bogus", "-h"}, "unknown switch -bogus"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.reason);
    const Parsed parsed = parse(kUsage, c.words);
    EXPECT_TRUE(parsed.error);
    EXPECT_FALSE(parsed.usage);
    EXPECT_EQ(parsed.err, std::string("pinforge: ") + c.reason + "\n" + usageLine);
    EXPECT_EQ(parsed.out, "");
  }
}

TEST(CmdArgs, HelpSwitchesShowUsageOnStandardOutput) {
  for (const char* help : {"-h", "-help", "--help", "-?"}) {
    SCOPED_TRACE(help);
    const Parsed parsed = parse(kUsage, {"pinforge", "-module", "m", help, "-nonsense"});
    EXPECT_TRUE(parsed.usage);
    EXPECT_FALSE(parsed.error);
    EXPECT_EQ(parsed.out, std::string("Usage: ") + kUsage + "\n");
    EXPECT_EQ(parsed.err, "");
  }
}

TEST(CmdArgs, ProgramNameAloneIsNotAnError) {
  const Parsed parsed = parse(kUsage, {"pinforge"});
  EXPECT_FALSE(parsed.error);
  EXPECT_FALSE(parsed.usage);
  EXPECT_EQ(parsed.err + parsed.out, "");
}

TEST(CmdArgs, QueriesForUndeclaredOrNullNamesFindNothing) {
  Argv args({"pinforge", "-module", "m"});
  UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
  EXPECT_FALSE(parser.findsw("-nothing"));
  EXPECT_FALSE(parser.findsw(nullptr));
  EXPECT_EQ(parser.getsw(nullptr, 0), nullptr);
  EXPECT_EQ(parser.getsw("-module", 1), nullptr);
}

// Other usage texts: a mandatory switch, optional and fixed-count arguments.
TEST(CmdArgs, OtherUsageTexts) {
  const char usage[] = "tool -in <file> [-range <low> <high>] [-v [<level>]] [-x {<word>}]";
  const struct {
    std::initializer_list<const char*> words;
    bool error;
    const char* err;
  } cases[] = {
      {{"tool", "-in", "f"}, false, ""},
      {{"tool", "-v"}, true, "tool: missing switch -in\n"},
      {{"tool", "-in", "f", "-range", "1"}, true, "tool: switch -range needs an argument <high>\n"},
      {{"tool", "-in", "f", "-range", "1", "2", "3"}, true,
       "tool: argument 3 does not belong to any switch\n"},
      {{"tool", "-in", "f", "-v", "2", "-x"}, false, ""},
      {{"tool", "-in", "f", "-v", "2", "3"}, true,
       "tool: argument 3 does not belong to any switch\n"},
      {{"tool", "-x", "a", "b", "c", "--in", "f"}, false, ""},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.err);
    const Parsed parsed = parse(usage, c.words);
    EXPECT_EQ(parsed.error, c.error);
    EXPECT_EQ(parsed.err, c.error ? std::string(c.err) + "Usage: " + usage + "\n" : "");
  }
}

TEST(CmdArgs, OptionalAndRepeatedArgumentsAreCollected) {
  const char usage[] = "tool [-v [<level>]] [-x {<word>}] [-pair <a> <b>]";
  Argv args({"tool", "-x", "a", "b", "-v", "-pair", "1", "2", "-x", "-v", "9"});
  UT_CMDARGS parser(args.argc(), args.argv(), usage, nullptr, 0);
  ASSERT_FALSE(parser.iserror());
  EXPECT_EQ(arguments(parser.getsw("-x", 0)), (Words{"a", "b"}));
  EXPECT_EQ(arguments(parser.getsw("-x", 1)), Words{});
  EXPECT_EQ(arguments(parser.getsw("-v", 0)), Words{});
  EXPECT_EQ(arguments(parser.getsw("-v", 1)), (Words{"9"}));
  EXPECT_EQ(arguments(parser.getsw("-pair", 0)), (Words{"1", "2"}));
}

TEST(CmdArgs, EmptyWordIsAnArgument) {
  Argv args({"pinforge", "-prj", "", "-module", "m"});
  UT_CMDARGS parser(args.argc(), args.argv(), kUsage, nullptr, 0);
  ASSERT_FALSE(parser.iserror());
  EXPECT_EQ(arguments(parser.getsw("-prj", 0)), (Words{""}));
}

}  // namespace
