// Runs a program the way a user would, without a shell, and captures everything it tells:
// standard output, standard error and the exit status. Also where the test run finds the
// binary under test, the source tree and other programs, and a copy of it with its own runscr.
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "support/scratch_dir.h"

extern char** environ;

namespace pinforge_test {

struct RunResult {
  bool started = false;  ///< false when no child process could be made
  int status = -1;       ///< exit code of a normal exit; -1 for a killed child
  std::string out;
  std::string err;  ///< stays empty when the streams are merged
};

/// Variables a run replaces or adds to the environment, as (name, value).
using EnvChanges = std::vector<std::pair<std::string, std::string>>;

/// Starts `argv` (argv[0] a path; PATH is not searched) in `workDir` unless that is empty, with
/// standard input from /dev/null and output to `out` and `err`. A child still running after
/// `timeoutSeconds` is killed so it cannot stall the suite. The child's id, or -1.
inline pid_t spawn(std::vector<std::string> argv, const std::string& workDir, const EnvChanges& env,
                   int out, int err, unsigned timeoutSeconds = 120) {
  // Everything the child needs is made before the fork, where allocating is safe.
  std::vector<std::string> envTexts;
  for (char** entry = environ; *entry != nullptr; ++entry) {
    bool replaced = false;
    for (const auto& [name, value] : env)
      replaced = replaced || std::string_view(*entry).starts_with(name + "=");
    if (!replaced) envTexts.emplace_back(*entry);
  }
  for (const auto& [name, value] : env) envTexts.push_back(name + "=" + value);
  std::vector<char*> args, envp;
  for (std::string& text : argv) args.push_back(text.data());
  for (std::string& text : envTexts) envp.push_back(text.data());
  args.push_back(nullptr);
  envp.push_back(nullptr);
  if (argv.empty()) return -1;
  const pid_t pid = fork();
  if (pid != 0) return pid;
  const int devNull = open("/dev/null", O_RDONLY);
  if (devNull < 0 || dup2(devNull, 0) < 0 || dup2(out, 1) < 0 || dup2(err, 2) < 0 ||
      (!workDir.empty() && chdir(workDir.c_str()) != 0))
    _exit(127);
  alarm(timeoutSeconds);
  execve(args[0], args.data(), envp.data());
  _exit(127);
}

/// Runs `argv` as `spawn` does and waits for it. With `mergeErrors` standard error goes to
/// `out`, interleaved.
inline RunResult runProgram(std::vector<std::string> argv, const std::string& workDir = "",
                            const EnvChanges& env = {}, bool mergeErrors = false,
                            unsigned timeoutSeconds = 120) {
  RunResult result;
  int pipes[2][2];
  if (pipe2(pipes[0], O_CLOEXEC) != 0) return result;
  if (pipe2(pipes[1], O_CLOEXEC) != 0) {
    close(pipes[0][0]);
    close(pipes[0][1]);
    return result;
  }
  const pid_t pid = spawn(std::move(argv), workDir, env, pipes[0][1], pipes[mergeErrors ? 0 : 1][1],
                          timeoutSeconds);
  close(pipes[0][1]);
  close(pipes[1][1]);
  // Both pipes are drained together so a child that fills one of them never blocks.
  pollfd fds[2] = {{pipes[0][0], POLLIN, 0}, {pipes[1][0], POLLIN, 0}};
  std::string* sinks[2] = {&result.out, &result.err};
  for (int open = pid > 0 ? 2 : 0; open > 0;) {
    if (poll(fds, 2, -1) < 0) {
      if (errno == EINTR) continue;
      break;
    }
    for (int i = 0; i < 2; ++i) {
      if (fds[i].fd < 0 || fds[i].revents == 0) continue;
      char buffer[8192];
      const ssize_t got = read(fds[i].fd, buffer, sizeof buffer);
      if (got > 0) {
        sinks[i]->append(buffer, static_cast<size_t>(got));
      } else if (got == 0 || errno != EINTR) {
        fds[i].fd = -1;
        --open;
      }
    }
  }
  close(pipes[0][0]);
  close(pipes[1][0]);
  int wstatus = 0;
  while (pid > 0 && waitpid(pid, &wstatus, 0) < 0)
    if (errno != EINTR) return result;
  result.started = pid > 0;
  result.status = pid > 0 && WIFEXITED(wstatus) ? WEXITSTATUS(wstatus) : -1;
  return result;
}

/// Starts `argv` as `spawn` does with its output thrown away, and returns at once.
inline pid_t startQuietly(const std::vector<std::string>& argv, const std::string& workDir,
                          const EnvChanges& env = {}) {
  const int devNull = open("/dev/null", O_WRONLY | O_CLOEXEC);
  const pid_t pid = devNull < 0 ? -1 : spawn(argv, workDir, env, devNull, devNull, 60);
  if (devNull >= 0) close(devNull);
  return pid;
}

/// The pinforge binary under test ($PINFORGE_BIN), or empty when the variable is unset.
inline std::string binaryPath() {
  const char* path = std::getenv("PINFORGE_BIN");
  return path != nullptr ? path : "";
}

/// Files to lay out, as (path, text); a path ending in '/' is a folder.
using Layout = std::vector<std::pair<std::string, std::string>>;

/// Fills `dir` with a copy of the program under test, bin/pinforge, so that a script shell in
/// bin/ is found beside it, and with `files` (folders made on the way; a file named runscr is
/// executable). The copy's path, or empty when something could not be made.
inline std::string placeCopy(const ScratchDir& dir, const Layout& files) {
  std::error_code error;
  std::filesystem::create_directories(dir.file("bin"), error);
  if (error || !std::filesystem::copy_file(binaryPath(), dir.file("bin/pinforge"), error))
    return "";
  for (const auto& [name, text] : files) {
    const std::filesystem::path path = dir.file(name);
    std::filesystem::create_directories(path.parent_path(), error);
    if (error || (!name.ends_with("/") && !dir.write(name, text, path.filename() == "runscr")))
      return "";
  }
  return dir.file("bin/pinforge");
}

/// Runs the pinforge binary under test with `args` in `workDir`.
inline RunResult runPinforge(const std::vector<std::string>& args, const std::string& workDir,
                             const EnvChanges& env = {}) {
  std::vector<std::string> argv = {binaryPath()};
  argv.insert(argv.end(), args.begin(), args.end());
  return runProgram(argv, workDir, env);
}

/// The repository root: $PINFORGE_SOURCE_DIR when ctest runs the binary, else derived from
/// where this header lives so a test binary also runs by hand.
inline std::string sourceDir() {
  const char* fromEnv = std::getenv("PINFORGE_SOURCE_DIR");
  if (fromEnv != nullptr && *fromEnv != '\0') return fromEnv;
  return std::filesystem::path(__FILE__).parent_path().parent_path().parent_path().string();
}

/// The full path of the executable `name` found on PATH, or empty when there is none.
inline std::string findOnPath(const std::string& name) {
  const char* path = std::getenv("PATH");
  std::string_view dirs = path != nullptr ? path : "/usr/bin:/bin";
  while (true) {
    const size_t colon = dirs.find(':');
    std::string dir(dirs.substr(0, colon));
    const std::string candidate = (dir.empty() ? "." : dir) + "/" + name;
    if (access(candidate.c_str(), X_OK) == 0) return candidate;
    if (colon == std::string_view::npos) return "";
    dirs.remove_prefix(colon + 1);
  }
}

}  // namespace pinforge_test
