// fopen as the program calls it, on Windows. Names are UTF-8 in the program and reach the
// system as UTF-16 (_wfopen), so any name Windows allows can be opened. The "e" flag (close on
// exec) of POSIX systems is unknown to the Windows C library and is dropped: a child there gets
// only the handles process-win32.cpp hands it. cmake/Windows.cmake routes every fopen call of
// pinforge.exe here with the linker's --wrap=fopen.
#include <cerrno>
#include <cstdio>
#include <string>
#include <string_view>

#include "hostkit/wide_text-win32.h"

extern "C" std::FILE* __wrap_fopen(const char* name, const char* mode) {
  if (name == nullptr || mode == nullptr || !Host::win32::usableName(name)) {
    errno = ENOENT;
    return nullptr;
  }
  std::wstring wideMode;
  for (const char* c = mode; *c != '\0'; ++c)
    if (*c != 'e') wideMode.push_back(static_cast<wchar_t>(static_cast<unsigned char>(*c)));
  return ::_wfopen(Host::win32::widen(name).c_str(), wideMode.c_str());
}
