// The Windows file functions: temporary files made exclusively in the temporary folder and
// written as bytes, removal of read-only files, UTF-8 names, and the executable's folder.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstdio>
#include <set>
#include <string>

#include "platform/hostkit.h"
#include "platform/wide_text-win32.h"
#include "windows/scratch_folder.h"

namespace {

using Host::File;
using pinforge_test::ScratchFolder;

std::string temporaryFolder() {
  std::wstring folder(MAX_PATH + 1, L'\0');
  folder.resize(::GetTempPathW(static_cast<DWORD>(folder.size()), folder.data()));
  return Host::win32::narrow(folder);
}

TEST(FileWin32, TemporaryFilesAreNewUniqueAndBinary) {
  std::set<std::string> names;
  for (int i = 0; i < 3; ++i) {
    std::string name;
    std::FILE* stream = File::createTemporary(".tcl", name);
    ASSERT_NE(stream, nullptr);
    EXPECT_EQ(name.rfind(temporaryFolder() + "pinforge-", 0), 0u) << name;
    EXPECT_TRUE(name.ends_with(".tcl")) << name;
    // Line ends are written as given: a template's LF stays LF.
    EXPECT_GE(std::fputs("a\nb\r\n", stream), 0);
    std::fclose(stream);
    WIN32_FILE_ATTRIBUTE_DATA data{};
    ASSERT_TRUE(::GetFileAttributesExW(Host::win32::widen(name).c_str(), GetFileExInfoStandard,
                                       &data));
    EXPECT_EQ(data.nFileSizeLow, 5u);
    names.insert(name);
    EXPECT_TRUE(File::remove(name.c_str()));
  }
  EXPECT_EQ(names.size(), 3u);
  std::string name;
  for (const char* suffix : {"a\\b", "a/b", "c:d"})
    EXPECT_EQ(File::createTemporary(suffix, name), nullptr) << suffix;
}

TEST(FileWin32, TestsAndRemovesByUtf8Name) {
  ScratchFolder folder;
  const std::string name = folder.file("\xc3\xa9t\xc3\xa9.txt");  // "été.txt"
  ASSERT_TRUE(folder.write("\xc3\xa9t\xc3\xa9.txt", "x"));
  EXPECT_TRUE(File::isfile(name.c_str()));
  EXPECT_FALSE(File::isfile(folder.file("").c_str()));
  EXPECT_FALSE(File::isfile(folder.file("other.txt").c_str()));
  const std::wstring wide = Host::win32::widen(name);
  ASSERT_TRUE(::SetFileAttributesW(wide.c_str(), FILE_ATTRIBUTE_READONLY));
  EXPECT_FALSE(File::remove(name.c_str()));
  EXPECT_TRUE(File::remove_f(name.c_str()));
  EXPECT_FALSE(File::isfile(name.c_str()));
  EXPECT_FALSE(File::remove(name.c_str()));
}

TEST(FileWin32, ExecutableFolderHoldsTheRunningProgram) {
  const std::string folder = File::executableDirectory();
  ASSERT_FALSE(folder.empty());
  EXPECT_NE(folder.back(), '\\');
  EXPECT_TRUE(File::isfile((folder + "\\test_windows.exe").c_str())) << folder;
}

}  // namespace
