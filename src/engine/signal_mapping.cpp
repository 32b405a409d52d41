// @MAPSIGNAL: gives the first port with a declared name a second name, under which it is
// written while map is on.
#include "engine/forge.h"
#include "engine/keyword_table.h"
#include "engine/token_fields.h"

bool Forge::doMapSignal(std::string_view token) {
  trace("doMapSignal() called: token=%.*s\n", static_cast<int>(token.size()), token.data());
  std::string_view rest = token;
  nextField(rest, " \t");
  const std::optional<std::string_view> oldName = nextField(rest, " \t");
  nextField(rest, " \t");  // the connecting word, "TO" by convention, is not checked
  const std::optional<std::string_view> newName = nextField(rest, "@");
  if (!oldName || !newName) {
    reportError(
        "Invalid syntax for @MAPSIGNAL directive, must be of the form: @MAPSIGNAL OLDNAME TO "
        "NEWNAME@");
    return true;
  }
  // The index sees a bus as one record even while expandbus is on, so the mapping lands on
  // the bus itself and reaches every expansion of it made from now on.
  const PortKind& anyPort = *portKindFor(kKwSignal);
  PortRecord* port = nullptr;
  for (PortRecord* candidate : portIndex().named(*oldName, false)) {
    if (anyPort.selects(candidate->m_Dir, candidate->isBus())) {
      port = candidate;
      break;
    }
  }
  if (port != nullptr) {
    port->setMappedName(*newName);
    trace("doMapSignal() mapped: %.*s to %.*s\n", static_cast<int>(oldName->size()),
          oldName->data(), static_cast<int>(newName->size()), newName->data());
  }
  return false;
}
