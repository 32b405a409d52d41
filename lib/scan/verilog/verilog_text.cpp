// A small scanner of its own rather than the lexer: it must keep what the lexer discards
// (the exact spelling of numbers, strings and escaped names) and drop only comments.
#include "scan/verilog/verilog_text.h"

#include "scan/common/source_buffer.h"

namespace scan::verilog {
namespace {

bool isSpace(char c) {
  return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\f' || c == '\v';
}

}  // namespace

std::string normaliseWritten(std::string_view text) {
  std::string out;
  bool blank = false;
  size_t i = 0;
  auto emit = [&](std::string_view piece) {
    if (blank && !out.empty()) out += ' ';
    blank = false;
    out.append(piece);
  };
  while (i < text.size()) {
    char c = text[i];
    if (isSpace(c)) {
      blank = true;
      ++i;
    } else if (c == '/' && i + 1 < text.size() && text[i + 1] == '/') {
      size_t end = text.find('\n', i);
      i = end == std::string_view::npos ? text.size() : end;
      blank = true;
    } else if (c == '/' && i + 1 < text.size() && text[i + 1] == '*') {
      size_t end = text.find("*/", i + 2);
      i = end == std::string_view::npos ? text.size() : end + 2;
      blank = true;
    } else if (c == '"') {
      size_t end = i + 1;
      while (end < text.size() && text[end] != '"' && text[end] != '\n')
        end += text[end] == '\\' && end + 1 < text.size() ? 2 : 1;
      if (end < text.size() && text[end] == '"') ++end;
      emit(text.substr(i, end - i));
      i = end;
    } else if (c == '\\') {
      size_t end = i + 1;
      while (end < text.size() && !isSpace(text[end])) ++end;
      // The white space that ends the name follows, so a blank is kept after it.
      emit(text.substr(i, end - i));
      i = end;
    } else {
      emit(text.substr(i, 1));
      ++i;
    }
  }
  return out;
}

std::string writtenBetween(const Token& first, const Token& after) {
  if (!first.source || first.source != after.source || after.offset <= first.offset) return {};
  std::string_view text = first.source->text();
  if (after.offset > text.size()) return {};
  return normaliseWritten(text.substr(first.offset, after.offset - first.offset));
}

}  // namespace scan::verilog
