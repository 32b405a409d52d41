// Unreadable design and include files: an include cycle, a missing file, and FIFOs, which
// would block the open until a writer came.
#include <gtest/gtest.h>

#include <sys/stat.h>

#include <string>
#include <utility>
#include <vector>

#include "support/scratch_dir.h"
#include "verilog_read.h"

namespace {

struct FileCase {
  const char* label;
  std::vector<std::pair<std::string, std::string>> written;  ///< name, text; "" for a FIFO
  std::vector<std::string> files;                            ///< design files in the folder
  const char* unit;
  std::string outcome;  ///< "@" stands for the folder
};

TEST(VerilogFileTest, UnreadableFilesAreReported) {
  const std::vector<FileCase> cases = {
      {"IncludeCycle",
       {{"a.vh", "`include \"b.vh\"\n"},
        {"b.vh", "`include \"a.vh\"\n"},
        {"top.v", "`include \"a.vh\"\nmodule m(input a); endmodule\n"}},
       {"top.v"},
       "m",
       "ok; in a\n@/b.vh:1:1: error: include cycle: \"a.vh\" is already being read"},
      {"MissingDesignFile",
       {},
       {"x.v"},
       "x",
       "bad\n@/x.v: error: cannot read the file: No such file or directory"},
      {"FifoDesignFileAndInclude",
       {{"f.vh", ""}, {"top.v", "`include \"f.vh\"\nmodule m(input a); endmodule\n"}},
       {"f.vh", "top.v"},
       "m",
       "ok; in a\n@/f.vh: error: cannot read the file: not a regular file\n"
       "@/top.v:1:1: error: cannot read include file \"f.vh\": not a regular file"},
  };
  for (const FileCase& c : cases) {
    SCOPED_TRACE(c.label);
    pinforge_test::ScratchDir dir;
    for (const auto& [name, text] : c.written)
      ASSERT_TRUE(text.empty() ? ::mkfifo(dir.file(name).c_str(), 0600) == 0
                               : dir.write(name, text));
    verilog_test::Input input{{}, c.unit};
    for (const std::string& name : c.files) input.files.push_back(dir.file(name));
    std::string expected;
    for (const char ch : c.outcome) expected += ch == '@' ? dir.path() : std::string(1, ch);
    EXPECT_EQ(verilog_test::outcome(verilog_test::read(input)), expected);
  }
}

}  // namespace
