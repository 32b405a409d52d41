// Hostkit's small helpers: the string's comparison modes, ASCII-only case conversion and
// assignment (texts that hold NUL bytes included), the parts of a file name written with either
// separator, and when the debug stub's text reaches standard error.
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
  } cases[] = {{"verilog", "VERILOG", 0, 1},
               {"VeRiLoG", "verilog", 1, 0},
               {"abd", "abc", 1, 1},
               {"ab", "abc", 0, -1},
               {"", "", 0, 0},
               {"a\0b"s, "a\0c"s, 0, -1},
               {"a\0b"s, "a"s, 0, 1},
               {"\xe9", "\xc9", 1, 1},
               {"\xff", "a", 0, 1},
               {"[", "{", 1, -1}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.left + " vs " + c.right + " mode " + std::to_string(c.mode));
    EXPECT_EQ(sign(Host::StringBase(c.left).Compare(c.right, c.mode)), c.expected);
  }
}

TEST(StringBase, LowerCaseAndAssignment) {
  Host::StringBase lower("aZ09_\xe9\xc9\0@[`{~"s);
  lower.MakeLower();
  EXPECT_EQ(lower.str(), "az09_\xe9\xc9\0@[`{~"s);

  Host::StringBase text(static_cast<const char*>(nullptr));
  EXPECT_TRUE(text.IsEmpty());
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
  } cases[] = {{"templates/gen.TCL", ".TCL", "gen.TCL", "templates"},
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
               {"", "", "", ""}};
  for (const auto& c : cases) {
    SCOPED_TRACE(c.path);
    const Host::FileName name(c.path);
    EXPECT_EQ(name.GetExtension().str(), c.extension);
    EXPECT_EQ(name.GetTail().str(), c.tail);
    EXPECT_EQ(name.GetDirectory().str(), c.directory);
  }
}

TEST(MessageManager, DebugStubTextOnlyWhenAskedFor) {
  for (const bool asked : {false, true}) {
    asked ? ::setenv("PINFORGE_DEBUG_STUB", "1", 1) : ::unsetenv("PINFORGE_DEBUG_STUB");
    testing::internal::CaptureStderr();
    Host_MsgManData::debugStub("Command line is: runscr %s\n");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), asked ? "Command line is: runscr %s\n" : "");
  }
  ::unsetenv("PINFORGE_DEBUG_STUB");
}

}  // namespace
