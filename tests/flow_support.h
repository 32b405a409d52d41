// Helpers for black-box tests that run the built pinforge binary: scratch directories, file
// reading and writing, running a program without a shell and describing text differences.
#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace flowtest {

/// A fresh, empty directory under $TMPDIR (or /tmp), removed with everything in it when the
/// object goes. path() is empty when it could not be created.
class TempDir {
 public:
  TempDir();
  ~TempDir();
  TempDir(const TempDir&) = delete;
  TempDir& operator=(const TempDir&) = delete;
  const std::string& path() const { return m_Path; }
  /// path() + "/" + name.
  std::string file(std::string_view name) const;

 private:
  std::string m_Path;
};

struct RunResult {
  bool started = false;
  int status = -1;  ///< exit code; -1 when the child did not exit normally
  std::string out;
  std::string err;
};

/// Environment changes for one run: each (name, value) replaces or adds that variable.
using EnvChanges = std::vector<std::pair<std::string, std::string>>;

/// Runs `program` (a path) with `args` in directory `cwd`, no shell involved, and collects its
/// exit status, standard output and standard error.
RunResult runProgram(const std::string& program, const std::vector<std::string>& args,
                     const std::string& cwd, const EnvChanges& env = {});

/// The whole file; `ok` (if given) tells whether it could be read.
std::string readFile(const std::string& path, bool* ok = nullptr);
bool writeFile(const std::string& path, std::string_view text, bool executable = false);
bool makeDirectory(const std::string& path);
/// True when `path` names an existing file of any kind.
bool exists(const std::string& path);

/// $PINFORGE_BIN and $PINFORGE_SOURCE_DIR; empty when unset.
std::string pinforgeBinary();
std::string sourceDir();

/// The directory on PATH that holds an executable of that name; empty when none does.
std::string directoryOnPath(std::string_view program);
/// True when an executable of that name is on PATH.
bool onPath(std::string_view program);

/// Empty when equal; otherwise a readable account of the first differing line.
std::string describeDifference(std::string_view what, std::string_view expected,
                               std::string_view actual);
/// Adds a test failure with describeDifference's account when the texts differ.
void expectSameText(std::string_view what, std::string_view expected, std::string_view actual);

}  // namespace flowtest
