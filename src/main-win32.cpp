// The Windows entry point. The command line arrives in UTF-16 and is handed on in UTF-8, the
// encoding the rest of the program uses for every name. Standard output and error, and every
// file the program opens, are binary: output bytes are the template's bytes, with no carriage
// return added before each line feed.
#include <windows.h>
// shellapi.h needs the types windows.h declares.
#include <fcntl.h>
#include <io.h>
#include <shellapi.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "front_end.h"
#include "platform/wide_text-win32.h"

int main() {
  _fmode = _O_BINARY;
  _setmode(_fileno(stdin), _O_BINARY);
  _setmode(_fileno(stdout), _O_BINARY);
  _setmode(_fileno(stderr), _O_BINARY);

  int count = 0;
  wchar_t** wide = ::CommandLineToArgvW(::GetCommandLineW(), &count);
  if (wide == nullptr) return EXIT_FAILURE;
  std::vector<std::string> words;
  for (int i = 0; i < count; ++i) words.push_back(Host::win32::narrow(wide[i]));
  ::LocalFree(wide);
  std::vector<char*> argv;
  for (std::string& word : words) argv.push_back(word.data());
  argv.push_back(nullptr);
  return runFrontEnd(count, argv.data());
}
