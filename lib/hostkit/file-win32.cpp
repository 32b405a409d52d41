// Files on Windows: tests and removals by name, temporary files created exclusively, the
// folder of the running executable, file identities, and the run's checked output files with
// their atomic replacement. Names are UTF-8 inside the program and UTF-16 towards the system.
#include <windows.h>
// io.h declares the C library's bridges between handles and descriptors.
#include <fcntl.h>
#include <io.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <random>
#include <string>
#include <string_view>

#include "hostkit/wide_text-win32.h"
#include "platform/hostkit.h"

namespace {

using Host::win32::narrow;
using Host::win32::usableName;
using Host::win32::widen;

/// The temporary folder with its final separator, as GetTempPathW gives it (it honours TMP
/// and TEMP); empty when there is none.
std::string temporaryFolderWithSeparator() {
  std::wstring directory(MAX_PATH + 1, L'\0');
  const DWORD length = ::GetTempPathW(static_cast<DWORD>(directory.size()), directory.data());
  if (length == 0 || length > directory.size()) return std::string();
  directory.resize(length);
  return narrow(directory);
}

bool isSeparator(char c) { return c == '/' || c == '\\'; }

/// Everything up to and including the last separator (or a drive's colon); empty if none.
std::string_view directoryPrefix(std::string_view path) {
  const size_t last = path.find_last_of("/\\:");
  return last == std::string_view::npos ? std::string_view() : path.substr(0, last + 1);
}

std::string_view lastComponent(std::string_view path) {
  return path.substr(directoryPrefix(path).size());
}

/// The C library's error number for the common failures, so messages read as on other
/// systems.
int errnoOf(DWORD code) {
  switch (code) {
    case ERROR_FILE_NOT_FOUND:
    case ERROR_PATH_NOT_FOUND:
    case ERROR_INVALID_NAME:
    case ERROR_BAD_NETPATH:
    case ERROR_INVALID_DRIVE:
      return ENOENT;
    case ERROR_ACCESS_DENIED:
    case ERROR_SHARING_VIOLATION:
    case ERROR_LOCK_VIOLATION:
    case ERROR_WRITE_PROTECT:
      return EACCES;
    case ERROR_DISK_FULL:
    case ERROR_HANDLE_DISK_FULL:
      return ENOSPC;
    case ERROR_FILE_EXISTS:
    case ERROR_ALREADY_EXISTS:
      return EEXIST;
    default:
      return EIO;
  }
}

std::string lastErrorText() { return std::strerror(errnoOf(::GetLastError())); }

/// Where a file lives: its volume and its index there, as the file system numbers it.
struct FileKey {
  DWORD volume = 0;
  uint64_t index = 0;
  bool regular = false;
  bool folder = false;
};

/// Opens `path` (a folder too) without reading or locking it and tells what it is; false
/// when it cannot be opened. Devices such as NUL or CON are neither regular nor folders.
bool keyOf(const std::wstring& path, FileKey& key) {
  HANDLE handle =
      ::CreateFileW(path.c_str(), 0, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                    nullptr, OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS, nullptr);
  if (handle == INVALID_HANDLE_VALUE) return false;
  BY_HANDLE_FILE_INFORMATION info{};
  const bool disk = ::GetFileType(handle) == FILE_TYPE_DISK;
  const bool known = disk && ::GetFileInformationByHandle(handle, &info) != 0;
  ::CloseHandle(handle);
  key = FileKey();
  if (!known) return true;
  key.volume = info.dwVolumeSerialNumber;
  key.index = (uint64_t{info.nFileIndexHigh} << 32) | info.nFileIndexLow;
  key.folder = (info.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) != 0;
  key.regular = !key.folder;
  return true;
}

/// A stream writing to `handle`, which it then owns; null (and the handle closed) on failure.
std::FILE* streamOver(HANDLE handle) {
  const int descriptor =
      ::_open_osfhandle(reinterpret_cast<intptr_t>(handle), _O_WRONLY | _O_BINARY);
  if (descriptor < 0) {
    ::CloseHandle(handle);
    return nullptr;
  }
  std::FILE* stream = ::_fdopen(descriptor, "wb");
  if (stream == nullptr) ::_close(descriptor);
  return stream;
}

std::string randomTag() {
  static constexpr char kDigits[] = "0123456789abcdefghijklmnopqrstuvwxyz";
  std::random_device source;
  std::string tag;
  for (int i = 0; i < 10; ++i) tag.push_back(kDigits[source() % (sizeof kDigits - 1)]);
  return tag;
}

}  // namespace

namespace Host {

bool File::isfile(const char* path) {
  if (path == nullptr || !usableName(path)) return false;
  const DWORD attributes = ::GetFileAttributesW(widen(path).c_str());
  return attributes != INVALID_FILE_ATTRIBUTES &&
         (attributes & (FILE_ATTRIBUTE_DIRECTORY | FILE_ATTRIBUTE_DEVICE)) == 0;
}

bool File::remove(const char* path) {
  return path != nullptr && usableName(path) && ::DeleteFileW(widen(path).c_str()) != 0;
}

bool File::remove_f(const char* path) {
  if (path == nullptr || !usableName(path)) return false;
  const std::wstring wide = widen(path);
  const DWORD attributes = ::GetFileAttributesW(wide.c_str());
  if (attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_READONLY) != 0)
    ::SetFileAttributesW(wide.c_str(), attributes & ~DWORD{FILE_ATTRIBUTE_READONLY});
  return ::DeleteFileW(wide.c_str()) != 0;
}

StringBase File::tmpnam(const char* /*buffer*/) {
  // Reserve a name by creating the file, then free it again for the caller to create.
  std::string name;
  std::FILE* reserved = createTemporary("", name);
  if (reserved == nullptr) return StringBase();
  std::fclose(reserved);
  remove(name.c_str());
  return StringBase(std::move(name));
}

std::string File::temporaryDirectory() {
  std::string folder = temporaryFolderWithSeparator();
  // "C:\\" keeps its separator: without it, it would name the current folder of drive C.
  while (folder.size() > 3 && isSeparator(folder.back())) folder.pop_back();
  return folder;
}

std::FILE* File::createTemporary(std::string_view suffix, std::string& name) {
  if (suffix.find_first_of(std::string_view("/\\:\0", 4)) != std::string_view::npos) return nullptr;
  const std::string directory = temporaryFolderWithSeparator();
  if (directory.empty()) return nullptr;
  // CREATE_NEW fails on an existing name, so a name another process guessed first is simply
  // skipped; a few attempts are plenty with ten random characters.
  for (int attempt = 0; attempt < 16; ++attempt) {
    std::string candidate = directory + "pinforge-" + randomTag();
    candidate.append(suffix);
    HANDLE handle = ::CreateFileW(widen(candidate).c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW,
                                  FILE_ATTRIBUTE_NORMAL, nullptr);
    if (handle == INVALID_HANDLE_VALUE) {
      if (::GetLastError() == ERROR_FILE_EXISTS) continue;
      return nullptr;
    }
    std::FILE* stream = streamOver(handle);
    if (stream == nullptr) {
      remove(candidate.c_str());
      return nullptr;
    }
    name = std::move(candidate);
    return stream;
  }
  return nullptr;
}

std::string File::executableDirectory() {
  std::wstring path(MAX_PATH, L'\0');
  while (true) {
    const DWORD length =
        ::GetModuleFileNameW(nullptr, path.data(), static_cast<DWORD>(path.size()));
    if (length == 0) return std::string();
    if (length < path.size()) {
      path.resize(length);
      break;
    }
    if (path.size() >= 32768) return std::string();
    path.resize(path.size() * 2);
  }
  return FileName(narrow(path)).GetDirectory().str();
}

std::string File::identity(const char* path, bool& regular) {
  regular = false;
  if (path == nullptr || !usableName(path)) return std::string();
  FileKey key;
  if (keyOf(widen(path), key)) {
    regular = key.regular;
    if (!key.regular && !key.folder) return "device " + std::string(path);
    return "file " + std::to_string(key.volume) + ":" + std::to_string(key.index);
  }
  const DWORD code = ::GetLastError();
  if (code != ERROR_FILE_NOT_FOUND) return std::string();
  const std::string_view prefix = directoryPrefix(path);
  const std::string folder = prefix.empty() ? std::string(".") : std::string(prefix);
  if (!keyOf(widen(folder), key) || !key.folder) return std::string();
  // Windows file names ignore case: "OUT.txt" and "out.txt" are one file to be.
  StringBase name(lastComponent(path));
  name.MakeLower();
  return "new " + std::to_string(key.volume) + ":" + std::to_string(key.index) + "/" + name.str();
}

std::FILE* File::openRegular(const char* path, bool& notRegular) {
  notRegular = false;
  if (path == nullptr || !usableName(path)) return nullptr;
  const std::wstring wide = widen(path);
  const DWORD attributes = ::GetFileAttributesW(wide.c_str());
  if (attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY) != 0)
    return nullptr;
  HANDLE handle = ::CreateFileW(wide.c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE,
                                nullptr, OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr);
  if (handle == INVALID_HANDLE_VALUE) return nullptr;
  if (::GetFileType(handle) != FILE_TYPE_DISK) {
    notRegular = true;
    ::CloseHandle(handle);
    return nullptr;
  }
  const int descriptor =
      ::_open_osfhandle(reinterpret_cast<intptr_t>(handle), _O_RDONLY | _O_BINARY);
  if (descriptor < 0) {
    ::CloseHandle(handle);
    return nullptr;
  }
  std::FILE* stream = ::_fdopen(descriptor, "rb");
  if (stream == nullptr) ::_close(descriptor);
  return stream;
}

/// The first failure met on an output stream.
struct OutputFile::Sink {
  int firstError = 0;

  void fail(int code) {
    if (firstError == 0) firstError = code != 0 ? code : EIO;
  }
};

OutputFile::OutputFile() = default;

OutputFile::~OutputFile() { discard(); }

namespace {

/// A new file beside `path`, created exclusively; INVALID_HANDLE_VALUE when none can be made.
HANDLE createBeside(const std::string& path, std::string& name) {
  for (int attempt = 0; attempt < 16; ++attempt) {
    name = std::string(directoryPrefix(path)) + "." + std::string(lastComponent(path)) + "." +
           randomTag();
    HANDLE handle = ::CreateFileW(widen(name).c_str(), GENERIC_WRITE, FILE_SHARE_READ, nullptr,
                                  CREATE_NEW, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (handle != INVALID_HANDLE_VALUE || ::GetLastError() != ERROR_FILE_EXISTS) return handle;
  }
  return INVALID_HANDLE_VALUE;
}

bool sameFile(HANDLE handle, DWORD volume, uint64_t index) {
  BY_HANDLE_FILE_INFORMATION info{};
  return ::GetFileInformationByHandle(handle, &info) != 0 && info.dwVolumeSerialNumber == volume &&
         ((uint64_t{info.nFileIndexHigh} << 32) | info.nFileIndexLow) == index;
}

}  // namespace

bool OutputFile::open(const char* path, Placement placement, std::string& error) {
  discard();
  m_Sink.reset();
  m_Removable = false;
  m_Path = path != nullptr ? path : "";
  if (!usableName(m_Path)) {
    error = std::strerror(ENOENT);
    return false;
  }
  const std::wstring wide = widen(m_Path);
  const DWORD attributes = ::GetFileAttributesW(wide.c_str());
  const bool exists = attributes != INVALID_FILE_ATTRIBUTES;
  if (exists && (attributes & FILE_ATTRIBUTE_DIRECTORY) != 0) {
    error = std::strerror(EISDIR);
    return false;
  }
  if (placement == Placement::InPlaceNoFollow && exists &&
      (attributes & FILE_ATTRIBUTE_REPARSE_POINT) != 0) {
    error = "it is a symbolic link, which is not followed";
    return false;
  }

  HANDLE handle = INVALID_HANDLE_VALUE;
  if (placement == Placement::Replace) {
    FileKey key;
    const bool regularTarget = !exists || (keyOf(wide, key) && key.regular);
    // Replacing a read-only file would succeed where a plain open refuses to write it.
    if (exists && regularTarget && (attributes & FILE_ATTRIBUTE_READONLY) != 0) {
      error = std::strerror(EACCES);
      return false;
    }
    // When no file can be made in the folder, the target is still written in place.
    if (regularTarget) handle = createBeside(m_Path, m_Temporary);
  }
  if (handle == INVALID_HANDLE_VALUE) {
    m_Temporary.clear();
    handle = ::CreateFileW(wide.c_str(), GENERIC_WRITE, FILE_SHARE_READ, nullptr, CREATE_ALWAYS,
                           FILE_ATTRIBUTE_NORMAL, nullptr);
    if (handle == INVALID_HANDLE_VALUE) {
      error = lastErrorText();
      return false;
    }
  } else if (!Interrupt::removeOnSignal(m_Temporary)) {
    // Without the interrupt guard an interrupted run could leave the temporary file behind.
    ::CloseHandle(handle);
    ::DeleteFileW(widen(m_Temporary).c_str());
    m_Temporary.clear();
    error = "too many files to clean up on an interrupt";
    return false;
  }

  BY_HANDLE_FILE_INFORMATION info{};
  const bool disk =
      ::GetFileType(handle) == FILE_TYPE_DISK && ::GetFileInformationByHandle(handle, &info);
  m_Device = info.dwVolumeSerialNumber;
  m_Inode = (uint64_t{info.nFileIndexHigh} << 32) | info.nFileIndexLow;
  // A file written in place is ours to remove only when it is the file at m_Path itself, not
  // one reached through a link.
  if (m_Temporary.empty())
    m_Removable = disk && (::GetFileAttributesW(wide.c_str()) & FILE_ATTRIBUTE_REPARSE_POINT) == 0;

  m_Sink = std::make_unique<Sink>();
  m_Stream = streamOver(handle);
  if (m_Stream == nullptr) {
    error = std::strerror(errno);
    m_Sink.reset();
    m_Removable = false;
    discard();
    return false;
  }
  return true;
}

bool OutputFile::close(std::string& error) {
  if (m_Stream != nullptr) {
    errno = 0;
    const bool flushed = std::fflush(m_Stream) == 0 && std::ferror(m_Stream) == 0;
    const int flushError = errno;
    const bool closed = std::fclose(m_Stream) == 0;
    m_Stream = nullptr;
    if (!flushed || !closed) m_Sink->fail(flushError != 0 ? flushError : errno);
  }
  if (m_Sink == nullptr || m_Sink->firstError == 0) return true;
  error = std::strerror(m_Sink->firstError);
  return false;
}

bool OutputFile::commit(std::string& error) {
  std::string ignored;
  close(ignored);
  if (m_Temporary.empty()) return true;
  const std::wstring target = widen(m_Path);
  const std::wstring temporary = widen(m_Temporary);
  // ReplaceFileW keeps the replaced file's attributes and permissions; a new target is
  // simply renamed into place.
  bool renamed = ::GetFileAttributesW(target.c_str()) != INVALID_FILE_ATTRIBUTES &&
                 ::ReplaceFileW(target.c_str(), temporary.c_str(), nullptr,
                                REPLACEFILE_IGNORE_MERGE_ERRORS, nullptr, nullptr) != 0;
  if (!renamed)
    renamed = ::MoveFileExW(temporary.c_str(), target.c_str(), MOVEFILE_REPLACE_EXISTING) != 0;
  if (!renamed) {
    error = lastErrorText();
    ::DeleteFileW(temporary.c_str());
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
  ::DeleteFileW(widen(m_Temporary).c_str());
  Interrupt::forget(m_Temporary);
  m_Temporary.clear();
}

bool OutputFile::removeWritten() {
  if (!m_Removable || !m_Temporary.empty()) return false;
  m_Removable = false;
  const std::wstring wide = widen(m_Path);
  const DWORD attributes = ::GetFileAttributesW(wide.c_str());
  if (attributes == INVALID_FILE_ATTRIBUTES ||
      (attributes & (FILE_ATTRIBUTE_DIRECTORY | FILE_ATTRIBUTE_REPARSE_POINT)) != 0)
    return false;
  HANDLE handle =
      ::CreateFileW(wide.c_str(), 0, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                    nullptr, OPEN_EXISTING, 0, nullptr);
  if (handle == INVALID_HANDLE_VALUE) return false;
  const bool same = sameFile(handle, static_cast<DWORD>(m_Device), m_Inode);
  ::CloseHandle(handle);
  return same && ::DeleteFileW(wide.c_str()) != 0;
}

}  // namespace Host
