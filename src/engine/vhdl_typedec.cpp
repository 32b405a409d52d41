// TEMPORARY STUB - being replaced by the real handlers.
#include "engine/forge.h"

namespace {
[[maybe_unused]] bool notYet(const char*) { return true; }
}  // namespace

bool Forge::doVhdlTypeDec(const PortRecord&) { return notYet("@VHDL_TYPEDEC@"); }
