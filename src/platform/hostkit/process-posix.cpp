// Child processes on a POSIX system: the command line is split into words without a shell,
// the child is spawned with its standard output and standard error on pipes, and both pipes
// are drained together until the child closes them, so neither can fill up and stall it.
#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/hostkit.h"

extern char** environ;

namespace {

constexpr int kNotStarted = -1;
constexpr int kSignalBase = 128;

// Blanks and tabs separate words; a double-quoted stretch keeps its blanks and loses its quotes.
std::vector<std::string> splitCommandLine(std::string_view line) {
  std::vector<std::string> words;
  std::string word;
  bool inWord = false;
  bool quoted = false;
  for (char c : line) {
    if (c == '"') {
      quoted = !quoted;
      inWord = true;
    } else if (!quoted && (c == ' ' || c == '\t')) {
      if (inWord) words.push_back(std::move(word));
      word.clear();
      inWord = false;
    } else {
      word.push_back(c);
      inWord = true;
    }
  }
  if (inWord) words.push_back(std::move(word));
  return words;
}

// A file descriptor that closes itself.
class Descriptor {
 public:
  Descriptor() = default;
  explicit Descriptor(int fd) : m_Fd(fd) {}
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

// The spawn attributes of the child: stdin from /dev/null, stdout and stderr on the pipes.
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
           ::posix_spawn_file_actions_addopen(&m_Actions, STDIN_FILENO, "/dev/null", O_RDONLY,
                                              0) == 0 &&
           ::posix_spawn_file_actions_adddup2(&m_Actions, outWrite, STDOUT_FILENO) == 0 &&
           ::posix_spawn_file_actions_adddup2(&m_Actions, errWrite, STDERR_FILENO) == 0;
  }
  const posix_spawn_file_actions_t* get() const { return &m_Actions; }

 private:
  posix_spawn_file_actions_t m_Actions{};
  bool m_Valid = false;
};

// Hands each read piece on as NUL-terminated text; a NUL inside the output ends a piece.
class Forwarder {
 public:
  explicit Forwarder(Host::ChildOutput* receiver) : m_Receiver(receiver) {}
  void deliver(const char* data, size_t length) {
    size_t start = 0;
    while (m_Receiver != nullptr && start < length) {
      std::string_view rest(data + start, length - start);
      const size_t end = rest.find('\0');
      const std::string piece(rest.substr(0, end));
      start += piece.size() + 1;
      if (!piece.empty() && !m_Receiver->OnOutput(piece.c_str())) m_Receiver = nullptr;
    }
  }

 private:
  Host::ChildOutput* m_Receiver;
};

// Reads both pipes until each has reached its end.
void drain(Descriptor& out, Descriptor& err, Forwarder& forwarder) {
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
      if (got > 0)
        forwarder.deliver(buffer, static_cast<size_t>(got));
      else if (got == 0 || errno != EINTR)
        descriptors[i]->reset();
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
  if (words.empty()) return kNotStarted;
  Pipe out;
  Pipe err;
  SpawnActions actions;
  if (!out.open() || !err.open() || !actions.wire(out.write.get(), err.write.get()))
    return kNotStarted;
  std::vector<char*> argv;
  for (const std::string& word : words) argv.push_back(const_cast<char*>(word.c_str()));
  argv.push_back(nullptr);
  pid_t child = 0;
  if (::posix_spawnp(&child, argv[0], actions.get(), nullptr, argv.data(), environ) != 0)
    return kNotStarted;
  // Only the child may hold the writing ends, or the pipes would never report their end.
  out.write.reset();
  err.write.reset();
  Forwarder forwarder(receiver);
  drain(out.read, err.read, forwarder);
  return waitFor(child);
}

}  // namespace

namespace Host {

int Process::RunNoWindow(const char* commandLine, std::unique_ptr<ChildOutput> receiver,
                         unsigned /*flags*/, bool /*hideWindow*/, bool /*captureOutput*/,
                         bool /*detach*/) {
  const int status =
      commandLine != nullptr ? spawnAndCollect(splitCommandLine(commandLine), receiver.get())
                             : kNotStarted;
  if (receiver != nullptr) receiver->OnEnd();
  return status;
}

}  // namespace Host
