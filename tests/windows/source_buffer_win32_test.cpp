// The Windows source buffer: mapped text always ends in a NUL, also when the file fills its
// last page exactly, and failures are worded as on other systems.
#include <gtest/gtest.h>
#include <windows.h>

#include <string>

#include "scan/common/source_buffer.h"
#include "windows/scratch_folder.h"

namespace {

using pinforge_test::ScratchFolder;

size_t pageSize() {
  SYSTEM_INFO info{};
  ::GetSystemInfo(&info);
  return info.dwPageSize;
}

TEST(SourceBufferWin32, EveryFileEndsInASentinel) {
  const size_t page = pageSize();
  ScratchFolder folder;
  for (size_t size : {size_t{1}, page - 1, page, page + 1, 2 * page, 3 * page + 7}) {
    SCOPED_TRACE(size);
    std::string content(size, 'x');
    content[0] = '\r';
    content[size - 1] = '\n';
    ASSERT_TRUE(folder.write("d.vhd", content));
    std::string error;
    const auto buffer = scan::SourceBuffer::open(folder.file("d.vhd"), error);
    ASSERT_NE(buffer, nullptr) << error;
    EXPECT_EQ(buffer->text(), content);
    EXPECT_EQ(buffer->begin()[size], '\0');
  }
}

TEST(SourceBufferWin32, OpensNamesBeyondTheCodePage) {
  ScratchFolder folder;
  const std::string name = "\xc3\xa9t\xc3\xa9_\xe6\x97\xa5.vhd";  // "été_日.vhd"
  ASSERT_TRUE(folder.write(name, "entity e is end;"));
  std::string error;
  const auto buffer = scan::SourceBuffer::open(folder.file(name), error);
  ASSERT_NE(buffer, nullptr) << error;
  EXPECT_EQ(buffer->text(), "entity e is end;");
  EXPECT_EQ(buffer->path(), folder.file(name));
}

TEST(SourceBufferWin32, ReportsWhyAFileCannotBeRead) {
  ScratchFolder folder;
  ASSERT_TRUE(folder.write("empty.vhd", ""));
  const struct {
    std::string path;
    const char* error;
  } cases[] = {
      {folder.file("missing.vhd"), "No such file or directory"},
      {folder.file("no\\such\\folder.vhd"), "No such file or directory"},
      {folder.file(""), "is a directory"},
      {std::string("a\0b", 3), "No such file or directory"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.path);
    std::string error;
    EXPECT_EQ(scan::SourceBuffer::open(c.path, error), nullptr);
    EXPECT_EQ(error, c.error);
  }
  std::string error;
  const auto empty = scan::SourceBuffer::open(folder.file("empty.vhd"), error);
  ASSERT_NE(empty, nullptr) << error;
  EXPECT_EQ(empty->text().size(), 0u);
  EXPECT_EQ(empty->begin()[0], '\0');
}

}  // namespace
