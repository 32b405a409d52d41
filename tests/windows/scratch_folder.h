// A private folder under the Windows temporary folder for one test, removed afterwards, with
// whole-file writes and reads. Names are UTF-8 as everywhere in the program.
#pragma once

#include <windows.h>

#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>

#include "hostkit/wide_text-win32.h"

namespace pinforge_test {

class ScratchFolder {
 public:
  ScratchFolder() {
    std::wstring base(MAX_PATH + 1, L'\0');
    base.resize(::GetTempPathW(static_cast<DWORD>(base.size()), base.data()));
    m_Path = base + L"pinforge-test-" + std::to_wstring(::GetCurrentProcessId()) + L"-" +
             std::to_wstring(++s_Count);
    std::error_code error;
    std::filesystem::create_directories(m_Path, error);
  }
  ~ScratchFolder() {
    std::error_code error;
    std::filesystem::remove_all(m_Path, error);
  }
  ScratchFolder(const ScratchFolder&) = delete;
  ScratchFolder& operator=(const ScratchFolder&) = delete;

  /// The UTF-8 path of `name` inside the folder.
  std::string file(std::string_view name) const {
    return Host::win32::narrow(m_Path) + "\\" + std::string(name);
  }
  bool write(std::string_view name, std::string_view content) const {
    HANDLE handle = ::CreateFileW(Host::win32::widen(file(name)).c_str(), GENERIC_WRITE, 0, nullptr,
                                  CREATE_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (handle == INVALID_HANDLE_VALUE) return false;
    DWORD written = 0;
    const bool ok = ::WriteFile(handle, content.data(), static_cast<DWORD>(content.size()),
                                &written, nullptr) &&
                    written == content.size();
    ::CloseHandle(handle);
    return ok;
  }
  bool exists(std::string_view name) const {
    return ::GetFileAttributesW(Host::win32::widen(file(name)).c_str()) != INVALID_FILE_ATTRIBUTES;
  }

 private:
  static inline int s_Count = 0;
  std::wstring m_Path;
};

}  // namespace pinforge_test
