// Every line the program prints outside the run's reporter goes through here, so no text is
// ever taken for a printf format and a NUL byte in it is printed rather than ending it.
#include "message_lines.h"

#include <string>

void writeText(std::FILE* stream, std::string_view text) {
  std::fwrite(text.data(), 1, text.size(), stream);
}

void writeLine(std::FILE* stream, std::string_view text) {
  std::string line(text);
  line += '\n';
  writeText(stream, line);
}

void writeFatalError(std::FILE* stream, std::string_view text) {
  std::string line = "FATAL ERROR: ";
  line += text;
  writeLine(stream, line);
}
