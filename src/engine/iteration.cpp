// TEMPORARY STUB - being replaced by the real handlers.
#include "engine/forge.h"

namespace {
[[maybe_unused]] bool notYet(const char*) { return true; }
}  // namespace

PortRecord* Forge::selectPort(int, bool) { return nullptr; }
bool Forge::writePortList(int, TokList*) { return notYet("port lists"); }
bool Forge::eatIterate() { return notYet("@ITERATE@"); }
bool Forge::doIterate(int, TokList*) { return notYet("@ITERATE@"); }
