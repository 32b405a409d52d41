// TEMPORARY STUB - being replaced by the real handlers.
#include "engine/forge.h"

namespace {
[[maybe_unused]] bool notYet(const char*) { return true; }
}  // namespace

bool Forge::doIf(std::string_view, bool) { return notYet("@IFHAS"); }
bool Forge::doEndIf() { return notYet("@ENDIF@"); }
bool Forge::addCondition(uint32_t) { return notYet("@IFHAS"); }
int Forge::compareSignalName(std::string_view name, std::string_view pattern) const { return name.compare(pattern); }
