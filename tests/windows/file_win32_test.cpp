// The Windows file functions: temporary files made exclusively in the temporary folder and
// written as bytes, UTF-8 names, output files, identities, and the executable's folder.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstdio>
#include <set>
#include <string>

#include "hostkit/wide_text-win32.h"
#include "platform/hostkit.h"
#include "support/scratch_dir.h"
#include "windows/scratch_folder.h"

namespace {

using Host::File;
using pinforge_test::readFile;
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
    ASSERT_TRUE(
        ::GetFileAttributesExW(Host::win32::widen(name).c_str(), GetFileExInfoStandard, &data));
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
  EXPECT_TRUE(File::remove(name.c_str()));
  EXPECT_FALSE(File::isfile(name.c_str()));
  EXPECT_FALSE(File::remove(name.c_str()));
}

TEST(FileWin32, ExecutableFolderHoldsTheRunningProgram) {
  const std::string folder = File::executableDirectory();
  ASSERT_FALSE(folder.empty());
  EXPECT_NE(folder.back(), '\\');
  EXPECT_TRUE(File::isfile((folder + "\\test_windows.exe").c_str())) << folder;
}

TEST(FileWin32, ReplacedOutputAppearsOnlyOnCommit) {
  ScratchFolder folder;
  const std::string target = folder.file("out.txt");
  ASSERT_TRUE(folder.write("out.txt", "old"));
  std::string error;
  {
    Host::OutputFile output;
    ASSERT_TRUE(output.open(target.c_str(), Host::OutputFile::Placement::Replace, error)) << error;
    std::fputs("new\n", output.stream());
    EXPECT_EQ(readFile(target), "old");
  }
  EXPECT_EQ(readFile(target), "old");  // dropped without commit
  Host::OutputFile output;
  ASSERT_TRUE(output.open(target.c_str(), Host::OutputFile::Placement::Replace, error)) << error;
  std::fputs("new\n", output.stream());
  ASSERT_TRUE(output.commit(error)) << error;
  EXPECT_EQ(readFile(target), "new\n");
  EXPECT_TRUE(output.removeWritten());
  EXPECT_FALSE(File::isfile(target.c_str()));
  WIN32_FIND_DATAW found{};
  HANDLE search = ::FindFirstFileW(Host::win32::widen(folder.file("*")).c_str(), &found);
  int entries = 0;
  if (search != INVALID_HANDLE_VALUE) {
    do {
      if (found.cFileName[0] != L'.' || found.cFileName[1] > L'.') ++entries;
    } while (::FindNextFileW(search, &found));
    ::FindClose(search);
  }
  EXPECT_EQ(entries, 0) << "a temporary file was left behind";
}

TEST(FileWin32, OutputsThatCannotBeWritten) {
  ScratchFolder folder;
  ASSERT_TRUE(folder.write("ro.txt", "keep"));
  ASSERT_TRUE(::SetFileAttributesW(Host::win32::widen(folder.file("ro.txt")).c_str(),
                                   FILE_ATTRIBUTE_READONLY));
  const struct {
    std::string path;
    const char* error;
  } cases[] = {
      {folder.file("ro.txt"), "Permission denied"},
      {folder.file(""), "Is a directory"},
      {folder.file("no\\such\\out.txt"), "No such file or directory"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.path);
    Host::OutputFile output;
    std::string error;
    EXPECT_FALSE(output.open(c.path.c_str(), Host::OutputFile::Placement::Replace, error));
    EXPECT_EQ(error, c.error);
  }
  EXPECT_EQ(readFile(folder.file("ro.txt")), "keep");
  ::SetFileAttributesW(Host::win32::widen(folder.file("ro.txt")).c_str(), FILE_ATTRIBUTE_NORMAL);
}

TEST(FileWin32, IdentityIgnoresSpelling) {
  ScratchFolder folder;
  ASSERT_TRUE(folder.write("In.vhd", "x"));
  bool regular = false;
  const std::string file = File::identity(folder.file("In.vhd").c_str(), regular);
  EXPECT_TRUE(regular);
  std::string forward = folder.file("IN.VHD");
  for (char& c : forward)
    if (c == '\\') c = '/';
  EXPECT_EQ(File::identity(forward.c_str(), regular), file);
  const std::string fresh = File::identity(folder.file("New.txt").c_str(), regular);
  EXPECT_FALSE(regular);
  EXPECT_TRUE(fresh.starts_with("new ")) << fresh;
  EXPECT_EQ(File::identity(folder.file("NEW.TXT").c_str(), regular), fresh);
  EXPECT_EQ(File::identity(folder.file("none\\x.txt").c_str(), regular), "");
}

}  // namespace
