// Port-list variables and @ITERATE@: the walk over the ports of one kind (handing out a bus as
// its bits while expandbus is on), the delimited listing, the collection of an iteration body
// and its replay once per port.
#include "engine/forge.h"
#include "engine/keyword_table.h"

namespace {

PortRecord* portOf(List_element* element) {
  return static_cast<PortRecord*>(static_cast<Object_element*>(element)->m_Object);
}

}  // namespace

PortRecord* Forge::selectPort(int kind, bool restart) {
  const PortKind* selection = portKindFor(kind);
  if (selection == nullptr) return nullptr;
  if (restart) {
    m_Expansion.reset();
    m_SelectedPort = m_DataList->m_Head;
  } else {
    if (m_Expansion != nullptr) {
      if (PortRecord* bit = m_Expansion->next()) return bit;
      m_Expansion.reset();
    }
    if (m_SelectedPort == nullptr) return nullptr;
    m_SelectedPort = m_SelectedPort->m_Next;
  }
  for (; m_SelectedPort != nullptr; m_SelectedPort = m_SelectedPort->m_Next) {
    const PortRecord& candidate = *portOf(m_SelectedPort);
    if (widthUnknown(*selection, candidate)) {
      m_SelectedPort = nullptr;
      return nullptr;
    }
    if (selection->selects(candidate.m_Dir, candidate.isBus())) break;
  }
  if (m_SelectedPort == nullptr) return nullptr;
  PortRecord* port = portOf(m_SelectedPort);
  if (m_ExpandBus && port->isRangeUnknown()) {
    reportRangeError(*port);
    m_SelectedPort = nullptr;
    return nullptr;
  }
  if (m_ExpandBus && port->isBus()) {
    m_Expansion = expandBus(*port);
    return m_Expansion->first();
  }
  return port;
}

bool Forge::widthUnknown(const PortKind& selection, const PortRecord& port) {
  if (selection.filter == WidthFilter::Any || !port.isRangeUnknown()) return false;
  if (selection.letters.find(port.m_Dir) == std::string_view::npos) return false;
  reportRangeError(port);
  return true;
}

PortIndex& Forge::portIndex() {
  if (!m_PortIndex) m_PortIndex = std::make_unique<PortIndex>(*m_DataList);
  return *m_PortIndex;
}

bool Forge::writePortList(int kind, TokList* list) {
  if (list != nullptr) {
    reportError(
        "Variables: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL% are not valid "
        "within @ITERATE@");
    return true;
  }
  PortRecord* port = selectPort(kind, true);
  if (port == nullptr) return failed();
  if (rangeNeeded(*port) || writeText(formatPort(*port), false)) return true;
  while ((port = selectPort(kind, false)) != nullptr) {
    if (writeText(m_SigDelim, false)) return true;
    if (rangeNeeded(*port) || writeText(formatPort(*port), false)) return true;
  }
  return failed();
}

bool Forge::eatIterate() {
  if (m_Iterating) {
    // The body would otherwise be read from the template text after the outer body.
    reportError("@ITERATE@ may not occur inside an @ITERATE@ body.");
    return true;
  }
  std::string_view iterator;
  if (!readToken(iterator)) return true;
  const int kind = lookupKeyword(iterator);
  trace("eatIterate() Iterator=%.*s\n", static_cast<int>(iterator.size()), iterator.data());
  if (kind != kKwGeneric && portKindFor(kind) == nullptr) {
    reportError("Iterator must be one of: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL%");
    return true;
  }
  TokList body;
  std::string_view token;
  if (!readToken(token)) return true;
  while (!m_Reader.atEnd()) {
    if (lookupKeyword(token) == kKwEndIterate) break;
    trace("eatIterate() eating szToken=%.*s\n", static_cast<int>(token.size()), token.data());
    body.appendOwned(new TokEntry(token));
    if (!readToken(token)) return true;
  }
  if (m_Reader.atEnd()) {
    reportError("@ITERATE@ must be terminated by @ENDITERATE@!");
    return true;
  }
  if (kind == kKwGeneric) return doIterateGenerics(&body);
  return doIterate(kind, &body);
}

bool Forge::doIterate(int kind, TokList* list) {
  PortRecord* port = selectPort(kind, true);
  if (port == nullptr) return failed();
  m_Iterating = true;
  bool stop = false;
  while (true) {
    trace("doIterate() Iterating for signal=%.*s\n", static_cast<int>(port->m_Name.size()),
          port->m_Name.data());
    for (TokEntry* entry = list->first(); entry != nullptr; entry = list->next()) {
      if (doToken(entry->m_Text, list, port)) {
        stop = true;
        break;
      }
    }
    port = selectPort(kind, false);
    if (port == nullptr) {
      stop = stop || failed();
      break;
    }
    // A stopped pass still separates itself from the port that would have followed.
    if (writeText(m_SigDelim, false)) {
      stop = true;
      break;
    }
    if (stop) break;
  }
  m_Iterating = false;
  return stop;
}
