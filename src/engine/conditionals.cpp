// @IFHAS / @IFNHAS / @IFPORT / @IFNPORT / @ENDIF@: keeping or dropping a stretch of template
// depending on whether the design has a port of a kind (or a generic) whose name matches a
// pattern, or on the name of the current port of an iteration; blocks nest on a small stack.
#include <string>

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
  if (m_Conditions[m_ConditionalDepth] == 1) return addCondition(1);

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
  if (kind == kKwGeneric) return addCondition(hasMatchingGeneric(*signalName) == isIfHas ? 2 : 1);
  if (portKindFor(kind) == nullptr) {
    reportError(
        "Invalid syntax for @IFHAS or @IFNHAS directive, SIGNALTYPE must be one of:\n"
        "IPORT, OBPORT, OPORT, BPORT, PORT, NODE, SIGNAL.");
    return true;
  }
  const std::optional<bool> found = hasMatchingPort(kind, *signalName);
  if (!found) return true;
  return addCondition(*found == isIfHas ? 2 : 1);
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
    if (port == nullptr || compareSignalName(port->m_Name, pattern) != 0) continue;
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
    if (compareSignalName(generic.m_Name, pattern) == 0) found = true;
  m_MatchResults.emplace(key, found);
  return found;
}

bool Forge::doIfPort(std::string_view token, bool isIfPort, const PortRecord* port) {
  trace("doIfPort() called: token=%.*s|Condition=%d\n", static_cast<int>(token.size()),
        token.data(), isIfPort ? 1 : 0);
  if (m_Conditions[m_ConditionalDepth] == 1) return addCondition(1);
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
  const bool matches = globMatches(port->m_Name, *pattern, !m_CaseSensitiveIf);
  return addCondition(matches == isIfPort ? 2 : 1);
}

bool Forge::addCondition(uint32_t value) {
  trace("addCondition() called: condition=%d\n", static_cast<int>(value));
  if (m_ConditionalDepth == kMaxConditionalDepth) {
    reportError("Maximum number of nested @IFHAS or @IFNHAS directives exceeded.");
    return true;
  }
  ++m_ConditionalDepth;
  m_Conditions[m_ConditionalDepth] = value;
  return false;
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

int Forge::compareSignalName(std::string_view name, std::string_view pattern) const {
  if (pattern == "*") return 0;
  std::string resolved(pattern);
  const size_t common = name.size() < resolved.size() ? name.size() : resolved.size();
  for (size_t i = 0; i < common; ++i) {
    if (resolved[i] == '?') resolved[i] = name[i];
  }
  return compareBytes(name, resolved, !m_CaseSensitiveIf);
}
