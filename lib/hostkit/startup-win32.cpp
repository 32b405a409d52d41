// Process start-up on Windows. The command line arrives in UTF-16 and is handed on in UTF-8,
// the encoding the rest of the program uses for every name. Standard streams, and every file
// the program opens, are binary so no carriage return is added before a line feed.
#include <windows.h>
// shellapi.h needs the types windows.h declares.
#include <fcntl.h>
#include <io.h>
#include <shellapi.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "hostkit/wide_text-win32.h"
#include "platform/hostkit.h"

std::vector<std::string> Host::Process::startup(int argc, char** argv) {
  _fmode = _O_BINARY;
  _setmode(_fileno(stdin), _O_BINARY);
  _setmode(_fileno(stdout), _O_BINARY);
  _setmode(_fileno(stderr), _O_BINARY);

  int count = 0;
  wchar_t** wide = ::CommandLineToArgvW(::GetCommandLineW(), &count);
  // Without the wide command line the C runtime's own (ANSI) one is still better than none.
  if (wide == nullptr) return std::vector<std::string>(argv, argv + argc);
  std::vector<std::string> words;
  for (int i = 0; i < count; ++i) words.push_back(Host::win32::narrow(wide[i]));
  ::LocalFree(wide);
  return words;
}
