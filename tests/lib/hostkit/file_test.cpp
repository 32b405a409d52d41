// Files: tests and removals by name, exclusive temporary files in the directory TMPDIR
// names, file identities, and output files: checked writes, atomic replacement, what an
// interrupted or failed run leaves behind.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <set>
#include <string>
#include <vector>

#include "platform/hostkit.h"
#include "support/scratch_dir.h"

namespace {

class FileTest : public testing::Test {
 protected:
  void SetUp() override { ASSERT_FALSE(m_Dir.path().empty()); }

  pinforge_test::ScratchDir m_Dir;
};

TEST_F(FileTest, IsFileAndRemovals) {
  ASSERT_TRUE(m_Dir.write("plain.txt", ""));
  const std::string plain = m_Dir.file("plain.txt");
  ASSERT_EQ(::symlink(plain.c_str(), m_Dir.file("link").c_str()), 0);
  ASSERT_EQ(::symlink("nowhere", m_Dir.file("dangling").c_str()), 0);
  const std::pair<std::string, bool> cases[] = {
      {plain, true},         {m_Dir.file("link"), true},     {m_Dir.file("dangling"), false},
      {m_Dir.path(), false}, {m_Dir.file("missing"), false}, {"", false}};
  for (const auto& [path, expected] : cases)
    EXPECT_EQ(Host::File::isfile(path.c_str()), expected) << path;

  EXPECT_TRUE(Host::File::remove(plain.c_str()));
  EXPECT_FALSE(m_Dir.exists("plain.txt"));
  EXPECT_FALSE(Host::File::remove(plain.c_str()));
}

TEST_F(FileTest, TemporaryFilesAreNewUniqueAndCarryTheSuffix) {
  const char* tmpdir = std::getenv("TMPDIR");
  const std::string saved = tmpdir != nullptr ? tmpdir : "";
  ::setenv("TMPDIR", (m_Dir.path() + "/").c_str(), 1);
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

  std::string untouched = "keep";
  EXPECT_EQ(Host::File::createTemporary("/escape", untouched), nullptr);
  EXPECT_EQ(untouched, "keep");

  ::setenv("TMPDIR", m_Dir.file("missing").c_str(), 1);
  EXPECT_EQ(Host::File::createTemporary(".x", untouched), nullptr);
  ::setenv("TMPDIR", saved.c_str(), 1);
}

using Placement = Host::OutputFile::Placement;

mode_t modeOf(const std::string& path) {
  struct stat status {};
  return ::stat(path.c_str(), &status) == 0 ? status.st_mode & 0777 : 0;
}

bool writeAll(Host::OutputFile& file, std::string_view text) {
  return std::fwrite(text.data(), 1, text.size(), file.stream()) == text.size();
}

TEST_F(FileTest, IdentityIsTheFileNotItsSpelling) {
  ASSERT_TRUE(m_Dir.write("x", "data") && m_Dir.write("y", "data") && m_Dir.makeDir("sub"));
  ASSERT_EQ(::symlink("x", m_Dir.file("sym").c_str()), 0);
  ASSERT_EQ(::link(m_Dir.file("x").c_str(), m_Dir.file("hard").c_str()), 0);
  bool regular = false;
  const std::string x = Host::File::identity(m_Dir.file("x").c_str(), regular);
  EXPECT_TRUE(regular);
  for (const char* same : {"./x", "sym", "hard", "sub/../x"})
    EXPECT_EQ(Host::File::identity((m_Dir.path() + "/" + same).c_str(), regular), x) << same;
  EXPECT_NE(Host::File::identity(m_Dir.file("y").c_str(), regular), x);
  // Files yet to be made are told apart by their folder and name.
  const std::string fresh = Host::File::identity(m_Dir.file("new").c_str(), regular);
  EXPECT_FALSE(regular);
  EXPECT_FALSE(fresh.empty());
  EXPECT_EQ(Host::File::identity(m_Dir.file("sub/../new").c_str(), regular), fresh);
  EXPECT_NE(Host::File::identity(m_Dir.file("sub/new").c_str(), regular), fresh);
  EXPECT_EQ(Host::File::identity(m_Dir.file("none/new").c_str(), regular), "");
  EXPECT_FALSE(Host::File::identity("/dev/null", regular).empty());
  EXPECT_FALSE(regular);
}

TEST_F(FileTest, ReplacedOutputAppearsOnlyWhenCommitted) {
  const mode_t previousMask = ::umask(027);
  const std::string target = m_Dir.file("out.txt");
  const struct {
    const char* what;
    const char* before;  // null: no previous file
    mode_t previousMode;
    bool commit;
    const char* after;
    mode_t mode;
  } cases[] = {
      {"new file, committed", nullptr, 0, true, "new", 0640},
      {"new file, discarded", nullptr, 0, false, "<missing>", 0},
      {"previous file, committed", "old", 0604, true, "new", 0604},
      {"previous file, discarded", "old", 0604, false, "old", 0604},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    ::unlink(target.c_str());
    if (c.before != nullptr) {
      ASSERT_TRUE(m_Dir.write("out.txt", c.before));
      ASSERT_EQ(::chmod(target.c_str(), c.previousMode), 0);
    }
    const std::set<std::string> before = m_Dir.names();
    {
      Host::OutputFile file;
      std::string error;
      ASSERT_TRUE(file.open(target.c_str(), Placement::Replace, error)) << error;
      ASSERT_TRUE(writeAll(file, "new"));
      EXPECT_TRUE(file.close(error)) << error;
      EXPECT_EQ(m_Dir.read("out.txt"), c.before != nullptr ? c.before : "<missing>");
      if (c.commit) {
        EXPECT_TRUE(file.commit(error)) << error;
      } else {
        file.discard();
      }
    }
    EXPECT_EQ(m_Dir.read("out.txt"), c.after);
    EXPECT_EQ(modeOf(target), c.mode);
    std::set<std::string> expected = before;
    if (c.commit) expected.insert("out.txt");
    EXPECT_EQ(m_Dir.names(), expected);
  }
  ::umask(previousMask);
}

TEST_F(FileTest, FailedWritesAndOpensSayWhy) {
  ASSERT_TRUE(m_Dir.write("target", "keep") && m_Dir.write("ro", "keep") &&
              m_Dir.makeDir("folder"));
  ASSERT_EQ(::symlink("target", m_Dir.file("link").c_str()), 0);
  ASSERT_EQ(::chmod(m_Dir.file("ro").c_str(), 0444), 0);
  const struct {
    std::string path;
    Placement placement;
    std::string openError;  // empty: opens
    std::string closeError;
  } cases[] = {
      {"/dev/full", Placement::Replace, "", "No space left on device"},
      {"/dev/full", Placement::InPlace, "", "No space left on device"},
      {m_Dir.file("folder"), Placement::Replace, "Is a directory", ""},
      {m_Dir.file("missing/out"), Placement::Replace, "No such file or directory", ""},
      {m_Dir.file("target/out"), Placement::Replace, "Not a directory", ""},
      {m_Dir.file("link"), Placement::InPlaceNoFollow,
       "it is a symbolic link, which is not followed", ""},
      {m_Dir.file("ro"), Placement::Replace, "Permission denied", ""},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.path);
    if (c.openError == "Permission denied" && ::geteuid() == 0) continue;  // root writes anything
    Host::OutputFile file;
    std::string error;
    ASSERT_EQ(file.open(c.path.c_str(), c.placement, error), c.openError.empty());
    EXPECT_EQ(error, c.openError);
    if (!c.openError.empty()) continue;
    ASSERT_TRUE(writeAll(file, std::string(100000, 'x')) || std::ferror(file.stream()));
    EXPECT_FALSE(file.close(error));
    EXPECT_EQ(error, c.closeError);
    EXPECT_FALSE(file.removeWritten());
  }
  EXPECT_EQ(m_Dir.read("target"), "keep");
  EXPECT_EQ(m_Dir.read("ro"), "keep");
}

TEST_F(FileTest, RemoveWrittenTakesOnlyTheFileThisRunWrote) {
  ASSERT_TRUE(m_Dir.write("real", "old"));
  ASSERT_EQ(::symlink("real", m_Dir.file("link").c_str()), 0);
  const struct {
    const char* what;
    const char* name;
    Placement placement;
    bool commit;
    bool replacedBehind;  // another file takes the name after the run wrote it
    bool removed;
  } cases[] = {
      {"committed", "out", Placement::Replace, true, false, true},
      {"written in place", "out", Placement::InPlace, false, false, true},
      {"not committed", "out", Placement::Replace, false, false, false},
      {"replaced by someone else", "out", Placement::Replace, true, true, false},
      {"reached through a symlink", "link", Placement::Replace, false, false, false},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    Host::OutputFile file;
    std::string error;
    ASSERT_TRUE(file.open(m_Dir.file(c.name).c_str(), c.placement, error)) << error;
    ASSERT_TRUE(writeAll(file, "run"));
    if (c.commit) {
      ASSERT_TRUE(file.commit(error));
    }
    ASSERT_TRUE(file.close(error));
    if (c.replacedBehind) {
      // Made before the run's file goes, so it cannot reuse its inode number.
      ASSERT_TRUE(m_Dir.write("theirs", "theirs"));
      ASSERT_EQ(::rename(m_Dir.file("theirs").c_str(), m_Dir.file(c.name).c_str()), 0);
    }
    EXPECT_EQ(file.removeWritten(), c.removed);
    EXPECT_EQ(m_Dir.exists(c.name), !c.removed && (c.commit || c.placement != Placement::Replace ||
                                                   std::string(c.name) == "link"));
    ::unlink(m_Dir.file("out").c_str());
  }
  EXPECT_EQ(m_Dir.read("real"), "run");
}

TEST_F(FileTest, AnInterruptRemovesTheUncommittedOutput) {
  ASSERT_TRUE(m_Dir.write("out.txt", "previous"));
  const std::set<std::string> before = m_Dir.names();
  for (int number : {SIGINT, SIGTERM, SIGHUP}) {
    SCOPED_TRACE(number);
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      Host::Interrupt::install();
      Host::OutputFile file;
      std::string error;
      if (!file.open(m_Dir.file("out.txt").c_str(), Placement::Replace, error)) ::_exit(2);
      std::fputs("partial", file.stream());
      std::fflush(file.stream());
      ::raise(number);
      ::_exit(3);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    // Killed by the signal, or ended with the status a shell gives such a process.
    EXPECT_TRUE((WIFSIGNALED(status) && WTERMSIG(status) == number) ||
                (WIFEXITED(status) && WEXITSTATUS(status) == 128 + number))
        << status;
    EXPECT_EQ(m_Dir.names(), before);
    EXPECT_EQ(m_Dir.read("out.txt"), "previous");
  }
}

}  // namespace
