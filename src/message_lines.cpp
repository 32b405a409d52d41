// Each line goes out in one write, so a line on an unbuffered standard error is never split.
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

std::string fileFailureText(std::string_view action, std::string_view what, std::string_view name,
                            std::string_view why) {
  std::string text = "Unable to ";
  text += action;
  text += ' ';
  text += what;
  text += ' ';
  text += name;
  text += ": ";
  text += why;
  return text;
}
