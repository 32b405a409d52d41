// Maps files on Windows so that a large netlist costs one mapping rather than one copy. A view
// ends at a page boundary and the rest of its last page reads as zeroes, which gives the NUL
// sentinel for free; a file whose size is a multiple of the page has no such rest, and is read
// into memory instead.
#include <windows.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string>

#include "hostkit/wide_text-win32.h"
#include "scan/common/source_buffer.h"

namespace scan {

namespace {

/// The C library's wording for the common failures, so messages read as on other systems.
std::string describe(DWORD code) {
  switch (code) {
    case ERROR_FILE_NOT_FOUND:
    case ERROR_PATH_NOT_FOUND:
    case ERROR_INVALID_NAME:
    case ERROR_BAD_NETPATH:
      return std::strerror(ENOENT);
    case ERROR_ACCESS_DENIED:
    case ERROR_SHARING_VIOLATION:
    case ERROR_LOCK_VIOLATION:
      return std::strerror(EACCES);
    case ERROR_NOT_ENOUGH_MEMORY:
    case ERROR_OUTOFMEMORY:
      return std::strerror(ENOMEM);
    default:
      return "system error " + std::to_string(code);
  }
}

class Handle {
 public:
  explicit Handle(HANDLE handle) : m_Handle(handle) {}
  ~Handle() {
    if (valid()) ::CloseHandle(m_Handle);
  }
  Handle(const Handle&) = delete;
  Handle& operator=(const Handle&) = delete;
  bool valid() const { return m_Handle != nullptr && m_Handle != INVALID_HANDLE_VALUE; }
  HANDLE get() const { return m_Handle; }

 private:
  HANDLE m_Handle;
};

size_t pageSize() {
  SYSTEM_INFO info{};
  ::GetSystemInfo(&info);
  return info.dwPageSize;
}

bool readWhole(HANDLE file, size_t size, std::string& into) {
  into.resize(size);
  size_t done = 0;
  while (done < size) {
    const DWORD chunk = static_cast<DWORD>(std::min<size_t>(size - done, 1u << 30));
    DWORD got = 0;
    if (!::ReadFile(file, into.data() + done, chunk, &got, nullptr) || got == 0) return false;
    done += got;
  }
  return true;
}

}  // namespace

std::unique_ptr<SourceBuffer> SourceBuffer::open(const std::string& path, std::string& error) {
  if (!Host::win32::usableName(path)) {
    error = std::strerror(ENOENT);
    return nullptr;
  }
  const std::wstring wide = Host::win32::widen(path);
  const DWORD attributes = ::GetFileAttributesW(wide.c_str());
  if (attributes != INVALID_FILE_ATTRIBUTES && (attributes & FILE_ATTRIBUTE_DIRECTORY) != 0) {
    error = "is a directory";
    return nullptr;
  }
  Handle file(::CreateFileW(wide.c_str(), GENERIC_READ,
                            FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                            OPEN_EXISTING, FILE_FLAG_SEQUENTIAL_SCAN, nullptr));
  if (!file.valid()) {
    error = describe(::GetLastError());
    return nullptr;
  }
  if (::GetFileType(file.get()) != FILE_TYPE_DISK) {
    error = "not a regular file";
    return nullptr;
  }
  LARGE_INTEGER fileSize{};
  if (!::GetFileSizeEx(file.get(), &fileSize)) {
    error = describe(::GetLastError());
    return nullptr;
  }
  std::unique_ptr<SourceBuffer> buffer(new SourceBuffer);
  buffer->m_Path = path;
  const size_t size = static_cast<size_t>(fileSize.QuadPart);
  if (size == 0) return buffer;

  if (size % pageSize() == 0) {
    if (!readWhole(file.get(), size, buffer->m_Owned)) {
      error = describe(::GetLastError());
      return nullptr;
    }
    buffer->m_Data = buffer->m_Owned.c_str();
    buffer->m_Size = size;
    return buffer;
  }
  Handle mapping(::CreateFileMappingW(file.get(), nullptr, PAGE_READONLY, 0, 0, nullptr));
  if (!mapping.valid()) {
    error = describe(::GetLastError());
    return nullptr;
  }
  // The view keeps the mapping alive on its own; both handles may close now.
  void* view = ::MapViewOfFile(mapping.get(), FILE_MAP_READ, 0, 0, 0);
  if (view == nullptr) {
    error = describe(::GetLastError());
    return nullptr;
  }
  buffer->m_Mapping = view;
  buffer->m_MappingSize = size;
  buffer->m_Data = static_cast<const char*>(view);
  buffer->m_Size = size;
  return buffer;
}

SourceBuffer::~SourceBuffer() {
  if (m_Mapping) ::UnmapViewOfFile(m_Mapping);
}

}  // namespace scan
