// The shared scan pieces: checked arithmetic, offsets to lines, and message formatting.
#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <limits>
#include <string>
#include <utility>

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/common/value.h"
#include "support/scratch_dir.h"

namespace {

constexpr int64_t kMax = std::numeric_limits<int64_t>::max();
constexpr int64_t kMin = std::numeric_limits<int64_t>::min();

struct ArithmeticCase {
  const char* op;
  int64_t a;
  int64_t b;
  bool ok;
  int64_t result;
};

const ArithmeticCase kArithmetic[] = {
    {"+", 2, 3, true, 5},
    {"+", kMax, 1, false, 0},
    {"-", kMin, 1, false, 0},
    {"-", 0, kMin, false, 0},
    {"*", 1 << 20, 1 << 20, true, int64_t{1} << 40},
    {"*", kMax / 2 + 1, 2, false, 0},
    {"/", 7, -2, true, -3},
    {"/", 1, 0, false, 0},
    {"/", kMin, -1, false, 0},
    {"**", 2, 62, true, int64_t{1} << 62},
    {"**", 2, 63, false, 0},
    {"**", -3, 3, true, -27},
    {"**", 5, 0, true, 1},
    {"**", 2, -1, false, 0},
    {"**", 1, kMax, true, 1},
};

class Arithmetic : public testing::TestWithParam<ArithmeticCase> {};

TEST_P(Arithmetic, IsChecked) {
  const ArithmeticCase& c = GetParam();
  int64_t r = 12345;
  std::string op = c.op;
  bool ok = op == "+"   ? scan::checkedAdd(c.a, c.b, r)
            : op == "-" ? scan::checkedSub(c.a, c.b, r)
            : op == "*" ? scan::checkedMul(c.a, c.b, r)
            : op == "/" ? scan::checkedDiv(c.a, c.b, r)
                        : scan::checkedPow(c.a, c.b, r);
  EXPECT_EQ(ok, c.ok);
  EXPECT_EQ(r, c.ok ? c.result : 12345);  // untouched on failure
}

INSTANTIATE_TEST_SUITE_P(Scan, Arithmetic, testing::ValuesIn(kArithmetic));

TEST(Value, ConversionsFollowTheKind) {
  EXPECT_EQ(scan::Value::boolean(true).toInteger(), 1);
  EXPECT_EQ(scan::Value::real(2.5).toInteger(), std::nullopt);
  EXPECT_EQ(scan::Value::integer(3).toReal(), 3.0);
  EXPECT_EQ(scan::Value::string("1").toReal(), std::nullopt);
  EXPECT_TRUE(scan::Value().isNone());
  EXPECT_TRUE(scan::fitsBound(std::numeric_limits<int32_t>::min()));
  EXPECT_FALSE(scan::fitsBound(int64_t{1} << 31));
}

struct LocateCase {
  const char* text;
  size_t offset;
  size_t line;
  size_t column;
  const char* lineText;
};

const LocateCase kLocate[] = {
    {"", 0, 1, 1, ""},         {"abc", 2, 1, 3, "abc"},
    {"ab\ncd", 3, 2, 1, "cd"}, {"ab\r\ncd\r\n", 5, 2, 2, "cd"},
    {"ab\n", 3, 2, 1, ""},     {"ab\ncd", 99, 2, 3, "cd"},
};

class Locate : public testing::TestWithParam<LocateCase> {};

TEST_P(Locate, FindsLineAndColumn) {
  const LocateCase& c = GetParam();
  auto buffer = scan::SourceBuffer::fromText("f.vhd", c.text);
  scan::LineColumn where = buffer->locate(c.offset);
  EXPECT_EQ(where.line, c.line);
  EXPECT_EQ(where.column, c.column);
  EXPECT_EQ(buffer->lineText(c.offset), c.lineText);
  EXPECT_EQ(buffer->begin()[buffer->text().size()], '\0');
}

INSTANTIATE_TEST_SUITE_P(Scan, Locate, testing::ValuesIn(kLocate));

TEST(Diagnostics, FormatsWithCaretUnderTheColumn) {
  auto buffer = scan::SourceBuffer::fromText("f.vhd",
                                             "x\n\tab\x01"
                                             "c\n");
  scan::Diagnostic d{scan::Severity::Warning, buffer.get(), {}, 5, "bad \x02 thing"};
  EXPECT_EQ(scan::Diagnostics::format(d), "f.vhd:2:4: warning: bad ? thing\n  \tab?c\n  \t  ^\n");
  scan::Diagnostic whole{scan::Severity::Error, nullptr, "g.vhd", 0, "No such file"};
  EXPECT_EQ(scan::Diagnostics::format(whole), "g.vhd: error: No such file\n");
}

TEST(Diagnostics, LongLinesAreClippedAroundTheCaret) {
  std::string line(100000, 'a');
  auto buffer = scan::SourceBuffer::fromText("f.vhd", line);
  scan::Diagnostic d{scan::Severity::Error, buffer.get(), {}, 50000, "x"};
  std::string text = scan::Diagnostics::format(d);
  EXPECT_LT(text.size(), 400u);
  EXPECT_NE(text.find("f.vhd:1:50001: error: x\n"), std::string::npos);
}

TEST(Diagnostics, CountsEverythingButPrintsUpToTheCap) {
  pinforge_test::FilePtr sink(std::tmpfile());
  ASSERT_NE(sink, nullptr);
  scan::Diagnostics diagnostics(sink.get(), 2);
  for (int i = 0; i < 5; ++i) diagnostics.fileError("f", "e");
  diagnostics.warning(*scan::SourceBuffer::fromText("f", "x"), 0, "w");
  EXPECT_EQ(diagnostics.errorCount(), 5u);
  EXPECT_EQ(diagnostics.warningCount(), 1u);
  EXPECT_EQ(pinforge_test::readBack(sink.get()),
            "f: error: e\nf: error: e\n"
            "pinforge: too many messages from the design files; the rest are not shown\n");
}

TEST(SourceBuffer, FilesEndInASentinelEvenOnPageBoundaries) {
  pinforge_test::ScratchDir dir;
  const size_t page = static_cast<size_t>(::sysconf(_SC_PAGESIZE));
  for (const size_t size : {size_t{0}, page}) {
    ASSERT_TRUE(dir.write("f.vhd", std::string(size, 'x')));
    std::string error;
    auto buffer = scan::SourceBuffer::open(dir.file("f.vhd"), error);
    ASSERT_NE(buffer, nullptr) << error;
    EXPECT_EQ(buffer->text().size(), size);
    EXPECT_EQ(buffer->begin()[size], '\0');
  }
}

TEST(SourceBuffer, SaysWhyAFileCannotBeReadWithoutBlocking) {
  pinforge_test::ScratchDir dir;
  ASSERT_EQ(::mkfifo(dir.file("fifo").c_str(), 0600), 0);
  const std::pair<std::string, const char*> cases[] = {
      {"/nonexistent/x.vhd", "No such file or directory"},
      {dir.path(), "is a directory"},
      {dir.file("fifo"), "not a regular file"},
      {"/dev/zero", "not a regular file"},
      {"/dev/null", "not a regular file"}};
  for (const auto& [path, reason] : cases) {
    std::string error;
    EXPECT_EQ(scan::SourceBuffer::open(path, error), nullptr) << path;
    EXPECT_EQ(error, reason) << path;
  }
}

}  // namespace
