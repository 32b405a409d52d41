// Files: tests and removals by name, and exclusive temporary files in the directory TMPDIR
// names.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <set>
#include <string>

#include "platform/hostkit.h"
#include "support/scratch_dir.h"

namespace {

// A private directory that TMPDIR names while the test runs.
class FileTest : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_FALSE(m_Dir.path().empty());
    const char* saved = std::getenv("TMPDIR");
    m_Saved = saved != nullptr ? saved : "";
    ::setenv("TMPDIR", (m_Dir.path() + "/").c_str(), 1);
  }
  void TearDown() override { ::setenv("TMPDIR", m_Saved.c_str(), 1); }

  pinforge_test::ScratchDir m_Dir;
  std::string m_Saved;
};

TEST_F(FileTest, IsFileAndRemovals) {
  ASSERT_TRUE(m_Dir.write("plain.txt", ""));
  const std::string plain = m_Dir.file("plain.txt");
  ASSERT_EQ(::symlink(plain.c_str(), m_Dir.file("link").c_str()), 0);
  ASSERT_EQ(::symlink("nowhere", m_Dir.file("dangling").c_str()), 0);
  const std::pair<std::string, bool> cases[] = {
      {plain, true},         {m_Dir.file("link"), true},     {m_Dir.file("dangling"), false},
      {m_Dir.path(), false}, {m_Dir.file("missing"), false}, {"", false},
  };
  for (const auto& [path, expected] : cases)
    EXPECT_EQ(Host::File::isfile(path.c_str()), expected) << path;
  EXPECT_FALSE(Host::File::isfile(nullptr));

  EXPECT_TRUE(Host::File::remove(plain.c_str()));
  EXPECT_FALSE(m_Dir.exists("plain.txt"));
  EXPECT_FALSE(Host::File::remove(plain.c_str()));
  ASSERT_TRUE(m_Dir.write("r.txt", ""));
  ASSERT_EQ(::chmod(m_Dir.file("r.txt").c_str(), 0444), 0);
  EXPECT_TRUE(Host::File::remove_f(m_Dir.file("r.txt").c_str()));
  EXPECT_FALSE(m_Dir.exists("r.txt"));
  EXPECT_FALSE(Host::File::remove_f(m_Dir.file("r.txt").c_str()));
  EXPECT_FALSE(Host::File::remove(nullptr) || Host::File::remove_f(nullptr));
}

TEST_F(FileTest, TemporaryFilesAreNewUniqueAndCarryTheSuffix) {
  std::set<std::string> names;
  for (int i = 0; i < 50; ++i) {
    std::string name;
    std::FILE* file = Host::File::createTemporary(".tcl", name);
    ASSERT_NE(file, nullptr);
    std::fclose(file);
    EXPECT_EQ(Host::FileName(name).GetDirectory().str(), m_Dir.path());
    EXPECT_EQ(Host::FileName(name).GetExtension().str(), ".tcl");
    EXPECT_TRUE(Host::File::isfile(name.c_str()));
    names.insert(name);
  }
  EXPECT_EQ(names.size(), 50u);

  const Host::StringBase freeName = Host::File::tmpnam(nullptr);
  EXPECT_EQ(Host::FileName(freeName.str()).GetDirectory().str(), m_Dir.path());
  EXPECT_EQ(::access(freeName.c_str(), F_OK), -1);
  EXPECT_NE(freeName.str(), Host::File::tmpnam(nullptr).str());

  std::string untouched = "keep";
  EXPECT_EQ(Host::File::createTemporary("/escape", untouched), nullptr);
  EXPECT_EQ(untouched, "keep");

  ::setenv("TMPDIR", m_Dir.file("missing").c_str(), 1);
  EXPECT_EQ(Host::File::createTemporary(".x", untouched), nullptr);
  EXPECT_TRUE(Host::File::tmpnam(nullptr).IsEmpty());
}

}  // namespace
