// Plumbing for the tests that hold the extractor against external HDL tools: locating a tool
// on PATH, running it without a shell, a scratch directory per suite, whole-file reads and
// writes, and the list of fixture files a suite runs over.
#pragma once

#include <fcntl.h>
#include <stdlib.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace difftest {

/// The full path of `name` found on PATH, or empty when it is not installed.
inline std::string findTool(const std::string& name) {
  const char* path = std::getenv("PATH");
  std::string_view dirs = path != nullptr ? path : "/usr/bin:/bin";
  while (true) {
    const size_t colon = dirs.find(':');
    std::string dir(dirs.substr(0, colon));
    if (dir.empty()) dir = ".";
    const std::string candidate = dir + "/" + name;
    if (access(candidate.c_str(), X_OK) == 0) return candidate;
    if (colon == std::string_view::npos) return "";
    dirs.remove_prefix(colon + 1);
  }
}

struct ToolRun {
  int status = -1;     ///< exit code; -1 when the tool could not start or was killed
  std::string output;  ///< standard output and standard error, interleaved
};

/// Runs `argv` (argv[0] a full path) with standard input from /dev/null, in `workDir` when
/// one is given. A tool that hangs is killed after `timeoutSeconds` so a broken installation
/// cannot stall the suite.
inline ToolRun runTool(const std::vector<std::string>& argv, const std::string& workDir = "",
                       unsigned timeoutSeconds = 120) {
  ToolRun run;
  std::vector<char*> args;
  for (const std::string& arg : argv) args.push_back(const_cast<char*>(arg.c_str()));
  args.push_back(nullptr);
  int pipeFds[2];
  if (argv.empty() || pipe2(pipeFds, O_CLOEXEC) != 0) return run;
  const pid_t pid = fork();
  if (pid == 0) {
    const int devNull = open("/dev/null", O_RDONLY);
    if (devNull < 0 || dup2(devNull, 0) < 0 || dup2(pipeFds[1], 1) < 0 ||
        dup2(pipeFds[1], 2) < 0 || (!workDir.empty() && chdir(workDir.c_str()) != 0))
      _exit(127);
    alarm(timeoutSeconds);
    execv(args[0], args.data());
    _exit(127);
  }
  close(pipeFds[1]);
  char buffer[8192];
  while (pid > 0) {
    const ssize_t got = read(pipeFds[0], buffer, sizeof buffer);
    if (got > 0) {
      run.output.append(buffer, static_cast<size_t>(got));
    } else if (got == 0 || errno != EINTR) {
      break;
    }
  }
  close(pipeFds[0]);
  if (pid < 0) return run;
  int wstatus = 0;
  while (waitpid(pid, &wstatus, 0) < 0) {
    if (errno != EINTR) return run;
  }
  run.status = WIFEXITED(wstatus) ? WEXITSTATUS(wstatus) : -1;
  return run;
}

/// `text` in lower case (ASCII only: identifiers are compared, not prose).
inline std::string lowerCase(std::string_view text) {
  std::string lower(text);
  for (char& c : lower)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return lower;
}

/// The first line of a tool's output that mentions an error, else its first line: enough to
/// say why a fixture was skipped without flooding the log.
inline std::string firstErrorLine(const std::string& output) {
  size_t pos = lowerCase(output).find("error");
  pos = pos == std::string::npos ? 0 : output.rfind('\n', pos);
  pos = pos == std::string::npos ? 0 : pos + (output[pos] == '\n' ? 1 : 0);
  return output.substr(pos, output.find('\n', pos) - pos);
}

/// A private directory removed with its contents when the object goes away.
class ScratchDir {
 public:
  ScratchDir() {
    std::error_code error;
    std::string pattern =
        (std::filesystem::temp_directory_path(error) / "pinforge-diff-XXXXXX").string();
    if (mkdtemp(pattern.data()) != nullptr) m_Path = pattern;
  }
  ~ScratchDir() {
    std::error_code error;
    if (!m_Path.empty()) std::filesystem::remove_all(m_Path, error);
  }
  ScratchDir(const ScratchDir&) = delete;
  ScratchDir& operator=(const ScratchDir&) = delete;

  /// Empty when the directory could not be created.
  const std::string& path() const { return m_Path; }

 private:
  std::string m_Path;
};

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};

inline bool readFile(const std::string& path, std::string& content) {
  std::unique_ptr<std::FILE, FileCloser> in(std::fopen(path.c_str(), "rb"));
  if (!in) return false;
  content.clear();
  char buffer[8192];
  size_t got;
  while ((got = std::fread(buffer, 1, sizeof buffer, in.get())) > 0) content.append(buffer, got);
  return std::ferror(in.get()) == 0;
}

inline bool writeFile(const std::string& path, std::string_view content) {
  std::unique_ptr<std::FILE, FileCloser> out(std::fopen(path.c_str(), "wb"));
  return out && std::fwrite(content.data(), 1, content.size(), out.get()) == content.size();
}

/// The repository root: $PINFORGE_SOURCE_DIR when ctest runs the binary, else derived from
/// where this header lives so the binary also runs by hand.
inline std::string sourceDir() {
  const char* fromEnv = std::getenv("PINFORGE_SOURCE_DIR");
  if (fromEnv != nullptr && *fromEnv != '\0') return fromEnv;
  return std::filesystem::path(__FILE__).parent_path().parent_path().parent_path().string();
}

/// The files directly inside tests/fixtures/<language> whose extension is one of
/// `extensions`, sorted so test names and order are stable.
inline std::vector<std::string> fixtureFiles(const std::string& language,
                                             const std::vector<std::string>& extensions) {
  std::vector<std::string> files;
  std::error_code error;
  std::filesystem::directory_iterator it(sourceDir() + "/tests/fixtures/" + language, error);
  if (error) return files;
  for (const std::filesystem::directory_entry& entry : it) {
    const std::string extension = entry.path().extension().string();
    if (entry.is_regular_file(error) &&
        std::find(extensions.begin(), extensions.end(), extension) != extensions.end())
      files.push_back(std::filesystem::absolute(entry.path(), error).lexically_normal().string());
  }
  std::sort(files.begin(), files.end());
  return files;
}

/// A GoogleTest parameter name for a fixture path: its file name with every character that
/// is not a letter or digit turned into '_'.
inline std::string fixtureTestName(const std::string& path) {
  std::string name = std::filesystem::path(path).filename().string();
  for (char& c : name)
    if (!((c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9'))) c = '_';
  return name;
}

}  // namespace difftest
