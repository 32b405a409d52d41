// The argument vector built from a command line or a response file: word splitting, and the
// refusal of a response file that cannot be read, is not a regular file or holds a huge word.
#include "response_file.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <string>
#include <vector>

#include "support/scratch_dir.h"

namespace {

using Words = std::vector<std::string>;

TEST(ExpandResponseFile, WordsAndFailures) {
  pinforge_test::ScratchDir dir;
  const std::string rsp = "@" + dir.file("args.rsp");
  const std::string hugeWord(ArgumentVector::kMaxWordBytes, 'x');
  ASSERT_EQ(::mkfifo(dir.file("fifo").c_str(), 0600), 0);
  const struct {
    const char* what;
    Words args;                // after the program name
    std::string content;       // of args.rsp
    Words words;               // after "pinforge"
    std::string message = "";  // non-empty: the expansion fails with it
  } cases[] = {
      // Only the first argument can name a response file.
      {"command line",
       {"-lib", "work", "a b.vhd", "", "@x"},
       "",
       {"-lib", "work", "a b.vhd", "", "@x"}},
      {"runs of delimiters, later arguments ignored",
       {rsp, "-ignored"},
       "  -lib\twork \t a.vhd\n\n\n-module   top  \n",
       {"-lib", "work", "a.vhd", "-module", "top"}},
      {"CRLF line ends, a carriage return inside a line stays, no final newline",
       {rsp},
       "-lib work\r\na\rb\r\n-o out.vhd",
       {"-lib", "work", "a\rb", "-o", "out.vhd"}},
      {"empty file", {rsp}, "", {}},
      {"no quoting, comments or nesting",
       {rsp},
       "\"a b\" # c @inner.rsp\n",
       {"\"a", "b\"", "#", "c", "@inner.rsp"}},
      {"missing file",
       {"@" + dir.file("missing.rsp")},
       "",
       {},
       "FATAL ERROR: Unable to open response file " + dir.file("missing.rsp") + "...\n"},
      {"empty name", {"@"}, "", {}, "FATAL ERROR: Unable to open response file ...\n"},
      {"a directory",
       {"@" + dir.path()},
       "",
       {},
       "FATAL ERROR: Unable to open response file " + dir.path() + "...\n"},
      // Opening a FIFO without a writer would wait forever; reading a device, without end.
      {"a FIFO",
       {"@" + dir.file("fifo")},
       "",
       {},
       "FATAL ERROR: Response file " + dir.file("fifo") + " is not a regular file.\n"},
      {"an endless device",
       {"@/dev/zero"},
       "",
       {},
       "FATAL ERROR: Response file /dev/zero is not a regular file.\n"},
      {"a word of the largest size", {rsp}, "a\n" + hugeWord, {"a", hugeWord}},
      {"a word one byte over the largest size",
       {rsp},
       "a\n\nb " + hugeWord + "x\n",
       {},
       "FATAL ERROR: Response file " + dir.file("args.rsp") +
           ", line 3: a word is longer than 16 MB.\n"},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.what);
    ASSERT_TRUE(dir.write("args.rsp", test.content));
    Words args = test.args;
    args.insert(args.begin(), "/opt/bin/other-name");
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    pinforge_test::FilePtr messages(std::tmpfile());
    ArgumentVector expanded;
    EXPECT_EQ(
        expandResponseFile(messages.get(), static_cast<int>(args.size()), argv.data(), expanded),
        test.message.empty() ? Expansion::Ready : Expansion::Refused);
    Words words;
    for (size_t i = 1; i < expanded.count(); ++i) words.push_back(expanded[i]);
    if (test.message.empty()) {
      ASSERT_GE(expanded.count(), 1u);
      EXPECT_EQ(expanded[0], "pinforge");
      EXPECT_EQ(words, test.words);
    }
    EXPECT_EQ(pinforge_test::readBack(messages.get()), test.message);
  }
}

}  // namespace
