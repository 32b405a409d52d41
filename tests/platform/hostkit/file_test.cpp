// Files: tests and removals by name, exclusive temporary files in the temporary directory, and
// the executable's own directory.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <set>
#include <string>

#include "platform/hostkit.h"

namespace {

// A private temporary directory that TMPDIR points at while the test runs.
class TempDirTest : public testing::Test {
 protected:
  void SetUp() override {
    const char* saved = std::getenv("TMPDIR");
    m_HadTmpDir = saved != nullptr;
    if (m_HadTmpDir) m_SavedTmpDir = saved;
    char pattern[] = "/tmp/hostkit-test-XXXXXX";
    ASSERT_NE(::mkdtemp(pattern), nullptr);
    m_Dir = pattern;
    ::setenv("TMPDIR", (m_Dir + "/").c_str(), 1);
  }
  void TearDown() override {
    if (m_HadTmpDir)
      ::setenv("TMPDIR", m_SavedTmpDir.c_str(), 1);
    else
      ::unsetenv("TMPDIR");
    std::string command = "rm -rf '" + m_Dir + "'";
    EXPECT_EQ(std::system(command.c_str()), 0);
  }
  std::string makeFile(const std::string& name, mode_t mode) {
    const std::string path = m_Dir + "/" + name;
    std::FILE* file = std::fopen(path.c_str(), "w");
    EXPECT_NE(file, nullptr);
    if (file != nullptr) std::fclose(file);
    ::chmod(path.c_str(), mode);
    return path;
  }

  std::string m_Dir;

 private:
  bool m_HadTmpDir = false;
  std::string m_SavedTmpDir;
};

bool exists(const std::string& path) { return ::access(path.c_str(), F_OK) == 0; }

TEST_F(TempDirTest, IsFileOnlyForRegularFiles) {
  const std::string plain = makeFile("plain.txt", 0644);
  ASSERT_EQ(::symlink(plain.c_str(), (m_Dir + "/link").c_str()), 0);
  ASSERT_EQ(::symlink("nowhere", (m_Dir + "/dangling").c_str()), 0);
  const struct {
    std::string path;
    bool expected;
  } cases[] = {
      {plain, true},
      {m_Dir + "/link", true},
      {m_Dir + "/dangling", false},
      {m_Dir, false},
      {m_Dir + "/missing", false},
      {"", false},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(Host::File::isfile(c.path.c_str()), c.expected);
  }
  EXPECT_FALSE(Host::File::isfile(nullptr));
}

TEST_F(TempDirTest, RemovalsDeleteTheNamedFile) {
  const std::string writable = makeFile("w.txt", 0644);
  EXPECT_TRUE(Host::File::remove(writable.c_str()));
  EXPECT_FALSE(exists(writable));
  EXPECT_FALSE(Host::File::remove(writable.c_str()));

  const std::string readOnly = makeFile("r.txt", 0444);
  EXPECT_TRUE(Host::File::remove_f(readOnly.c_str()));
  EXPECT_FALSE(exists(readOnly));
  EXPECT_FALSE(Host::File::remove_f(readOnly.c_str()));

  EXPECT_FALSE(Host::File::remove(nullptr));
  EXPECT_FALSE(Host::File::remove_f(nullptr));
}

TEST_F(TempDirTest, TemporaryFilesAreNewUniqueAndCarryTheSuffix) {
  std::set<std::string> names;
  for (int i = 0; i < 50; ++i) {
    std::string name;
    std::FILE* file = Host::File::createTemporary(".tcl", name);
    ASSERT_NE(file, nullptr);
    EXPECT_EQ(std::fputs("puts hi\n", file) >= 0, true);
    std::fclose(file);
    EXPECT_EQ(Host::FileName(name).GetDirectory().str(), m_Dir);
    EXPECT_EQ(Host::FileName(name).GetExtension().str(), ".tcl");
    EXPECT_TRUE(Host::File::isfile(name.c_str()));
    names.insert(name);
  }
  EXPECT_EQ(names.size(), 50u);

  std::string untouched = "keep";
  EXPECT_EQ(Host::File::createTemporary("/escape", untouched), nullptr);
  EXPECT_EQ(untouched, "keep");
}

TEST_F(TempDirTest, TemporaryFileFailsWhenTheDirectoryIsMissing) {
  ::setenv("TMPDIR", (m_Dir + "/missing").c_str(), 1);
  std::string name;
  EXPECT_EQ(Host::File::createTemporary(".x", name), nullptr);
  EXPECT_TRUE(Host::File::tmpnam(nullptr).IsEmpty());
}

TEST_F(TempDirTest, TmpnamNamesAFreeFileInTheTemporaryDirectory) {
  const Host::StringBase first = Host::File::tmpnam(nullptr);
  const Host::StringBase second = Host::File::tmpnam(nullptr);
  ASSERT_FALSE(first.IsEmpty());
  EXPECT_NE(first.str(), second.str());
  EXPECT_EQ(Host::FileName(first.str()).GetDirectory().str(), m_Dir);
  EXPECT_FALSE(exists(first.str()));
}

TEST(File, ExecutableDirectoryHoldsThisTest) {
  const std::string directory = Host::File::executableDirectory();
  ASSERT_FALSE(directory.empty());
  EXPECT_EQ(directory.front(), '/');
  struct stat status {};
  ASSERT_EQ(::stat(directory.c_str(), &status), 0);
  EXPECT_TRUE(S_ISDIR(status.st_mode));
}

}  // namespace
