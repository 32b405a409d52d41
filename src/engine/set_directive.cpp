// "@SET key=value@": changes one output state variable from inside the template. The token is
// split field by field: the directive word ends at the first blank or tab, the key at the first
// "=", the value at the first "@". Blanks around the key stay in it, so such keys match nothing
// and templates that relied on loose spacing fail loudly instead of setting the wrong thing.
#include <cstdint>
#include <limits>

#include "engine/forge.h"

namespace {

// Splits a text into successive fields, each with its own separator set: a field first skips
// separators of its set, then runs to the next separator (consumed) or to the end.
class FieldSplitter {
 public:
  explicit FieldSplitter(std::string_view text) : m_Rest(text) {}

  /// The next field; false when nothing but separators is left.
  bool next(std::string_view separators, std::string_view& field) {
    const size_t start = m_Rest.find_first_not_of(separators);
    if (start == std::string_view::npos) {
      m_Rest = {};
      return false;
    }
    const size_t stop = m_Rest.find_first_of(separators, start);
    if (stop == std::string_view::npos) {
      field = m_Rest.substr(start);
      m_Rest = {};
    } else {
      field = m_Rest.substr(start, stop - start);
      m_Rest = m_Rest.substr(stop + 1);
    }
    return true;
  }

 private:
  std::string_view m_Rest;
};

bool equalsIgnoringCase(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    char x = a[i];
    char y = b[i];
    if (x >= 'A' && x <= 'Z') x = static_cast<char>(x - 'A' + 'a');
    if (y >= 'A' && y <= 'Z') y = static_cast<char>(y - 'A' + 'a');
    if (x != y) return false;
  }
  return true;
}

bool isSpace(char c) {
  return c == ' ' || c == '\t' || c == '\n' || c == '\v' || c == '\f' || c == '\r';
}

// Reads the decimal integer that `text` begins with (optional white space and sign first);
// anything after the digits is ignored. Values beyond the 32-bit range are clamped.
bool parseLeadingInteger(std::string_view text, int32_t& value) {
  size_t i = 0;
  while (i < text.size() && isSpace(text[i])) ++i;
  bool negative = false;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
  if (i >= text.size() || text[i] < '0' || text[i] > '9') return false;
  constexpr int64_t kLimit = int64_t{std::numeric_limits<int32_t>::max()} + 1;
  int64_t magnitude = 0;
  for (; i < text.size() && text[i] >= '0' && text[i] <= '9'; ++i) {
    magnitude = magnitude * 10 + (text[i] - '0');
    if (magnitude > kLimit) magnitude = kLimit;
  }
  int64_t signedValue = negative ? -magnitude : magnitude;
  if (signedValue > std::numeric_limits<int32_t>::max()) {
    signedValue = std::numeric_limits<int32_t>::max();
  }
  value = static_cast<int32_t>(signedValue);
  return true;
}

// "on"/"off" into `flag`; false for any other or an absent value.
bool parseSwitch(bool present, std::string_view value, bool& flag) {
  if (!present) return false;
  if (equalsIgnoringCase(value, "on")) {
    flag = true;
    return true;
  }
  if (equalsIgnoringCase(value, "off")) {
    flag = false;
    return true;
  }
  return false;
}

constexpr std::string_view kPrefix = "Invalid syntax for @SET directive, ";

enum class KeyKind { Text, Width, Switch, Range, Case };

// One state variable: its key, how its value is read, and where it is stored.
struct SetKey {
  std::string_view name;
  KeyKind kind;
  std::string Forge::*text;
  bool Forge::*flag;
  std::string_view upperName;  // on/off keys: the name their message gives
};

constexpr SetKey kKeys[] = {
    {"busleft", KeyKind::Text, &Forge::m_BusLeft, nullptr, {}},
    {"busright", KeyKind::Text, &Forge::m_BusRight, nullptr, {}},
    {"eoldelim", KeyKind::Text, &Forge::m_EolDelim, nullptr, {}},
    {"outlinewidth", KeyKind::Width, nullptr, nullptr, {}},
    {"sigdelim", KeyKind::Text, &Forge::m_SigDelim, nullptr, {}},
    {"vhdl_bustype", KeyKind::Text, &Forge::m_VhdlBusType, nullptr, {}},
    {"vhdl_nettype", KeyKind::Text, &Forge::m_VhdlNetType, nullptr, {}},
    {"casesensitiveif", KeyKind::Switch, nullptr, &Forge::m_CaseSensitiveIf, "CASESENSITIVEIF"},
    {"expandbus", KeyKind::Switch, nullptr, &Forge::m_ExpandBus, "EXPANDBUS"},
    {"showrange", KeyKind::Range, nullptr, &Forge::m_ShowRange, "SHOWRANGE"},
    {"suppresnewline", KeyKind::Switch, nullptr, &Forge::m_SuppresNewLine, "SUPPRESNEWLINE"},
    {"map", KeyKind::Switch, nullptr, &Forge::m_Map, "MAP"},
    {"case", KeyKind::Case, nullptr, nullptr, {}},
};

struct CaseWord {
  std::string_view name;
  Forge::CaseMode mode;
};

constexpr CaseWord kCaseWords[] = {{"upcase", Forge::UPCASE},
                                   {"lowcase", Forge::LOWCASE},
                                   {"invcase", Forge::INVCASE},
                                   {"samecase", Forge::SAMECASE}};

}  // namespace

bool Forge::doSet(std::string_view token) {
  trace("doSet() called: token=%.*s\n", static_cast<int>(token.size()), token.data());

  FieldSplitter splitter(token);
  std::string_view word;
  std::string_view key;
  std::string_view value;
  splitter.next(" \t", word);
  if (!splitter.next("=", key)) {
    reportError(std::string(kPrefix) + "must be of the form: @SET STATE_VARIABLE=VALUE@");
    return true;
  }
  const bool present = splitter.next("@", value);

  for (const SetKey& entry : kKeys) {
    if (!equalsIgnoringCase(key, entry.name)) continue;
    switch (entry.kind) {
      case KeyKind::Text:
        (this->*entry.text).assign(present ? value : std::string_view());
        return false;
      case KeyKind::Width:
        if (present && parseLeadingInteger(value, m_OutLineWidth)) return false;
        reportError(std::string(kPrefix) + "OUTLINEWIDTH must be assigned an integer value");
        return true;
      case KeyKind::Range:
        if (present && equalsIgnoringCase(value, "AsPrefix")) {
          m_ShowRange = true;
          m_RangePosition = AsPrefix;
          return false;
        }
        if (present && equalsIgnoringCase(value, "AsPostfix")) {
          m_ShowRange = true;
          m_RangePosition = AsPostfix;
          return false;
        }
        [[fallthrough]];
      case KeyKind::Switch:
        if (parseSwitch(present, value, this->*entry.flag)) return false;
        reportError(std::string(kPrefix) + std::string(entry.upperName) +
                    " must be assigned the value ON or OFF");
        return true;
      case KeyKind::Case:
        for (const CaseWord& mode : kCaseWords) {
          if (present && equalsIgnoringCase(value, mode.name)) {
            m_Case = mode.mode;
            return false;
          }
        }
        reportError(std::string(kPrefix) +
                    "CASE must be assigned the value\nUPCASE, LOWCASE, INVCASE, or SAMECASE.");
        return true;
    }
  }

  reportError(std::string(kPrefix) + std::string(key) +
              "is not a valid choice for STATE_VARIABLE.");
  return true;
}
