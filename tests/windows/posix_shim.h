// The few POSIX calls the platform-neutral tests make, on top of the Windows C library, so that
// those tests run unchanged in the Windows build. cmake/Windows.cmake force-includes this header
// into the test binaries only; the program itself never sees it.
#pragma once

#include <direct.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <random>

inline int setenv(const char* name, const char* value, int overwrite) {
  if (overwrite == 0 && getenv(name) != nullptr) return 0;
  return _putenv_s(name, value);
}

// An empty value removes the variable on Windows.
inline int unsetenv(const char* name) { return _putenv_s(name, ""); }

inline int mkdir(const char* path, int /*mode*/) { return _mkdir(path); }

inline char* mkdtemp(char* pattern) {
  const size_t length = strlen(pattern);
  if (length < 6 || strcmp(pattern + length - 6, "XXXXXX") != 0) return nullptr;
  static constexpr char kDigits[] = "0123456789abcdefghijklmnopqrstuvwxyz";
  std::random_device source;
  for (int attempt = 0; attempt < 32; ++attempt) {
    for (size_t i = length - 6; i < length; ++i) pattern[i] = kDigits[source() % 36];
    if (_mkdir(pattern) == 0) return pattern;
  }
  return nullptr;
}

// A read-only memory stream, made as a temporary file holding the bytes.
inline FILE* fmemopen(void* buffer, size_t size, const char* /*mode*/) {
  FILE* stream = tmpfile();
  if (stream == nullptr) return nullptr;
  if (fwrite(buffer, 1, size, stream) != size) {
    fclose(stream);
    return nullptr;
  }
  rewind(stream);
  return stream;
}

// x86-64 Windows pages are 4 KiB.
#define _SC_PAGESIZE 30
inline long sysconf(int /*name*/) { return 4096; }
