// Port-list variables and @ITERATE@: the walk over the ports of one kind (handing out a bus as
// its bits while expandbus is on), the delimited listing, and the collection and replay of an
// iteration body once per port.
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
  while (m_SelectedPort != nullptr &&
         !selection->selects(portOf(m_SelectedPort)->m_Dir, portOf(m_SelectedPort)->isBus())) {
    m_SelectedPort = m_SelectedPort->m_Next;
  }
  if (m_SelectedPort == nullptr) return nullptr;
  PortRecord* port = portOf(m_SelectedPort);
  if (m_ExpandBus && port->isBus()) {
    m_Expansion = expandBus(*port);
    return m_Expansion->first();
  }
  return port;
}

PortRecord* Forge::searchPort(int kind, bool restart) {
  const PortKind* selection = portKindFor(kind);
  if (selection == nullptr) return nullptr;
  PortRecord* port = nullptr;
  if (restart) {
    port = m_DataList->first();
  } else if (m_DataList->hasCurrent()) {
    port = m_DataList->next();
  }
  while (port != nullptr && !selection->selects(port->m_Dir, port->isBus()))
    port = m_DataList->next();
  return port;
}

bool Forge::writePortList(int kind, TokList* list) {
  if (list != nullptr) {
    reportError(
        "Variables: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL% are not valid "
        "within @ITERATE@");
    return true;
  }
  PortRecord* port = selectPort(kind, true);
  if (port == nullptr) return false;
  if (writeText(formatPort(*port), false)) return true;
  while ((port = selectPort(kind, false)) != nullptr) {
    if (writeText(m_SigDelim, false)) return true;
    if (writeText(formatPort(*port), false)) return true;
  }
  return false;
}

bool Forge::eatIterate() {
  if (m_Iterating) {
    // The body would otherwise be read from the template text after the outer body.
    reportError("@ITERATE@ may not occur inside an @ITERATE@ body.");
    return true;
  }
  const std::string_view iterator = m_Reader.nextToken();
  const int kind = lookupKeyword(iterator);
  trace("eatIterate() Iterator=%.*s\n", static_cast<int>(iterator.size()), iterator.data());
  if (portKindFor(kind) == nullptr) {
    reportError("Iterator must be one of: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL%");
    return true;
  }
  TokList body;
  std::string_view token = m_Reader.nextToken();
  while (!m_Reader.atEnd()) {
    if (lookupKeyword(token) == kKwEndIterate) break;
    trace("eatIterate() eating szToken=%.*s\n", static_cast<int>(token.size()), token.data());
    body.appendOwned(new TokEntry(token));
    token = m_Reader.nextToken();
  }
  if (m_Reader.atEnd()) {
    reportError("@ITERATE@ must be terminated by @ENDITERATE@!");
    return true;
  }
  return doIterate(kind, &body);
}

bool Forge::doIterate(int kind, TokList* list) {
  PortRecord* port = selectPort(kind, true);
  if (port == nullptr) return false;
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
    if (port == nullptr) break;
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
