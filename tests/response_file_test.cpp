// The argument vector built from a command line or a response file: word splitting, the
// argument limit and the messages of the two failures.
#include "response_file.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "support/scratch_dir.h"

namespace {

using pinforge_test::FilePtr;
using pinforge_test::ScratchDir;

struct Expansion {
  bool failed = false;
  std::vector<std::string> words;
  std::string message;
};

Expansion expand(std::vector<std::string> args) {
  std::vector<char*> argv;
  for (std::string& arg : args) argv.push_back(arg.data());
  argv.push_back(nullptr);
  FilePtr messages(std::tmpfile());
  Expansion result;
  ArgumentVector expanded;
  result.failed =
      expandResponseFile(messages.get(), static_cast<int>(args.size()), argv.data(), expanded);
  for (size_t i = 0; i < expanded.count(); ++i) result.words.push_back(expanded[i]);
  std::rewind(messages.get());
  int c;
  while ((c = std::fgetc(messages.get())) != EOF) result.message.push_back(static_cast<char>(c));
  return result;
}

TEST(ExpandResponseFile, CommandLineArgumentsAreCopiedBehindTheProgramName) {
  // Only the first argument can name a response file.
  const Expansion result = expand({"/opt/bin/other-name", "-lib", "work", "a b.vhd", "", "@x"});
  EXPECT_FALSE(result.failed);
  EXPECT_EQ(result.words,
            (std::vector<std::string>{"pinforge", "-lib", "work", "a b.vhd", "", "@x"}));
  EXPECT_EQ(result.message, "");
}

TEST(ExpandResponseFile, ResponseFileWordsAreSplitAtBlanksTabsAndNewlines) {
  const std::string longWord(25000, 'x');
  struct Case {
    const char* what;
    std::string content;
    std::vector<std::string> words;
  };
  const std::vector<Case> cases = {
      {"several lines, runs of delimiters",
       "  -lib\twork \t a.vhd\n\n\n-module   top  \n",
       {"-lib", "work", "a.vhd", "-module", "top"}},
      {"no final newline", "-o out.vhd", {"-o", "out.vhd"}},
      {"CRLF line ends", "-lib work\r\na.vhd\r\n", {"-lib", "work", "a.vhd"}},
      {"a carriage return inside a line stays", "a\rb\n", {"a\rb"}},
      {"empty file", "", {}},
      {"no quoting, comments or nesting",
       "\"a b\" # c @inner.rsp\n",
       {"\"a", "b\"", "#", "c", "@inner.rsp"}},
      {"a word far longer than any line buffer",
       "-module " + longWord + " -prj p\n",
       {"-module", longWord, "-prj", "p"}},
      {"a word across the 9999th character",
       std::string(9990, ' ') + "abcdefghijklmnop\n",
       {"abcdefghijklmnop"}},
  };
  ScratchDir dir;
  for (const Case& test : cases) {
    SCOPED_TRACE(test.what);
    ASSERT_TRUE(dir.write("args.rsp", test.content));
    const Expansion result =
        expand({"pinforge", "@" + dir.file("args.rsp"), "-ignored", "x"});
    EXPECT_FALSE(result.failed);
    std::vector<std::string> expected = {"pinforge"};
    expected.insert(expected.end(), test.words.begin(), test.words.end());
    EXPECT_EQ(result.words, expected);
    EXPECT_EQ(result.message, "");
  }
}

TEST(ExpandResponseFile, UnreadableResponseFileFailsWithItsName) {
  ScratchDir dir;
  const std::string missing = dir.file("missing.rsp");
  for (const std::string& name : {missing, std::string(), dir.path()}) {
    SCOPED_TRACE(name);
    const Expansion result = expand({"pinforge", "@" + name});
    EXPECT_TRUE(result.failed);
    EXPECT_EQ(result.message, "FATAL ERROR: Unable to open response file " + name + "...\n");
  }
}

}  // namespace
