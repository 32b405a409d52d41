// @IFHAS / @IFNHAS / @ENDIF@: keeping or dropping a stretch of template depending on whether
// the design has a port of a kind whose name matches a pattern; blocks nest on a small stack.
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
  if (portKindFor(kind) == nullptr) {
    reportError(
        "Invalid syntax for @IFHAS or @IFNHAS directive, SIGNALTYPE must be one of:\n"
        "IPORT, OBPORT, OPORT, BPORT, PORT, NODE, SIGNAL.");
    return true;
  }
  PortRecord* port = searchPort(kind, true);
  while (port != nullptr && compareSignalName(port->m_Name, *signalName) != 0)
    port = searchPort(kind, false);
  const bool found = port != nullptr;
  return addCondition(found == isIfHas ? 2 : 1);
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
