// Child processes: exit statuses, programs that cannot start or are killed, quoting of the
// command line, and collection of both output streams without stalling on large output.
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "platform/hostkit.h"

namespace {

struct Collected {
  std::string text;
  int pieces = 0;
  int ends = 0;
};

// Stores into a record the test keeps, because the runner owns and destroys the receiver.
class Collector : public Host::ChildOutput {
 public:
  Collector(std::shared_ptr<Collected> into, int stopAfter)
      : m_Into(std::move(into)), m_StopAfter(stopAfter) {}
  bool OnOutput(const char* text) override {
    m_Into->text += text;
    ++m_Into->pieces;
    return m_StopAfter == 0 || m_Into->pieces < m_StopAfter;
  }
  void OnEnd() override { ++m_Into->ends; }

 private:
  std::shared_ptr<Collected> m_Into;
  int m_StopAfter;
};

TEST(Process, StatusAndOutput) {
  const std::string megabyte = "head -c 1048576";
  const struct {
    std::string commandLine;
    int status;  // -1: any failure
    std::string output;
    size_t outputSize = 0;  // checked instead of `output` when not 0
    int stopAfter = 0;      // the receiver asks to stop after this many pieces
  } cases[] = {
      {"true", 0, ""},
      {"sh -c \"exit 7\"", 7, ""},
      {"  printf \"%s|\"  \"a  b\"\tc\"d e\" ", 0, "a  b|cd e|"},
      {"sh -c \"echo to-err >&2; exit 1\"", 1, "to-err\n"},
      {"sh -c \"printf 'a\\0b'\"", 0, "ab"},
      {"cat", 0, ""},
      {"pinforge-no-such-program-here", -1, ""},
      {"/nonexistent/dir/prog", -1, ""},
      {"", -1, ""},
      {"sh -c \"kill -9 $$\"", -1, ""},
      {"sh -c \"kill -TERM $$\"", -1, ""},
      // A megabyte on standard error first: a reader that waited on standard output alone
      // would leave the child blocked on a full pipe.
      {"sh -c \"yes abcdefghijklmno | " + megabyte + " >&2; yes 0123456789 | " + megabyte + "\"",
       0, "", 2u * 1048576u},
      {"sh -c \"yes | " + megabyte + "\"", 0, "", 0, 1},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.commandLine);
    auto collected = std::make_shared<Collected>();
    Host::Process process;
    const int status = process.RunNoWindow(c.commandLine.c_str(),
                                           std::make_unique<Collector>(collected, c.stopAfter), 0,
                                           true, true, false);
    if (c.status < 0) {
      EXPECT_NE(status, 0);
    } else {
      EXPECT_EQ(status, c.status);
    }
    if (c.stopAfter != 0) {
      EXPECT_EQ(collected->pieces, c.stopAfter);
    } else if (c.outputSize != 0) {
      EXPECT_EQ(collected->text.size(), c.outputSize);
    } else {
      EXPECT_EQ(collected->text, c.output);
    }
    EXPECT_EQ(collected->ends, 1);
  }
  Host::Process process;
  EXPECT_EQ(process.RunNoWindow("sh -c \"echo ignored\"", nullptr, 0, true, true, false), 0);
  EXPECT_NE(process.RunNoWindow(nullptr, nullptr, 0, true, true, false), 0);
}

}  // namespace
