// Files on a POSIX system: tests and removals by name, temporary files created exclusively,
// the directory of the running executable, file identities, and the run's checked output
// files with their atomic replacement.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "platform/hostkit.h"

namespace {

std::string temporaryDirectory() {
  const char* fromEnvironment = std::getenv("TMPDIR");
  std::string directory =
      (fromEnvironment != nullptr && fromEnvironment[0] != '\0') ? fromEnvironment : "/tmp";
  while (directory.size() > 1 && directory.back() == '/') directory.pop_back();
  return directory;
}

std::string_view directoryPrefix(std::string_view path) {
  const size_t slash = path.rfind('/');
  return slash == std::string_view::npos ? std::string_view() : path.substr(0, slash + 1);
}

std::string_view lastComponent(std::string_view path) {
  return path.substr(directoryPrefix(path).size());
}

mode_t currentUmask() {
  const mode_t mask = ::umask(0);
  ::umask(mask);
  return mask;
}

/// An oversize write must fail with EFBIG and be reported like any other write error, not
/// kill the process before it can say what happened or clean up.
void ignoreOversizeSignal() {
  static const bool ignored = ::signal(SIGXFSZ, SIG_IGN) != SIG_ERR;
  (void)ignored;
}

/// A new file beside `path`, created exclusively, with the permissions the target has or, for
/// a new target, would get. -1 when it cannot be made.
int createBeside(const std::string& path, const struct stat* existing, std::string& name) {
  name = std::string(directoryPrefix(path)) + "." + std::string(lastComponent(path)) + ".XXXXXX";
  const int descriptor = ::mkostemp(name.data(), O_CLOEXEC);
  if (descriptor < 0) return -1;
  if (existing != nullptr) {
    // Keeping the owner needs privileges most users lack; the permission bits are what count.
    if (::fchown(descriptor, existing->st_uid, existing->st_gid) != 0) errno = 0;
    ::fchmod(descriptor, existing->st_mode & 0777);
  } else {
    ::fchmod(descriptor, 0666 & ~currentUmask());
  }
  return descriptor;
}

}  // namespace

namespace Host {

bool File::isfile(const char* path) {
  struct stat status {};
  return path != nullptr && ::stat(path, &status) == 0 && S_ISREG(status.st_mode);
}

bool File::remove(const char* path) { return path != nullptr && ::unlink(path) == 0; }

bool File::remove_f(const char* path) {
  if (path == nullptr) return false;
  struct stat status {};
  if (::lstat(path, &status) == 0 && S_ISREG(status.st_mode) && (status.st_mode & S_IWUSR) == 0)
    ::chmod(path, status.st_mode | S_IWUSR);
  return ::unlink(path) == 0;
}

StringBase File::tmpnam(const char* /*buffer*/) {
  // Reserve a name by creating the file, then free it again for the caller to create.
  std::string name;
  std::FILE* reserved = createTemporary("", name);
  if (reserved == nullptr) return StringBase();
  std::fclose(reserved);
  ::unlink(name.c_str());
  return StringBase(std::move(name));
}

std::string File::temporaryDirectory() { return ::temporaryDirectory(); }

std::FILE* File::createTemporary(std::string_view suffix, std::string& name) {
  if (suffix.find('/') != std::string_view::npos || suffix.find('\0') != std::string_view::npos ||
      suffix.size() > INT_MAX)
    return nullptr;
  std::string pattern = temporaryDirectory() + "/pinforge-XXXXXX";
  pattern.append(suffix);
  const int descriptor = ::mkstemps(pattern.data(), static_cast<int>(suffix.size()));
  if (descriptor < 0) return nullptr;
  std::FILE* stream = ::fdopen(descriptor, "w");
  if (stream == nullptr) {
    ::close(descriptor);
    ::unlink(pattern.c_str());
    return nullptr;
  }
  name = std::move(pattern);
  return stream;
}

std::string File::executableDirectory() {
  std::string path(PATH_MAX, '\0');
  const ssize_t length = ::readlink("/proc/self/exe", path.data(), path.size());
  if (length <= 0 || static_cast<size_t>(length) >= path.size()) return std::string();
  path.resize(static_cast<size_t>(length));
  return FileName(path).GetDirectory().str();
}

std::string File::identity(const char* path, bool& regular) {
  regular = false;
  if (path == nullptr || path[0] == '\0') return std::string();
  struct stat status {};
  if (::stat(path, &status) == 0) {
    regular = S_ISREG(status.st_mode);
    return "file " + std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
  }
  if (errno != ENOENT) return std::string();
  const std::string_view prefix = directoryPrefix(path);
  const std::string folder = prefix.empty() ? std::string(".") : std::string(prefix);
  if (::stat(folder.c_str(), &status) != 0 || !S_ISDIR(status.st_mode)) return std::string();
  return "new " + std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino) + "/" +
         std::string(lastComponent(path));
}

std::FILE* File::openRegular(const char* path, bool& notRegular) {
  notRegular = false;
  if (path == nullptr) return nullptr;
  // The open does not block (a FIFO without a writer would stall it), and the file is looked
  // at before a byte is read.
  const int descriptor = ::open(path, O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  if (descriptor < 0) return nullptr;
  struct stat status {};
  if (::fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode)) {
    // O_NONBLOCK means nothing for a regular file, so the stream reads it as usual.
    std::FILE* stream = ::fdopen(descriptor, "r");
    if (stream != nullptr) return stream;
  }
  ::close(descriptor);
  // Some systems open a directory for reading; it is no more a regular file there than where
  // the open fails.
  notRegular = !S_ISDIR(status.st_mode) && !S_ISREG(status.st_mode);
  return nullptr;
}

/// The descriptor behind an output stream and the first failure met on it.
struct OutputFile::Sink {
  int descriptor = -1;
  int firstError = 0;

  void fail(int code) {
    if (firstError == 0) firstError = code != 0 ? code : EIO;
  }

  static ssize_t write(void* cookie, const char* data, size_t size) {
    Sink& sink = *static_cast<Sink*>(cookie);
    size_t done = 0;
    while (done < size) {
      const ssize_t written = ::write(sink.descriptor, data + done, size - done);
      if (written < 0 && errno == EINTR) continue;
      if (written <= 0) {
        sink.fail(written < 0 ? errno : ENOSPC);
        return -1;
      }
      done += static_cast<size_t>(written);
    }
    return static_cast<ssize_t>(size);
  }

  static int close(void* cookie) {
    Sink& sink = *static_cast<Sink*>(cookie);
    // Some file systems (NFS among them) only report a failed write when the file is closed.
    const int result = ::close(sink.descriptor);
    if (result != 0 && errno != EINTR) sink.fail(errno);
    sink.descriptor = -1;
    return result == 0 ? 0 : -1;
  }
};

OutputFile::OutputFile() = default;

OutputFile::~OutputFile() { discard(); }

bool OutputFile::open(const char* path, Placement placement, std::string& error) {
  discard();
  m_Sink.reset();
  m_Removable = false;
  m_Path = path != nullptr ? path : "";
  ignoreOversizeSignal();

  int descriptor = -1;
  struct stat status {};
  if (placement == Placement::Replace) {
    const bool exists = ::lstat(m_Path.c_str(), &status) == 0;
    if (!exists && errno != ENOENT) {
      error = std::strerror(errno);
      return false;
    }
    if (exists && S_ISDIR(status.st_mode)) {
      error = std::strerror(EISDIR);
      return false;
    }
    // Renaming over a read-only file would succeed where a plain open refuses to write it.
    if (exists && S_ISREG(status.st_mode) && ::access(m_Path.c_str(), W_OK) != 0) {
      error = std::strerror(errno);
      return false;
    }
    // When no file can be made in the folder (it is not writable, say) the target is still
    // written in place, as a plain open would.
    if (!exists || S_ISREG(status.st_mode))
      descriptor = createBeside(m_Path, exists ? &status : nullptr, m_Temporary);
  }
  if (descriptor < 0) {
    m_Temporary.clear();
    int flags = O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC;
    if (placement == Placement::InPlaceNoFollow) flags |= O_NOFOLLOW;
    descriptor = ::open(m_Path.c_str(), flags, 0666);
    if (descriptor < 0) {
      error = errno == ELOOP && placement == Placement::InPlaceNoFollow
                  ? "it is a symbolic link, which is not followed"
                  : std::strerror(errno);
      return false;
    }
  } else if (!Interrupt::removeOnSignal(m_Temporary)) {
    // Without the signal guard an interrupted run could leave the temporary file behind.
    ::close(descriptor);
    ::unlink(m_Temporary.c_str());
    m_Temporary.clear();
    error = "too many files to clean up on an interrupt";
    return false;
  }

  struct stat opened {};
  ::fstat(descriptor, &opened);
  m_Device = static_cast<uint64_t>(opened.st_dev);
  m_Inode = static_cast<uint64_t>(opened.st_ino);
  // A file written in place is ours to remove only when it is the regular file at m_Path
  // itself, not one reached through a symlink.
  if (m_Temporary.empty())
    m_Removable = S_ISREG(opened.st_mode) && ::lstat(m_Path.c_str(), &status) == 0 &&
                  S_ISREG(status.st_mode) && status.st_ino == opened.st_ino &&
                  status.st_dev == opened.st_dev;

  m_Sink = std::make_unique<Sink>();
  m_Sink->descriptor = descriptor;
  const cookie_io_functions_t functions = {nullptr, &Sink::write, nullptr, &Sink::close};
  m_Stream = ::fopencookie(m_Sink.get(), "w", functions);
  if (m_Stream == nullptr) {
    error = std::strerror(errno);
    ::close(descriptor);
    m_Sink.reset();
    m_Removable = false;
    discard();
    return false;
  }
  return true;
}

bool OutputFile::close(std::string& error) {
  if (m_Stream != nullptr) {
    const bool flushed = std::fflush(m_Stream) == 0 && std::ferror(m_Stream) == 0;
    const bool closed = std::fclose(m_Stream) == 0;
    m_Stream = nullptr;
    if (!flushed || !closed) m_Sink->fail(0);
  }
  if (m_Sink == nullptr || m_Sink->firstError == 0) return true;
  error = std::strerror(m_Sink->firstError);
  return false;
}

bool OutputFile::commit(std::string& error) {
  std::string ignored;
  close(ignored);
  if (m_Temporary.empty()) return true;
  const bool renamed = ::rename(m_Temporary.c_str(), m_Path.c_str()) == 0;
  if (!renamed) {
    error = std::strerror(errno);
    ::unlink(m_Temporary.c_str());
  }
  Interrupt::forget(m_Temporary);
  m_Temporary.clear();
  m_Removable = renamed;
  return renamed;
}

void OutputFile::discard() {
  if (m_Stream != nullptr) std::fclose(m_Stream);
  m_Stream = nullptr;
  if (m_Temporary.empty()) return;
  ::unlink(m_Temporary.c_str());
  Interrupt::forget(m_Temporary);
  m_Temporary.clear();
}

bool OutputFile::removeWritten() {
  if (!m_Removable || !m_Temporary.empty()) return false;
  m_Removable = false;
  struct stat status {};
  return ::lstat(m_Path.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
         static_cast<uint64_t>(status.st_dev) == m_Device &&
         static_cast<uint64_t>(status.st_ino) == m_Inode && ::unlink(m_Path.c_str()) == 0;
}

}  // namespace Host
