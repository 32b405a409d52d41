// Hostkit's small helpers: the string's comparison modes, replacement, ASCII-only case
// conversion and formatting (texts that hold NUL bytes included), the parts of a file name
// written with either separator, and which stream the message manager's texts reach.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <string_view>

#include "platform/hostkit.h"

namespace {

using namespace std::string_literals;

int sign(int value) { return (value > 0) - (value < 0); }

TEST(StringBase, Compare) {
  const struct {
    std::string left;
    std::string right;
    int mode;
    int expected;
  } cases[] = {
      {"verilog", "VERILOG", 0, 1},
      {"VeRiLoG", "verilog", 1, 0},
      {"abd", "abc", 1, 1},
      {"ab", "abc", 0, -1},
      {"", "", 0, 0},
      {"a\0b"s, "a\0c"s, 0, -1},
      {"a\0b"s, "a"s, 0, 1},
      {"\xe9", "\xc9", 1, 1},
      {"\xff", "a", 0, 1},
      {"[", "{", 1, -1},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.left + " vs " + c.right + " mode " + std::to_string(c.mode));
    EXPECT_EQ(sign(Host::StringBase(c.left).Compare(c.right, c.mode)), c.expected);
  }
}

TEST(StringBase, Replace) {
  const struct {
    std::string text;
    std::string from;
    std::string to;
    int mode;
    std::string expected;
    int count;
  } cases[] = {
      {"aaaa", "aa", "a", 0, "aa", 2},
      {"abab", "ab", "abab", 0, "abababab", 2},
      {"Bus BUS bus", "bus", "x", 0, "Bus BUS x", 1},
      {"Bus BUS bus", "bus", "x", 1, "x x x", 3},
      {"keep", "", "y", 0, "keep", 0},
      {"cut here", " here", "", 0, "cut", 1},
      {"a\0b\0c"s, "\0"s, "-", 0, "a-b-c", 2},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.text + " / " + c.from);
    Host::StringBase text(c.text);
    EXPECT_EQ(text.Replace(c.from, c.to, c.mode), c.count);
    EXPECT_EQ(text.str(), c.expected);
  }
}

TEST(StringBase, CaseConversionFormatAndAssignment) {
  const std::string mixed = "aZ09_\xe9\xc9\0@[`{~"s;
  Host::StringBase upper(mixed);
  upper.MakeUpper();
  EXPECT_EQ(upper.str(), "AZ09_\xe9\xc9\0@[`{~"s);
  Host::StringBase lower(mixed);
  lower.MakeLower();
  EXPECT_EQ(lower.str(), "az09_\xe9\xc9\0@[`{~"s);

  Host::StringBase text("old contents");
  text.Format("%s:%d", "pinforge", 42);
  EXPECT_EQ(text.str(), "pinforge:42");
  const std::string big(5000, 'x');
  text.Format("[%s]", big.c_str());
  EXPECT_EQ(text.str(), "[" + big + "]");
  text.Format("%s", "");
  EXPECT_TRUE(text.IsEmpty());

  Host::StringBase assigned(static_cast<const char*>(nullptr));
  EXPECT_TRUE(assigned.IsEmpty());
  text = "abc";
  text = std::string("ab\0c"s);
  text += "d";
  EXPECT_EQ(text.view(), "ab\0cd"s);
  text.Empty();
  EXPECT_STREQ(text.c_str(), "");
}

TEST(FileName, Parts) {
  const struct {
    const char* path;
    const char* extension;
    const char* tail;
    const char* directory;
  } cases[] = {
      {"templates/gen.TCL", ".TCL", "gen.TCL", "templates"},
      {"C:\\work\\ent.vhd", ".vhd", "ent.vhd", "C:\\work"},
      {"mixed/dir\\name.tar.gz", ".gz", "name.tar.gz", "mixed/dir"},
      {"dir.d/noext", "", "noext", "dir.d"},
      {"trailing.", ".", "trailing.", ""},
      {".profile", "", ".profile", ""},
      {"dir/..", "", "..", "dir"},
      {"dir/.hidden.tcl", ".tcl", ".hidden.tcl", "dir"},
      {"dir/", "", "", "dir"},
      {"dir//x.y", ".y", "x.y", "dir"},
      {"/top", "", "top", "/"},
      {"", "", "", ""},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.path);
    const Host::FileName name(c.path);
    EXPECT_EQ(name.GetExtension().str(), c.extension);
    EXPECT_EQ(name.GetTail().str(), c.tail);
    EXPECT_EQ(name.GetDirectory().str(), c.directory);
  }
}

TEST(MessageManager, ErrorsGoToStandardErrorDebugTextOnlyWhenAskedFor) {
  auto manager = Host_MsgManData::createObject("Mod", "src", 1, "rev");
  ASSERT_NE(manager, nullptr);
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  manager->issueError("ERROR: something %s failed\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "ERROR: something %s failed\n");
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");

  ::unsetenv("PINFORGE_DEBUG_STUB");
  testing::internal::CaptureStderr();
  Host_MsgManData::debugStub("quiet\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");

  ::setenv("PINFORGE_DEBUG_STUB", "1", 1);
  testing::internal::CaptureStderr();
  Host_MsgManData::debugStub("Command line is: runscr x\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "Command line is: runscr x\n");
  ::unsetenv("PINFORGE_DEBUG_STUB");
}

}  // namespace
