// Literal conversion is done only for tokens inside expressions that are evaluated, never in
// the index pass.
#include "scan/vhdl/vhdl_literal.h"

#include <cmath>
#include <cstdlib>
#include <string>

#include "scan/common/ascii.h"

namespace scan::vhdl {
namespace {

int digitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'z') return c - 'a' + 10;
  if (c >= 'A' && c <= 'Z') return c - 'A' + 10;
  return 99;
}

std::string withoutUnderscores(std::string_view text) {
  std::string out;
  for (char c : text)
    if (c != '_') out.push_back(c);
  return out;
}

// Applies a decimal exponent to an integer mantissa; none when it leaves the integers.
Value scaleInteger(int64_t mantissa, int64_t base, long exponent) {
  if (exponent < 0) return {};
  int64_t factor = 0;
  if (!checkedPow(base, exponent, factor) || !checkedMul(mantissa, factor, mantissa)) return {};
  return Value::integer(mantissa);
}

Value numberValue(std::string_view raw) {
  std::string text = withoutUnderscores(raw);
  size_t hash = text.find('#');
  long exponent = 0;
  bool real = false;
  if (hash == std::string::npos) {
    size_t e = text.find_first_of("eE");
    real = text.find('.') != std::string::npos;
    if (real) return Value::real(std::strtod(text.c_str(), nullptr));
    if (e != std::string::npos) exponent = std::strtol(text.c_str() + e + 1, nullptr, 10);
    int64_t mantissa = 0;
    for (size_t i = 0; i < std::min(e, text.size()); ++i)
      if (!checkedMul(mantissa, 10, mantissa) || !checkedAdd(mantissa, text[i] - '0', mantissa))
        return {};
    return scaleInteger(mantissa, 10, exponent);
  }
  int64_t base = std::strtol(text.c_str(), nullptr, 10);
  size_t close = text.find('#', hash + 1);
  if (base < 2 || base > 16 || close == std::string::npos) return {};
  if (close + 1 < text.size()) exponent = std::strtol(text.c_str() + close + 2, nullptr, 10);
  int64_t whole = 0;
  double fraction = 0;
  double scale = 1;
  bool afterPoint = false;
  for (size_t i = hash + 1; i < close; ++i) {
    if (text[i] == '.') {
      afterPoint = real = true;
      continue;
    }
    int d = digitValue(text[i]);
    if (d >= base) return {};
    if (afterPoint) {
      scale /= static_cast<double>(base);
      fraction += d * scale;
    } else if (!checkedMul(whole, base, whole) || !checkedAdd(whole, d, whole)) {
      return {};
    }
  }
  if (real)
    return Value::real((static_cast<double>(whole) + fraction) *
                       std::pow(static_cast<double>(base), static_cast<double>(exponent)));
  return scaleInteger(whole, base, exponent);
}

std::string unquote(std::string_view body) {
  std::string out;
  for (size_t i = 0; i < body.size(); ++i) {
    out.push_back(body[i]);
    if (body[i] == '"' && i + 1 < body.size() && body[i + 1] == '"') ++i;
  }
  return out;
}

Value bitStringValue(std::string_view text) {
  size_t quote = text.find('"');
  size_t letters = quote;
  while (letters > 0 && !(text[letters - 1] >= '0' && text[letters - 1] <= '9')) --letters;
  std::string_view spec = text.substr(letters, quote - letters);
  char base = asciiLower(spec.back());
  bool isSigned = spec.size() == 2 && asciiLower(spec[0]) == 's';
  std::string digits = withoutUnderscores(unquote(text.substr(quote + 1, text.size() - quote - 2)));
  std::string bits;
  if (base == 'd') {
    uint64_t v = 0;
    for (char c : digits) {
      if (c < '0' || c > '9' || v > (UINT64_MAX - 9) / 10) return {};
      v = v * 10 + static_cast<uint64_t>(c - '0');
    }
    do {
      bits.insert(bits.begin(), static_cast<char>('0' + (v & 1)));
      v >>= 1;
    } while (v != 0);
  } else {
    int width = base == 'b' ? 1 : base == 'o' ? 3 : 4;
    for (char c : digits) {
      int d = digitValue(c);
      for (int i = width - 1; i >= 0; --i)
        bits.push_back(d < (1 << width) ? static_cast<char>('0' + ((d >> i) & 1)) : c);
    }
  }
  if (letters > 0) {
    size_t size = std::strtoul(std::string(text.substr(0, letters)).c_str(), nullptr, 10);
    if (size > (1u << 20)) return {};
    char fill = isSigned && !bits.empty() ? bits[0] : '0';
    if (bits.size() < size)
      bits.insert(0, size - bits.size(), fill);
    else
      bits.erase(0, bits.size() - size);
  }
  return Value::string(std::move(bits));
}

}  // namespace

Value literalValue(const Token& token) {
  switch (token.kind) {
    case TokenKind::Number:
      return numberValue(token.text);
    case TokenKind::String:
      return Value::string(unquote(token.text.substr(1, token.text.size() - 2)));
    case TokenKind::Character:
      return Value::string(std::string(token.text.substr(1, 1)));
    case TokenKind::BitString:
      return bitStringValue(token.text);
    default:
      return {};
  }
}

}  // namespace scan::vhdl
