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
    skipBlanks();
    return m_Pos == m_Text.size();
  }

 private:
  static constexpr int kMaxDepth = 200;

  void skipBlanks() {
    while (m_Pos < m_Text.size() && (m_Text[m_Pos] == ' ' || m_Text[m_Pos] == '\n' ||
                                     m_Text[m_Pos] == '\r' || m_Text[m_Pos] == '\t'))
      ++m_Pos;
  }

  bool literal(std::string_view word) {
    if (m_Text.substr(m_Pos, word.size()) != word) return false;
    m_Pos += word.size();
    return true;
  }

  bool value(JsonValue& out, int depth) {
    if (depth > kMaxDepth) return false;
    skipBlanks();
    if (m_Pos >= m_Text.size()) return false;
    const char c = m_Text[m_Pos];
    if (c == '{') return object(out, depth);
    if (c == '[') return array(out, depth);
    if (c == '"') {
      out.kind = JsonValue::String;
      return string(out.text);
    }
    if (literal("true")) {
      out.kind = JsonValue::Bool;
      out.boolean = true;
      return true;
    }
    if (literal("false")) {
      out.kind = JsonValue::Bool;
      return true;
    }
    if (literal("null")) return true;
    return number(out);
  }

  bool number(JsonValue& out) {
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
        continue;
      }
      if (m_Pos >= m_Text.size()) return false;
      const char escaped = m_Text[m_Pos++];
      switch (escaped) {
        case 'n': out += '\n'; break;
        case 't': out += '\t'; break;
        case 'r': out += '\r'; break;
        case 'b': out += '\b'; break;
        case 'f': out += '\f'; break;
        case 'u': {
          if (m_Pos + 4 > m_Text.size()) return false;
          const long code = std::strtol(std::string(m_Text.substr(m_Pos, 4)).c_str(), nullptr, 16);
          m_Pos += 4;
          appendUtf8(out, code);
          break;
        }
        default: out += escaped; break;
      }
    }
    return false;
  }

  static void appendUtf8(std::string& out, long code) {
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

  bool array(JsonValue& out, int depth) {
    out.kind = JsonValue::Array;
    ++m_Pos;
    skipBlanks();
    if (m_Pos < m_Text.size() && m_Text[m_Pos] == ']') {
      ++m_Pos;
      return true;
    }
    while (true) {
      out.items.emplace_back();
      if (!value(out.items.back(), depth + 1)) return false;
      skipBlanks();
      if (m_Pos >= m_Text.size()) return false;
      const char c = m_Text[m_Pos++];
      if (c == ']') return true;
      if (c != ',') return false;
    }
  }

  bool object(JsonValue& out, int depth) {
    out.kind = JsonValue::Object;
    ++m_Pos;
    skipBlanks();
    if (m_Pos < m_Text.size() && m_Text[m_Pos] == '}') {
      ++m_Pos;
      return true;
    }
    while (true) {
      skipBlanks();
      if (m_Pos >= m_Text.size() || m_Text[m_Pos] != '"') return false;
      out.members.emplace_back();
      if (!string(out.members.back().name)) return false;
      skipBlanks();
      if (m_Pos >= m_Text.size() || m_Text[m_Pos++] != ':') return false;
      if (!value(out.members.back().value, depth + 1)) return false;
      skipBlanks();
      if (m_Pos >= m_Text.size()) return false;
      const char c = m_Text[m_Pos++];
      if (c == '}') return true;
      if (c != ',') return false;
    }
  }

  std::string_view m_Text;
  size_t m_Pos = 0;
};

}  // namespace difftest
