// TEMPORARY STUB - being replaced by the real handlers.
#include "engine/forge.h"

namespace {
[[maybe_unused]] bool notYet(const char*) { return true; }
}  // namespace

std::unique_ptr<ExpansionList> Forge::expandBus(const PortRecord&) const { return std::make_unique<ExpansionList>(); }
std::string Forge::formatPort(const PortRecord& port) const { return port.m_Name; }
