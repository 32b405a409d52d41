// The main loop and the dispatcher: every token of the template goes through doToken, which
// drops it inside a failed conditional, copies plain text, and hands keywords to their
// handlers (acting on the fixed characters and flag directives itself).
#include "engine/forge.h"
#include "engine/keyword_table.h"

bool Forge::processTemplate() {
  bool stop = false;
  std::string_view token;
  if (!readToken(token)) return false;
  while (!m_Reader.atEnd()) {
    if (doToken(token, nullptr, nullptr)) {
      stop = true;
      break;
    }
    if (!readToken(token)) return false;
  }
  // The read that met the end still returned a token (often empty); it is handled too.
  if (!stop) stop = doToken(m_Reader.current(), nullptr, nullptr);
  if (!stop) warnAboutOpenBlock();
  return !stop;
}

bool Forge::readToken(std::string_view& token) {
  const int32_t startLine = m_Reader.line();
  token = m_Reader.nextToken();
  if (!m_Reader.tooLong()) return true;
  std::string message = "Token: the token that starts on line ";
  message += std::to_string(startLine);
  message += " is longer than the limit of ";
  message += std::to_string(TokenReader::kMaxTokenSize);
  message += " bytes (16 MB).";
  reportError(message);
  return false;
}

bool Forge::doToken(std::string_view token, TokList* list, PortRecord* port) {
  const int size = static_cast<int>(token.size());
  trace("doToken() called: szToken=%.*s|pTokList=%d\n", size, token.data(),
        list != nullptr ? 1 : 0);

  if (m_Conditions[m_ConditionalDepth] == 1) {
    trace("doToken() processing token=%.*s| with condition test failed.\n", size, token.data());
    if (token.empty() || token[0] != '@') return false;
    const int index = lookupKeyword(token);
    switch (index) {
      case kKwIfHas:
        return doIf(token, true);
      case kKwIfNHas:
        return doIf(token, false);
      case kKwIfPort:
        return doIfPort(token, true, port);
      case kKwIfNPort:
        return doIfPort(token, false, port);
      case kKwIfKind:
        return doIfKind(token, true, port);
      case kKwIfNKind:
        return doIfKind(token, false, port);
      case kKwIfDefault:
      case kKwIfNDefault:
      case kKwIfNTyped:
      case kKwIfTyped:
        return doIfDeclared(index, port);
      case kKwEndIf:
        return doEndIf();
      default:
        return false;
    }
  }

  const int index = lookupKeyword(token);
  if (index == kKwPlainText) return writeText(token, m_SuppresNewLine);
  if (index == kKwNoMatch) {
    std::string message = "Keyword: ";
    message += token;
    message += " is not a valid Variable or Directive name.";
    reportError(message);
    return true;
  }
  if (isScalarVariable(index)) return writeScalarVariable(index);
  if (portKindFor(index) != nullptr) return writePortList(index, list);

  const bool replaying = list != nullptr && port != nullptr;
  switch (index) {
    case kKwContext:
      return writeContext();
    case kKwGeneric:
      return writeGenericList();
    case kKwGenericDefault:
    case kKwGenericType:
    case kKwGenericValue:
      return writeGenericField(index);
    case kKwIfPort:
      return doIfPort(token, true, port);
    case kKwIfNPort:
      return doIfPort(token, false, port);
    case kKwIfKind:
      return doIfKind(token, true, port);
    case kKwIfNKind:
      return doIfKind(token, false, port);
    case kKwIfDefault:
    case kKwIfNDefault:
    case kKwIfNTyped:
    case kKwIfTyped:
      return doIfDeclared(index, port);
    case kKwPortMode:
    case kKwPortType:
      if (!replaying) {
        reportError(index == kKwPortMode
                        ? "@PORT_MODE@ may only occur inside an @ITERATE@ over ports."
                        : "@PORT_TYPE@ may only occur inside an @ITERATE@ over ports.");
        return true;
      }
      return index == kKwPortMode ? writePortMode(*port) : writePortType(*port);
    case kKwAt:
      return writeText("@", false);
    case kKwComment:
      return false;
    case kKwCr:
      return writeText("\n", false);
    case kKwEndIf:
      return doEndIf();
    case kKwEndIterate:
      reportError("@ENDITERATE@ keyword encountered without a matching @ITERATE@.");
      return true;
    case kKwExpandBus:
      m_ExpandBus = true;
      return false;
    case kKwIfHas:
      return doIf(token, true);
    case kKwIfNHas:
      return doIf(token, false);
    case kKwInvCase:
      m_Case = INVCASE;
      return false;
    case kKwIterate:
      return eatIterate();
    case kKwIterator:
      if (m_CurrentGeneric != nullptr) {
        std::string name = m_CurrentGeneric->m_Name;
        return writeText(applyCase(name), false);
      }
      if (!replaying) {
        reportError("@ITERATOR@ may not occur outside of an @ITERATE@.");
        return true;
      }
      return rangeNeeded(*port) || writeText(formatPort(*port), false);
    case kKwLowCase:
      m_Case = LOWCASE;
      return false;
    case kKwMap:
      m_Map = true;
      return false;
    case kKwMapSignal:
      return doMapSignal(token);
    case kKwNoExpandBus:
      m_ExpandBus = false;
      return false;
    case kKwNoMap:
      m_Map = false;
      return false;
    case kKwNoShowRange:
      m_ShowRange = false;
      return false;
    case kKwNoSuppresNewLine:
      m_SuppresNewLine = false;
      return false;
    case kKwPercent:
      return writeText("%", false);
    case kKwSameCase:
      m_Case = SAMECASE;
      return false;
    case kKwSet:
      return doSet(token);
    case kKwShowRange:
      m_ShowRange = true;
      return false;
    case kKwSuppresNewLine:
      m_SuppresNewLine = true;
      return false;
    case kKwTab:
      return writeText("\t", false);
    case kKwUpCase:
      m_Case = UPCASE;
      return false;
    case kKwVhdlTypeDec:
      if (m_CurrentGeneric != nullptr) {
        reportError("@VHDL_TYPEDEC@ may only occur inside an @ITERATE@ over ports.");
        return true;
      }
      if (!replaying) {
        reportError("@VHDL_TYPEDEC@ may not occur outside of an @ITERATE@.");
        return true;
      }
      return doVhdlTypeDec(*port);
    default:
      return false;
  }
}
