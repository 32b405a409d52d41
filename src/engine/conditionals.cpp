// @IFHAS / @IFNHAS / @IFPORT / @IFNPORT / @IFDEFAULT@ / @IFTYPED@ / @ENDIF@ and the other
// negations: keeping or dropping a stretch of template depending on whether the design has a
// port of a kind (or a generic) whose name matches a pattern, on the name of the current port of
// an iteration, or on what the current generic or port declares; blocks nest on a small stack.
#include <iterator>
#include <optional>
#include <string>
#include <string_view>

#include "engine/forge.h"
#include "engine/keyword_table.h"
#include "engine/token_fields.h"

namespace {

int lowerAscii(int c) { return (c >= 'A' && c <= 'Z') ? c + ('a' - 'A') : c; }

// Byte-wise three-way comparison, optionally folding ASCII letters to lower case.
int compareBytes(std::string_view a, std::string_view b, bool foldCase) {
  const size_t common = a.size() < b.size() ? a.size() : b.size();
  for (size_t i = 0; i < common; ++i) {
    int x = static_cast<unsigned char>(a[i]);
    int y = static_cast<unsigned char>(b[i]);
    if (foldCase) {
      x = lowerAscii(x);
      y = lowerAscii(y);
    }
    if (x != y) return x - y;
  }
  if (a.size() == b.size()) return 0;
  return a.size() < b.size() ? -1 : 1;
}

bool sameChar(char a, char b, bool foldCase) {
  if (!foldCase) return a == b;
  return lowerAscii(static_cast<unsigned char>(a)) == lowerAscii(static_cast<unsigned char>(b));
}

// "*" matches any run (empty included), "?" one character. Backtracks only to the last "*",
// which is enough for these patterns and keeps the cost at name length times pattern length.
bool globMatches(std::string_view name, std::string_view pattern, bool foldCase) {
  size_t n = 0;
  size_t p = 0;
  size_t star = std::string_view::npos;
  size_t resume = 0;
  while (n < name.size()) {
    if (p < pattern.size() && pattern[p] == '*') {
      star = p++;
      resume = n;
    } else if (p < pattern.size() &&
               (pattern[p] == '?' || sameChar(pattern[p], name[n], foldCase))) {
      ++n;
      ++p;
    } else if (star != std::string_view::npos) {
      p = star + 1;
      n = ++resume;
    } else {
      return false;
    }
  }
  while (p < pattern.size() && pattern[p] == '*') ++p;
  return p == pattern.size();
}

// Any of the "|"-separated alternatives matches; the caller has made sure none is empty.
bool anyAlternativeMatches(std::string_view name, std::string_view alternatives, bool foldCase) {
  while (true) {
    const size_t bar = alternatives.find('|');
    if (globMatches(name, alternatives.substr(0, bar), foldCase)) return true;
    if (bar == std::string_view::npos) return false;
    alternatives.remove_prefix(bar + 1);
  }
}

bool hasEmptyAlternative(std::string_view alternatives) {
  return alternatives.front() == '|' || alternatives.back() == '|' ||
         alternatives.find("||") != std::string_view::npos;
}

// The directive as a user writes it, without its closing "@": "@IFHAS", "@IFDEFAULT".
std::string directiveName(int index) {
  std::string name(keywordWord(index));
  if (name.back() == '@') name.pop_back();
  for (char& c : name)
    if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
  return name;
}

std::string matchKey(int kind, bool foldCase, std::string_view pattern) {
  std::string key = std::to_string(kind);
  key += foldCase ? 'f' : 'e';
  key += pattern;
  return key;
}

}  // namespace

bool Forge::doIf(std::string_view token, bool isIfHas) {
  trace("doIf() called: token=%.*s|Condition=%d\n", static_cast<int>(token.size()), token.data(),
        isIfHas ? 1 : 0);
  // A block inside a failed block is not evaluated, only counted, so that its @ENDIF@ pairs up.
  const int index = isIfHas ? kKwIfHas : kKwIfNHas;
  if (m_Conditions[m_ConditionalDepth] == 1) return addCondition(1, index);

  std::string_view rest = token;
  nextField(rest, " \t");
  const std::optional<std::string_view> signalType = nextField(rest, "=");
  const std::optional<std::string_view> signalName = nextField(rest, "@");
  if (!signalType || !signalName) {
    reportError(
        "Invalid syntax for @IFHAS or @IFNHAS directive, must be of the form:\n"
        "@IFHAS SIGNALTYPE=SIGNALNAME@");
    return true;
  }
  const int kind = lookupKeyword(makeVariableToken(*signalType));
  if (kind == kKwGeneric)
    return addCondition(hasMatchingGeneric(*signalName) == isIfHas ? 2 : 1, index);
  if (portKindFor(kind) == nullptr) {
    reportError(
        "Invalid syntax for @IFHAS or @IFNHAS directive, SIGNALTYPE must be one of:\n"
        "IPORT, OBPORT, OPORT, BPORT, PORT, NODE, SIGNAL.");
    return true;
  }
  const std::optional<bool> found = hasMatchingPort(kind, *signalName);
  if (!found) return true;
  return addCondition(*found == isIfHas ? 2 : 1, index);
}

std::optional<bool> Forge::hasMatchingPort(int kind, std::string_view pattern) {
  const PortKind& selection = *portKindFor(kind);
  const bool foldCase = !m_CaseSensitiveIf;
  // Only a pattern with a wildcard needs every name; any other names one entry of the index.
  if (pattern != "*" && pattern.find('?') == std::string_view::npos) {
    for (const PortRecord* port : portIndex().named(pattern, foldCase)) {
      if (widthUnknown(selection, *port)) return std::nullopt;
      if (selection.selects(port->m_Dir, port->isBus())) return true;
    }
    return false;
  }
  const std::string key = matchKey(kind, foldCase, pattern);
  if (const auto known = m_MatchResults.find(key); known != m_MatchResults.end())
    return known->second;
  bool found = false;
  for (const List_element* e = m_DataList->m_Head; e != nullptr && !found; e = e->m_Next) {
    const auto* port =
        static_cast<const PortRecord*>(static_cast<const Object_element*>(e)->m_Object);
    if (port == nullptr || !signalNameMatches(port->m_Name, pattern)) continue;
    if (widthUnknown(selection, *port)) return std::nullopt;
    found = selection.selects(port->m_Dir, port->isBus());
  }
  m_MatchResults.emplace(key, found);
  return found;
}

bool Forge::hasMatchingGeneric(std::string_view pattern) {
  const std::string key = matchKey(kKwGeneric, !m_CaseSensitiveIf, pattern);
  if (const auto known = m_MatchResults.find(key); known != m_MatchResults.end())
    return known->second;
  bool found = false;
  for (const GenericRecord& generic : m_DataList->m_Generics)
    if (signalNameMatches(generic.m_Name, pattern)) found = true;
  m_MatchResults.emplace(key, found);
  return found;
}

bool Forge::doIfPort(std::string_view token, bool isIfPort, const PortRecord* port) {
  trace("doIfPort() called: token=%.*s|Condition=%d\n", static_cast<int>(token.size()),
        token.data(), isIfPort ? 1 : 0);
  const int index = isIfPort ? kKwIfPort : kKwIfNPort;
  if (m_Conditions[m_ConditionalDepth] == 1) return addCondition(1, index);
  if (port == nullptr) {
    reportError("@IFPORT and @IFNPORT may only occur inside an @ITERATE@ over ports.");
    return true;
  }
  std::string_view rest = token;
  nextField(rest, " \t");
  const std::optional<std::string_view> pattern = nextField(rest, " \t\r\n@");
  if (!pattern || rest.find_first_not_of(" \t\r\n@") != std::string_view::npos) {
    reportError(
        "Invalid syntax for @IFPORT or @IFNPORT directive, must be of the form:\n"
        "@IFPORT PATTERN@");
    return true;
  }
  if (hasEmptyAlternative(*pattern)) {
    reportError(
        "Invalid syntax for @IFPORT or @IFNPORT directive, an alternative is empty:\n"
        "@IFPORT PATTERN|PATTERN@");
    return true;
  }
  const bool matches = anyAlternativeMatches(port->m_Name, *pattern, !m_CaseSensitiveIf);
  return addCondition(matches == isIfPort ? 2 : 1, index);
}

namespace {

/// The kind names of @IFKIND, in PortTypeKind's order.
constexpr std::string_view kKindNames[] = {"bit",   "vector", "integer",   "record",
                                           "array", "enum",   "interface", "other"};

std::optional<PortTypeKind> kindNamed(std::string_view name) {
  for (size_t i = 0; i < std::size(kKindNames); ++i) {
    const std::string_view known = kKindNames[i];
    if (name.size() != known.size()) continue;
    bool same = true;
    for (size_t c = 0; c < name.size() && same; ++c) same = (name[c] | 0x20) == known[c];
    if (same) return static_cast<PortTypeKind>(i);
  }
  return std::nullopt;
}

}  // namespace

bool Forge::doIfKind(std::string_view token, bool isIfKind, const PortRecord* port) {
  trace("doIfKind() called: token=%.*s|Condition=%d\n", static_cast<int>(token.size()),
        token.data(), isIfKind ? 1 : 0);
  const int index = isIfKind ? kKwIfKind : kKwIfNKind;
  if (m_Conditions[m_ConditionalDepth] == 1) return addCondition(1, index);
  if (port == nullptr) {
    reportError("@IFKIND and @IFNKIND may only occur inside an @ITERATE@ over ports.");
    return true;
  }
  std::string_view rest = token;
  nextField(rest, " \t");
  const std::optional<std::string_view> kinds = nextField(rest, " \t\r\n@");
  bool matches = false;
  bool valid = kinds.has_value() && rest.find_first_not_of(" \t\r\n@") == std::string_view::npos;
  for (std::string_view list = kinds.value_or(""); valid;) {
    const size_t bar = list.find('|');
    const std::optional<PortTypeKind> kind = kindNamed(list.substr(0, bar));
    valid = kind.has_value();
    matches = matches || (valid && *kind == port->m_Kind);
    if (bar == std::string_view::npos) break;
    list.remove_prefix(bar + 1);
  }
  if (!valid) {
    reportError(
        "Invalid syntax for @IFKIND or @IFNKIND directive, must be of the form:\n"
        "@IFKIND KIND|KIND@ with KIND one of bit, vector, integer, record, array, enum, "
        "interface, other");
    return true;
  }
  return addCondition(matches == isIfKind ? 2 : 1, index);
}

bool Forge::doIfDeclared(int index, const PortRecord* port) {
  const std::string_view word = keywordWord(index);
  trace("doIfDeclared() called: token=%.*s\n", static_cast<int>(word.size()), word.data());
  if (m_Conditions[m_ConditionalDepth] == 1) return addCondition(1, index);
  const bool asksDefault = index == kKwIfDefault || index == kKwIfNDefault;
  const bool negated = index == kKwIfNDefault || index == kKwIfNTyped;
  bool present = false;
  if (m_CurrentGeneric != nullptr) {
    present = !(asksDefault ? m_CurrentGeneric->m_Default : m_CurrentGeneric->m_Type).empty();
  } else if (port != nullptr && !asksDefault) {
    present = !port->m_DeclaredType.empty();
  } else {
    reportError(asksDefault ? "@IFDEFAULT@ and @IFNDEFAULT@ may only occur inside an "
                              "@ITERATE@%GENERIC% body."
                            : "@IFTYPED@ and @IFNTYPED@ may only occur inside an @ITERATE@ "
                              "over ports or generics.");
    return true;
  }
  return addCondition(present != negated ? 2 : 1, index);
}

bool Forge::addCondition(uint32_t value, int index) {
  trace("addCondition() called: condition=%d\n", static_cast<int>(value));
  if (m_ConditionalDepth == kMaxConditionalDepth) {
    reportError("Maximum number of nested @IFHAS or @IFNHAS directives exceeded.");
    return true;
  }
  ++m_ConditionalDepth;
  m_Conditions[m_ConditionalDepth] = value;
  m_ConditionWords[m_ConditionalDepth] = index;
  m_ConditionLines[m_ConditionalDepth] = m_Reader.line();
  return false;
}

void Forge::warnAboutOpenBlock() {
  if (m_ConditionalDepth == 0) return;
  // The outermost open block is named: from it on, the @ENDIF@s fall short.
  std::string warning = "template ";
  warning += m_TemplateName;
  warning += ": ";
  warning += directiveName(m_ConditionWords[1]);
  warning += " at line ";
  warning += std::to_string(m_ConditionLines[1]);
  // Blocks inside a failed one are failed too, so the innermost tells whether text was lost.
  warning += m_Conditions[m_ConditionalDepth] == 1
                 ? " is never closed; the rest of the template was dropped"
                 : " is never closed; the rest of the template was kept";
  m_Warnings.push_back(std::move(warning));
}

bool Forge::doEndIf() {
  trace("doEndIf() called: m_ConditionalDepth=%d\n", static_cast<int>(m_ConditionalDepth));
  if (m_ConditionalDepth == 0) {
    reportError("@ENDIF@ directive encountered without a matching @IFHAS or @IFNHAS.");
    return true;
  }
  --m_ConditionalDepth;
  return false;
}

bool Forge::signalNameMatches(std::string_view name, std::string_view pattern) const {
  if (pattern == "*") return true;
  std::string resolved(pattern);
  const size_t common = name.size() < resolved.size() ? name.size() : resolved.size();
  for (size_t i = 0; i < common; ++i) {
    if (resolved[i] == '?') resolved[i] = name[i];
  }
  return compareBytes(name, resolved, !m_CaseSensitiveIf) == 0;
}
