// Files: tests and removals by name, and exclusive temporary files in the directory TMPDIR
// names.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <set>
#include <string>

#include "platform/hostkit.h"

namespace {

// A private directory that TMPDIR names while the test runs.
class FileTest : public testing::Test {
 protected:
  void SetUp() override {
    char pattern[] = "/tmp/hostkit-test-XXXXXX";
    ASSERT_NE(::mkdtemp(pattern), nullptr);
    m_Dir = pattern;
    const char* saved = std::getenv("TMPDIR");
    m_Saved = saved != nullptr ? saved : "";
    ::setenv("TMPDIR", (m_Dir + "/").c_str(), 1);
  }
  void TearDown() override {
    ::setenv("TMPDIR", m_Saved.c_str(), 1);
    EXPECT_EQ(std::system(("rm -rf '" + m_Dir + "'").c_str()), 0);
  }
  std::string makeFile(const std::string& name, mode_t mode) {
    const std::string path = m_Dir + "/" + name;
    std::FILE* file = std::fopen(path.c_str(), "w");
    if (file != nullptr) std::fclose(file);
    EXPECT_EQ(::chmod(path.c_str(), mode), 0);
    return path;
  }
  static bool exists(const std::string& path) { return ::access(path.c_str(), F_OK) == 0; }

  std::string m_Dir;
  std::string m_Saved;
};

TEST_F(FileTest, IsFileOnlyForRegularFiles) {
  const std::string plain = makeFile("plain.txt", 0644);
  ASSERT_EQ(::symlink(plain.c_str(), (m_Dir + "/link").c_str()), 0);
  ASSERT_EQ(::symlink("nowhere", (m_Dir + "/dangling").c_str()), 0);
  const std::pair<std::string, bool> cases[] = {
      {plain, true},  {m_Dir + "/link", true},     {m_Dir + "/dangling", false},
      {m_Dir, false}, {m_Dir + "/missing", false}, {"", false},
  };
  for (const auto& [path, expected] : cases)
    EXPECT_EQ(Host::File::isfile(path.c_str()), expected) << path;
  EXPECT_FALSE(Host::File::isfile(nullptr));
}

TEST_F(FileTest, RemovalsDeleteTheNamedFile) {
  const std::string writable = makeFile("w.txt", 0644);
  EXPECT_TRUE(Host::File::remove(writable.c_str()));
  EXPECT_FALSE(exists(writable));
  EXPECT_FALSE(Host::File::remove(writable.c_str()));

  const std::string readOnly = makeFile("r.txt", 0444);
  EXPECT_TRUE(Host::File::remove_f(readOnly.c_str()));
  EXPECT_FALSE(exists(readOnly));
  EXPECT_FALSE(Host::File::remove_f(readOnly.c_str()));
  EXPECT_FALSE(Host::File::remove(nullptr) || Host::File::remove_f(nullptr));
}

TEST_F(FileTest, TemporaryFilesAreNewUniqueAndCarryTheSuffix) {
  std::set<std::string> names;
  for (int i = 0; i < 50; ++i) {
    std::string name;
    std::FILE* file = Host::File::createTemporary(".tcl", name);
    ASSERT_NE(file, nullptr);
    EXPECT_GE(std::fputs("puts hi\n", file), 0);
    std::fclose(file);
    EXPECT_EQ(Host::FileName(name).GetDirectory().str(), m_Dir);
    EXPECT_EQ(Host::FileName(name).GetExtension().str(), ".tcl");
    EXPECT_TRUE(Host::File::isfile(name.c_str()));
    names.insert(name);
  }
  EXPECT_EQ(names.size(), 50u);

  const Host::StringBase freeName = Host::File::tmpnam(nullptr);
  EXPECT_EQ(Host::FileName(freeName.str()).GetDirectory().str(), m_Dir);
  EXPECT_FALSE(exists(freeName.str()));
  EXPECT_NE(freeName.str(), Host::File::tmpnam(nullptr).str());

  std::string untouched = "keep";
  EXPECT_EQ(Host::File::createTemporary("/escape", untouched), nullptr);
  EXPECT_EQ(untouched, "keep");
}

TEST_F(FileTest, TemporaryFilesFailWhenTheDirectoryIsMissing) {
  ::setenv("TMPDIR", (m_Dir + "/missing").c_str(), 1);
  std::string name;
  EXPECT_EQ(Host::File::createTemporary(".x", name), nullptr);
  EXPECT_TRUE(Host::File::tmpnam(nullptr).IsEmpty());
}

}  // namespace
