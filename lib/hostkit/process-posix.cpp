// Child processes on a POSIX system: the child is spawned in a process group of its own with
// its standard output and standard error on pipes, and both pipes are drained together until
// the child closes them, so neither can fill up and stall it.
#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include "hostkit/path_list.h"
#include "platform/hostkit.h"

// POSIX has the program declare it; some C libraries declare it too.
extern char** environ;  // NOLINT(readability-redundant-declaration)

namespace {

constexpr int kNotStarted = -1;
constexpr int kSignalBase = 128;

bool isExecutableFile(const std::string& path) {
  struct stat status {};
  return ::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
         ::access(path.c_str(), X_OK) == 0;
}

// A file descriptor that closes itself.
class Descriptor {
 public:
  Descriptor() = default;
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;
  ~Descriptor() { reset(); }
  int get() const { return m_Fd; }
  void reset(int fd = -1) {
    if (m_Fd >= 0) ::close(m_Fd);
    m_Fd = fd;
  }

 private:
  int m_Fd = -1;
};

struct Pipe {
  Descriptor read;
  Descriptor write;
  bool open() {
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0) return false;
    read.reset(ends[0]);
    write.reset(ends[1]);
    return true;
  }
};

// The file actions of the child: stdin from /dev/null, stdout and stderr on the pipes, and
// every other descriptor closed, so the child cannot hold our output or error file open.
class SpawnActions {
 public:
  SpawnActions() { m_Valid = ::posix_spawn_file_actions_init(&m_Actions) == 0; }
  SpawnActions(const SpawnActions&) = delete;
  SpawnActions& operator=(const SpawnActions&) = delete;
  ~SpawnActions() {
    if (m_Valid) ::posix_spawn_file_actions_destroy(&m_Actions);
  }
  bool wire(int outWrite, int errWrite) {
    return m_Valid &&
           ::posix_spawn_file_actions_addopen(&m_Actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0) ==
               0 &&
           ::posix_spawn_file_actions_adddup2(&m_Actions, outWrite, STDOUT_FILENO) == 0 &&
           ::posix_spawn_file_actions_adddup2(&m_Actions, errWrite, STDERR_FILENO) == 0 &&
           ::posix_spawn_file_actions_addclosefrom_np(&m_Actions, STDERR_FILENO + 1) == 0;
  }
  const posix_spawn_file_actions_t* get() const { return &m_Actions; }

 private:
  posix_spawn_file_actions_t m_Actions{};
  bool m_Valid = false;
};

// The attributes of the child: a process group of its own, so that stopping it on a signal
// also stops what it started, and the signal mask we had before the spawn.
class SpawnAttributes {
 public:
  explicit SpawnAttributes(const sigset_t& mask) {
    m_Initialised = ::posix_spawnattr_init(&m_Attributes) == 0;
    m_Valid = m_Initialised &&
              ::posix_spawnattr_setflags(&m_Attributes,
                                         POSIX_SPAWN_SETPGROUP | POSIX_SPAWN_SETSIGMASK) == 0 &&
              ::posix_spawnattr_setpgroup(&m_Attributes, 0) == 0 &&
              ::posix_spawnattr_setsigmask(&m_Attributes, &mask) == 0;
  }
  SpawnAttributes(const SpawnAttributes&) = delete;
  SpawnAttributes& operator=(const SpawnAttributes&) = delete;
  ~SpawnAttributes() {
    if (m_Initialised) ::posix_spawnattr_destroy(&m_Attributes);
  }
  bool valid() const { return m_Valid; }
  const posix_spawnattr_t* get() const { return &m_Attributes; }

 private:
  posix_spawnattr_t m_Attributes{};
  bool m_Initialised = false;
  bool m_Valid = false;
};

// Holds back SIGINT, SIGTERM and SIGHUP between the spawn and the child's registration: a
// signal in that gap would end us and leave the child running unseen.
class HeldSignals {
 public:
  HeldSignals() {
    sigset_t held;
    sigemptyset(&held);
    for (int number : {SIGINT, SIGTERM, SIGHUP}) sigaddset(&held, number);
    ::pthread_sigmask(SIG_BLOCK, &held, &m_Previous);
  }
  HeldSignals(const HeldSignals&) = delete;
  HeldSignals& operator=(const HeldSignals&) = delete;
  ~HeldSignals() { ::pthread_sigmask(SIG_SETMASK, &m_Previous, nullptr); }
  const sigset_t& previous() const { return m_Previous; }

 private:
  sigset_t m_Previous;
};

// Reads both pipes until each has reached its end. Once the receiver declines, the output is
// still read, so the child never blocks on a full pipe, but no longer passed on.
void drain(Descriptor& out, Descriptor& err, Host::ChildOutput* receiver) {
  char buffer[65536];
  while (out.get() >= 0 || err.get() >= 0) {
    pollfd watched[2] = {{out.get(), POLLIN, 0}, {err.get(), POLLIN, 0}};
    if (::poll(watched, 2, -1) < 0) {
      if (errno == EINTR) continue;
      // Closing our ends makes a still-writing child fail instead of waiting for us forever.
      out.reset();
      err.reset();
      return;
    }
    Descriptor* descriptors[2] = {&out, &err};
    for (int i = 0; i < 2; ++i) {
      if (watched[i].fd < 0 || watched[i].revents == 0) continue;
      const ssize_t got = ::read(watched[i].fd, buffer, sizeof buffer);
      if (got > 0) {
        if (receiver != nullptr &&
            !receiver->OnOutput(std::string_view(buffer, static_cast<size_t>(got))))
          receiver = nullptr;
      } else if (got == 0 || errno != EINTR) {
        descriptors[i]->reset();
      }
    }
  }
}

int waitFor(pid_t child) {
  int status = 0;
  while (::waitpid(child, &status, 0) < 0)
    if (errno != EINTR) return kNotStarted;
  if (WIFEXITED(status)) return WEXITSTATUS(status);
  if (WIFSIGNALED(status)) return kSignalBase + WTERMSIG(status);
  return kNotStarted;
}

int spawnAndCollect(const std::vector<std::string>& words, Host::ChildOutput* receiver) {
  if (words.empty() || words[0].empty()) return kNotStarted;
  Pipe out;
  Pipe err;
  SpawnActions actions;
  if (!out.open() || !err.open() || !actions.wire(out.write.get(), err.write.get()))
    return kNotStarted;
  std::vector<char*> argv;
  for (const std::string& word : words) argv.push_back(const_cast<char*>(word.c_str()));
  argv.push_back(nullptr);
  Host::Interrupt::install();
  pid_t child = 0;
  {
    HeldSignals held;
    const SpawnAttributes attributes(held.previous());
    if (!attributes.valid() ||
        ::posix_spawn(&child, argv[0], actions.get(), attributes.get(), argv.data(), environ) != 0)
      return kNotStarted;
    Host::Interrupt::setChildGroup(child);
  }
  // Only the child may hold the writing ends, or the pipes would never report their end.
  out.write.reset();
  err.write.reset();
  drain(out.read, err.read, receiver);
  const int status = waitFor(child);
  Host::Interrupt::setChildGroup(0);
  return status;
}

}  // namespace

namespace Host {

std::vector<std::string> Process::environmentList(const char* name) {
  const char* value = std::getenv(name);
  return splitPathList(value != nullptr ? value : "", ':');
}

std::string Process::findProgram(std::string_view name) {
  if (name.empty() || name.find('/') != std::string_view::npos) return std::string();
  const std::string exeDir = File::executableDirectory();
  if (!exeDir.empty() && isExecutableFile(exeDir + '/' + std::string(name)))
    return exeDir + '/' + std::string(name);
  for (const std::string& dir : environmentList("PATH")) {
    // A relative entry means the current folder; a program is never taken from there.
    if (dir.starts_with('/') && isExecutableFile(dir + '/' + std::string(name)))
      return dir + '/' + std::string(name);
  }
  return std::string();
}

int Process::run(const std::vector<std::string>& argv, ChildOutput* receiver) {
  const int status = spawnAndCollect(argv, receiver);
  if (receiver != nullptr) receiver->OnEnd();
  return status;
}

}  // namespace Host
