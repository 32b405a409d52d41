// Command-line parser: the grammar read from the usage text, the occurrences and arguments it
// hands back, and the exact lines it writes when the command line does not fit or asks for help.
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "platform/hostkit.h"

namespace {

const char kUsage[] =
    "pinforge {-lib <libname> {<vhdfile>}} \t[-lang vhdl|verilog] \t[-module <module_name>] "
    "[-prj <project>] [-template <template_file>] \t[-o <stbfile>] [-err <errfile>] "
    "[-deleteonerror] [--nodelist] [--a] [--inc]";
const char kSmall[] = "tool -in <file> [-range <low> <high>] [-v [<level>]] [-x {<word>}]";

using Words = std::vector<std::string>;
using Occurrences = std::vector<Words>;

struct Case {
  const char* usage;
  std::vector<std::string> words;  // after the program name
  const char* reason;              // of the error, or null when the line fits
  std::vector<std::pair<const char*, Occurrences>> expected;  // switch as asked -> occurrences
};

Occurrences occurrencesOf(const UT_CMDARGS& parser, const char* name) {
  Occurrences all;
  for (uint16_t n = 0; const UT_CMDSWINFO* info = parser.getsw(name, n); ++n) {
    all.emplace_back();
    for (uint16_t i = 0; const char* word = info->getargtxt(i); ++i) all.back().emplace_back(word);
  }
  return all;
}

struct Outcome {
  std::string out;
  std::string err;
  bool error;
  bool usage;
};

template <typename Check>
Outcome parse(const char* usage, std::vector<std::string> words, Check check) {
  words.insert(words.begin(), "prog");
  std::vector<char*> argv;
  for (std::string& word : words) argv.push_back(word.data());
  argv.push_back(nullptr);
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  const UT_CMDARGS parser(static_cast<int>(words.size()), argv.data(), usage, nullptr, 0);
  Outcome run{"", testing::internal::GetCapturedStderr(), parser.iserror(), parser.gaveusage()};
  run.out = testing::internal::GetCapturedStdout();
  check(parser);
  return run;
}

TEST(CmdArgs, Grammar) {
  const Case cases[] = {
      {kUsage, {}, nullptr, {{"-lib", {}}, {"-module", {}}, {"-nothing", {}}}},
      {kUsage,
       {"-lib", "work", "a.vhd", "b.vhd", "-module", "top", "-lib", "lib2", "c.vhd", "-lib", "w"},
       nullptr,
       {{"-lib", {{"work", "a.vhd", "b.vhd"}, {"lib2", "c.vhd"}, {"w"}}}, {"-module", {{"top"}}}}},
      // Single and double dashes name the same switch; a switch may repeat.
      {kUsage,
       {"-lang", "VHDL", "-prj", "", "-deleteonerror", "--nodelist", "-a", "--module", "m",
        "-module", "n"},
       nullptr,
       {{"-lang", {{"VHDL"}}},
        {"-prj", {{""}}},
        {"-deleteonerror", {{}}},
        {"-nodelist", {{}}},
        {"--nodelist", {{}}},
        {"--a", {{}}},
        {"-a", {{}}},
        {"-module", {{"m"}, {"n"}}}}},
      {kUsage, {"-prj", "p", "-", "q"}, "unknown switch -", {}},
      {kUsage, {"-module", "m", "-bogus", "-h"}, "unknown switch -bogus", {}},
      {kUsage, {"-lib"}, "switch -lib needs an argument <libname>", {}},
      {kUsage, {"-lib", "-module", "m"}, "switch -lib needs an argument <libname>", {}},
      {kUsage, {"--lang"}, "switch --lang needs an argument vhdl|verilog", {}},
      {kUsage, {"stray"}, "argument stray does not belong to any switch", {}},
      {kUsage, {"-deleteonerror", "yes"}, "argument yes does not belong to any switch", {}},
      // A closed group ends its switch: later argument declarations do not extend it.
      {"tool [-o <f>] {<extra>}", {"-o", "a", "b"}, "argument b does not belong to any switch", {}},
      {kSmall, {"-v"}, "missing switch -in", {}},
      {kSmall, {"-in", "f", "-range", "1"}, "switch -range needs an argument <high>", {}},
      {kSmall,
       {"-in", "f", "-range", "1", "2", "3"},
       "argument 3 does not belong to any switch",
       {}},
      {kSmall,
       {"-x", "a", "b", "-v", "-range", "1", "2", "-x", "-v", "9", "--in", "f"},
       nullptr,
       {{"-x", {{"a", "b"}, {}}}, {"-v", {{}, {"9"}}}, {"-range", {{"1", "2"}}}, {"-in", {{"f"}}}}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(testing::PrintToString(c.words));
    const Outcome run = parse(c.usage, c.words, [&](const UT_CMDARGS& parser) {
      for (const auto& [name, occurrences] : c.expected) {
        EXPECT_EQ(occurrencesOf(parser, name), occurrences) << name;
        EXPECT_EQ(parser.findsw(name), !occurrences.empty()) << name;
      }
    });
    EXPECT_EQ(run.error, c.reason != nullptr);
    EXPECT_FALSE(run.usage);
    const std::string program = std::string(c.usage).substr(0, std::string(c.usage).find(' '));
    EXPECT_EQ(run.err,
              c.reason == nullptr ? "" : program + ": " + c.reason + "\nUsage: " + c.usage + "\n");
    EXPECT_EQ(run.out, "");
  }
}

TEST(CmdArgs, HelpSwitchesShowUsageOnStandardOutput) {
  for (const char* help : {"-h", "-help", "--help", "-?"}) {
    SCOPED_TRACE(help);
    const Outcome run =
        parse(kUsage, {"-module", "m", help, "-nonsense"}, [](const UT_CMDARGS&) {});
    EXPECT_TRUE(run.usage);
    EXPECT_FALSE(run.error);
    EXPECT_EQ(run.out, std::string("Usage: ") + kUsage + "\n");
    EXPECT_EQ(run.err, "");
  }
}

}  // namespace
