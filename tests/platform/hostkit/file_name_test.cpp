// File-name helper: extension, tail and directory of paths written with either separator.
#include <gtest/gtest.h>

#include "platform/hostkit.h"

namespace {

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

}  // namespace
