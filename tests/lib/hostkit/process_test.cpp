// Child processes: exit statuses, programs that cannot start or are killed, arguments passed
// verbatim, both output streams collected (NUL bytes included) without stalling on large
// output, the child's own process group and closed descriptors, and where a program is found.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "platform/hostkit.h"
#include "support/scratch_dir.h"

namespace {

using Words = std::vector<std::string>;

struct Collected {
  std::string text;
  int pieces = 0;
  int ends = 0;
};

class Collector : public Host::ChildOutput {
 public:
  Collector(Collected& into, int stopAfter) : m_Into(into), m_StopAfter(stopAfter) {}
  bool OnOutput(std::string_view text) override {
    m_Into.text += text;
    ++m_Into.pieces;
    return m_StopAfter == 0 || m_Into.pieces < m_StopAfter;
  }
  void OnEnd() override { ++m_Into.ends; }

 private:
  Collected& m_Into;
  int m_StopAfter;
};

Words shell(const std::string& script) { return {"/bin/sh", "-c", script}; }

TEST(Process, StatusAndOutput) {
  // A descriptor left open across exec on purpose, at a number no shell uses on its own.
  const int leaked = ::dup2(::open("/dev/null", O_RDONLY), 37);
  ASSERT_EQ(leaked, 37);
  const std::string megabyte = "head -c 1048576";
  const struct {
    Words argv;
    int status;  // -1: any failure
    std::string output;
    size_t outputSize = 0;  // checked instead of `output` when not 0
    int stopAfter = 0;      // the receiver asks to stop after this many pieces
  } cases[] = {
      {{"/bin/true"}, 0, ""},
      {shell("exit 7"), 7, ""},
      {{"/usr/bin/printf", "%s|", "a  b", "c\"d e", "-x", ""}, 0, "a  b|c\"d e|-x||"},
      {shell("echo to-err >&2; exit 1"), 1, "to-err\n"},
      {shell("printf 'a\\0b\\0'"), 0, std::string("a\0b\0", 4)},
      {{"/bin/cat"}, 0, ""},
      {{"/nonexistent/dir/prog"}, -1, ""},
      {{"true"}, -1, ""},  // a bare name is not looked up
      {{""}, -1, ""},
      {{}, -1, ""},
      {shell("kill -9 $$"), 128 + 9, ""},
      {shell("kill -TERM $$"), 128 + 15, ""},
      {shell("[ \"$(cut -d' ' -f5 /proc/$$/stat)\" = $$ ] && echo own group"), 0, "own group\n"},
      {shell("[ -e /proc/self/fd/37 ] && echo inherited; exit 0"), 0, ""},
      // A megabyte on standard error first: a reader that waited on standard output alone
      // would leave the child blocked on a full pipe.
      {shell("yes abcdefghijklmno | " + megabyte + " >&2; yes 0123456789 | " + megabyte), 0, "",
       2u * 1048576u},
      {shell("yes | " + megabyte), 0, "", 0, 1},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.argv.empty() ? "(no words)" : c.argv.back());
    Collected collected;
    Collector collector(collected, c.stopAfter);
    const int status = Host::Process::run(c.argv, &collector);
    if (c.status < 0) {
      EXPECT_NE(status, 0);
    } else {
      EXPECT_EQ(status, c.status);
    }
    if (c.stopAfter != 0) {
      EXPECT_EQ(collected.pieces, c.stopAfter);
    } else if (c.outputSize != 0) {
      EXPECT_EQ(collected.text.size(), c.outputSize);
    } else {
      EXPECT_EQ(collected.text, c.output);
    }
    EXPECT_EQ(collected.ends, 1);
  }
  EXPECT_EQ(Host::Process::run(shell("echo ignored"), nullptr), 0);
  ::close(leaked);
}

TEST(Process, FindProgram) {
  pinforge_test::ScratchDir dir;
  for (const char* sub : {"a", "b", "cwd", "cwd/rel"}) ASSERT_TRUE(dir.makeDir(sub));
  for (const char* file : {"a/tool", "b/tool", "cwd/tool", "cwd/rel/tool", "b/runscr"})
    ASSERT_TRUE(dir.write(file, "#!/bin/sh\n", true));
  ASSERT_TRUE(dir.write("a/plain", "not executable"));
  ASSERT_TRUE(dir.write("b/plain", "#!/bin/sh\n", true));
  ASSERT_TRUE(dir.makeDir("a/folder"));
  ASSERT_TRUE(dir.write("b/folder", "#!/bin/sh\n", true));
  // The test binary sits beside the build's runscr, so that one must win over PATH.
  const std::string besideUs = Host::File::executableDirectory() + "/runscr";
  ASSERT_EQ(::access(besideUs.c_str(), X_OK), 0);
  // PATH entries count only when absolute.
  const std::string root = std::filesystem::absolute(dir.path()).string();
  const std::string a = root + "/a";
  const std::string b = root + "/b";
  const struct {
    std::string path;
    std::string name;
    std::string found;
  } cases[] = {
      {a + ":" + b, "tool", a + "/tool"},
      {b + ":" + a, "tool", b + "/tool"},
      {a + ":" + b, "runscr", besideUs},
      // Empty and relative entries mean the current folder, which is never searched.
      {":.:rel:./:" + b, "tool", b + "/tool"},
      {"", "tool", ""},
      {":.:rel", "tool", ""},
      {a + ":" + b, "plain", b + "/plain"},
      {a + ":" + b, "folder", b + "/folder"},
      {a + ":" + b, "missing", ""},
      {a + ":" + b, "a/tool", ""},
      {a + ":" + b, "", ""},
  };
  const char* path = std::getenv("PATH");
  const std::string savedPath = path != nullptr ? path : "/usr/bin:/bin";
  const std::filesystem::path savedFolder = std::filesystem::current_path();
  std::filesystem::current_path(dir.file("cwd"));
  for (const auto& c : cases) {
    ::setenv("PATH", c.path.c_str(), 1);
    EXPECT_EQ(Host::Process::findProgram(c.name), c.found) << c.path << " " << c.name;
  }
  ::setenv("PATH", savedPath.c_str(), 1);
  std::filesystem::current_path(savedFolder);
}

}  // namespace
