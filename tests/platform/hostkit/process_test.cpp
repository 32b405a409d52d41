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

struct Outcome {
  int status;
  Collected collected;
};

Outcome run(const char* commandLine, int stopAfter = 0) {
  auto collected = std::make_shared<Collected>();
  Host::Process process;
  const int status = process.RunNoWindow(
      commandLine, std::make_unique<Collector>(collected, stopAfter), 0, true, true, false);
  return {status, *collected};
}

TEST(Process, StatusAndOutput) {
  const struct {
    const char* commandLine;
    bool succeeds;
    const char* output;
  } cases[] = {
      {"true", true, ""},
      {"false", false, ""},
      {"sh -c \"exit 3\"", false, ""},
      {"  printf \"%s|\"  \"a  b\"\tc\"d e\" ", true, "a  b|cd e|"},
      {"sh -c \"echo to-out\"", true, "to-out\n"},
      {"sh -c \"echo to-err >&2; exit 1\"", false, "to-err\n"},
      {"sh -c \"printf 'a\\0b'\"", true, "ab"},
      {"cat", true, ""},
      {"pinforge-no-such-program-here", false, ""},
      {"/nonexistent/dir/prog", false, ""},
      {"", false, ""},
      {"sh -c \"kill -9 $$\"", false, ""},
      {"sh -c \"kill -TERM $$\"", false, ""},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.commandLine);
    const Outcome outcome = run(c.commandLine);
    EXPECT_EQ(outcome.status == 0, c.succeeds);
    EXPECT_EQ(outcome.collected.text, c.output);
    EXPECT_EQ(outcome.collected.ends, 1);
  }
}

TEST(Process, ExitCodeIsPassedOn) {
  EXPECT_EQ(run("sh -c \"exit 7\"").status, 7);
}

TEST(Process, BothStreamsAreCollected) {
  const Outcome outcome = run("sh -c \"echo one; echo two >&2; echo three\"");
  EXPECT_EQ(outcome.status, 0);
  for (const char* line : {"one\n", "two\n", "three\n"})
    EXPECT_NE(outcome.collected.text.find(line), std::string::npos) << line;
  EXPECT_EQ(outcome.collected.text.size(), 14u);
}

TEST(Process, LargeOutputOnBothStreamsDoesNotStall) {
  // A megabyte on standard error first: a reader that waited on standard output alone would
  // leave the child blocked on a full pipe.
  const Outcome outcome = run(
      "sh -c \"yes abcdefghijklmno | head -c 1048576 >&2; yes 0123456789 | head -c 1048576\"");
  EXPECT_EQ(outcome.status, 0);
  EXPECT_EQ(outcome.collected.text.size(), 2u * 1048576u);
  EXPECT_EQ(outcome.collected.ends, 1);
}

TEST(Process, ReceiverThatStopsStillLetsTheChildFinish) {
  const Outcome outcome = run("sh -c \"yes | head -c 1048576\"", 1);
  EXPECT_EQ(outcome.status, 0);
  EXPECT_EQ(outcome.collected.pieces, 1);
  EXPECT_EQ(outcome.collected.ends, 1);
}

TEST(Process, RunsWithoutReceiver) {
  Host::Process process;
  EXPECT_EQ(process.RunNoWindow("sh -c \"echo ignored\"", nullptr, 0, true, true, false), 0);
  EXPECT_NE(process.RunNoWindow(nullptr, nullptr, 0, true, true, false), 0);
}

}  // namespace
