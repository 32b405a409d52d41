// Files on Windows: tests and removals by name, temporary files created exclusively, and the
// folder of the running executable. Names are UTF-8 inside the program and UTF-16 towards the
// system.
#include <fcntl.h>
#include <io.h>
#include <windows.h>

#include <cstdio>
#include <random>
#include <string>
#include <string_view>

#include "platform/hostkit.h"
#include "platform/wide_text-win32.h"

namespace {

using Host::win32::narrow;
using Host::win32::usableName;
using Host::win32::widen;

std::string temporaryDirectory() {
  // GetTempPathW honours TMP and TEMP, and ends its answer with a separator.
  std::wstring directory(MAX_PATH + 1, L'\0');
  const DWORD length = ::GetTempPathW(static_cast<DWORD>(directory.size()), directory.data());
  if (length == 0 || length > directory.size()) return std::string();
  directory.resize(length);
  return narrow(directory);
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

std::FILE* File::createTemporary(std::string_view suffix, std::string& name) {
  if (suffix.find_first_of(std::string_view("/\\:\0", 4)) != std::string_view::npos)
    return nullptr;
  const std::string directory = temporaryDirectory();
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
    const int descriptor =
        ::_open_osfhandle(reinterpret_cast<intptr_t>(handle), _O_WRONLY | _O_BINARY);
    if (descriptor < 0) {
      ::CloseHandle(handle);
      remove(candidate.c_str());
      return nullptr;
    }
    std::FILE* stream = ::_fdopen(descriptor, "wb");
    if (stream == nullptr) {
      ::_close(descriptor);
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

}  // namespace Host
