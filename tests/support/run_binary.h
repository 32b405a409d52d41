// Runs the built pinforge like a user would, without a shell, and captures everything it
// tells: standard output, standard error and the exit status. Header-only so any test binary
// can include it.
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>
#include <vector>

namespace pinforge_test {

struct RunResult {
  bool started = false;  ///< false when the process could not be run at all
  int status = -1;       ///< exit code of a normal exit; -1 for a killed process
  std::string out;
  std::string err;
};

/// The pinforge binary under test ($PINFORGE_BIN), or empty when the variable is unset.
inline std::string binaryPath() {
  const char* path = std::getenv("PINFORGE_BIN");
  return path != nullptr ? path : "";
}

namespace detail {

/// Drains both pipes until each reaches end of file, so a chatty child never blocks.
inline void drainPipes(int outFd, int errFd, std::string& out, std::string& err) {
  pollfd fds[2] = {{outFd, POLLIN, 0}, {errFd, POLLIN, 0}};
  std::string* sinks[2] = {&out, &err};
  int open = 2;
  char buffer[4096];
  while (open > 0) {
    if (poll(fds, 2, -1) < 0) {
      if (errno == EINTR) continue;
      return;
    }
    for (int i = 0; i < 2; ++i) {
      if (fds[i].fd < 0 || fds[i].revents == 0) continue;
      const ssize_t got = read(fds[i].fd, buffer, sizeof buffer);
      if (got > 0) {
        sinks[i]->append(buffer, static_cast<size_t>(got));
      } else if (got == 0 || errno != EINTR) {
        fds[i].fd = -1;
        --open;
      }
    }
  }
}

}  // namespace detail

/// Runs `program` with `args` (argv[0] is the program path) in `workDir`, with standard input
/// from /dev/null.
inline RunResult runProgram(const std::string& program, const std::vector<std::string>& args,
                            const std::string& workDir) {
  RunResult result;
  std::vector<char*> argv;
  argv.push_back(const_cast<char*>(program.c_str()));
  for (const std::string& arg : args) argv.push_back(const_cast<char*>(arg.c_str()));
  argv.push_back(nullptr);

  int outPipe[2];
  int errPipe[2];
  if (pipe2(outPipe, O_CLOEXEC) != 0) return result;
  if (pipe2(errPipe, O_CLOEXEC) != 0) {
    close(outPipe[0]);
    close(outPipe[1]);
    return result;
  }
  const pid_t pid = fork();
  if (pid == 0) {
    const int devNull = open("/dev/null", O_RDONLY);
    if (devNull < 0 || dup2(devNull, 0) < 0 || dup2(outPipe[1], 1) < 0 || dup2(errPipe[1], 2) < 0 ||
        chdir(workDir.c_str()) != 0)
      _exit(127);
    execv(program.c_str(), argv.data());
    _exit(127);
  }
  close(outPipe[1]);
  close(errPipe[1]);
  if (pid > 0) detail::drainPipes(outPipe[0], errPipe[0], result.out, result.err);
  close(outPipe[0]);
  close(errPipe[0]);
  if (pid < 0) return result;

  int wstatus = 0;
  while (waitpid(pid, &wstatus, 0) < 0) {
    if (errno != EINTR) return result;
  }
  result.started = true;
  result.status = WIFEXITED(wstatus) ? WEXITSTATUS(wstatus) : -1;
  return result;
}

/// Runs the pinforge binary under test with `args` in `workDir`.
inline RunResult runPinforge(const std::vector<std::string>& args, const std::string& workDir) {
  return runProgram(binaryPath(), args, workDir);
}

}  // namespace pinforge_test
