// A small JSON reader for the documents external tools write (Yosys' write_json): objects
// keep their member order, numbers are kept as doubles, errors end the parse with false.
#pragma once

#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

namespace difftest {

struct JsonMember;

struct JsonValue {
  enum Kind { Null, Bool, Number, String, Array, Object } kind = Null;
  bool boolean = false;
  double number = 0;
  std::string text;
  std::vector<JsonValue> items;     ///< array elements
  std::vector<JsonMember> members;  ///< object members in document order

  /// The member called `key`, or null when this is no object or has no such member.
  const JsonValue* member(std::string_view key) const;
  /// The member `key` as an integer, or `fallback` when it is missing or not a number.
  long long integer(std::string_view key, long long fallback) const;
};

struct JsonMember {
  std::string name;
  JsonValue value;
};

inline const JsonValue* JsonValue::member(std::string_view key) const {
  for (const JsonMember& each : members)
    if (each.name == key) return &each.value;
  return nullptr;
}

inline long long JsonValue::integer(std::string_view key, long long fallback) const {
  const JsonValue* value = member(key);
  return value != nullptr && value->kind == Number ? static_cast<long long>(value->number)
                                                   : fallback;
}

class JsonReader {
 public:
  explicit JsonReader(std::string_view text) : m_Text(text) {}

  /// Parses the whole text as one value; false on any syntax error or trailing garbage.
  bool parse(JsonValue& out) {
    m_Pos = 0;
    if (!value(out, 0)) return false;
    peek();
    return m_Pos == m_Text.size();
  }

 private:
  static constexpr int kMaxDepth = 200;

  /// The next character after blanks, not consumed; '\0' at the end.
  char peek() {
    while (m_Pos < m_Text.size() && std::string_view(" \n\r\t").find(m_Text[m_Pos]) !=
                                        std::string_view::npos)
      ++m_Pos;
    return m_Pos < m_Text.size() ? m_Text[m_Pos] : '\0';
  }

  bool literal(std::string_view word) {
    if (m_Text.substr(m_Pos, word.size()) != word) return false;
    m_Pos += word.size();
    return true;
  }

  bool value(JsonValue& out, int depth) {
    const char c = peek();
    if (depth > kMaxDepth || c == '\0') return false;
    if (c == '{' || c == '[') return container(out, c == '{', depth);
    if (c == '"') {
      out.kind = JsonValue::String;
      return string(out.text);
    }
    if (literal("null")) return true;
    if (literal("true") || literal("false")) {
      out.kind = JsonValue::Bool;
      out.boolean = c == 't';
      return true;
    }
    const size_t end = m_Text.find_first_not_of("+-0123456789.eE", m_Pos);
    const std::string digits(m_Text.substr(m_Pos, end - m_Pos));
    char* stop = nullptr;
    out.number = std::strtod(digits.c_str(), &stop);
    if (digits.empty() || stop != digits.c_str() + digits.size()) return false;
    out.kind = JsonValue::Number;
    m_Pos += digits.size();
    return true;
  }

  bool string(std::string& out) {
    ++m_Pos;  // opening quote
    while (m_Pos < m_Text.size()) {
      const char c = m_Text[m_Pos++];
      if (c == '"') return true;
      if (c != '\\') {
        out += c;
      } else if (m_Pos >= m_Text.size()) {
        return false;
      } else if (const char escaped = m_Text[m_Pos++]; escaped != 'u') {
        const size_t known = std::string_view("ntrbf").find(escaped);
        out += known == std::string_view::npos ? escaped : "\n\t\r\b\f"[known];
      } else {
        if (m_Pos + 4 > m_Text.size()) return false;
        const long code = std::strtol(std::string(m_Text.substr(m_Pos, 4)).c_str(), nullptr, 16);
        m_Pos += 4;
        if (code < 0x80) {
          out += static_cast<char>(code);
        } else if (code < 0x800) {
          out += static_cast<char>(0xC0 | (code >> 6));
          out += static_cast<char>(0x80 | (code & 0x3F));
        } else {
          out += static_cast<char>(0xE0 | (code >> 12));
          out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
          out += static_cast<char>(0x80 | (code & 0x3F));
        }
      }
    }
    return false;
  }

  /// An object ({"name": value, ...}) or an array ([value, ...]).
  bool container(JsonValue& out, bool object, int depth) {
    out.kind = object ? JsonValue::Object : JsonValue::Array;
    const char close = object ? '}' : ']';
    ++m_Pos;
    if (peek() == close) {
      ++m_Pos;
      return true;
    }
    while (true) {
      JsonValue* item = nullptr;
      if (object) {
        out.members.emplace_back();
        if (peek() != '"' || !string(out.members.back().name) || peek() != ':') return false;
        ++m_Pos;
        item = &out.members.back().value;
      } else {
        item = &out.items.emplace_back();
      }
      if (!value(*item, depth + 1)) return false;
      const char c = peek();
      ++m_Pos;
      if (c == close) return true;
      if (c != ',') return false;
    }
  }

  std::string_view m_Text;
  size_t m_Pos = 0;
};

}  // namespace difftest
