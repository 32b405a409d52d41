// Macro definitions are shared, immutable objects: the live table, the change log and any
// expansion in progress can all hold the same one.
#include "scan/verilog/verilog_macros.h"

namespace scan::verilog {

std::shared_ptr<const Macro> MacroTable::find(std::string_view name) const {
  auto it = m_Map.find(name);
  return it == m_Map.end() ? nullptr : it->second;
}

void MacroTable::apply(const Change& change) {
  if (change.macro) {
    m_Map.insert_or_assign(change.name, change.macro);
  } else if (change.name.empty()) {
    m_Map.clear();
  } else {
    auto it = m_Map.find(std::string_view(change.name));
    if (it != m_Map.end()) m_Map.erase(it);
  }
}

void MacroTable::define(std::shared_ptr<const Macro> macro) {
  m_Log.push_back({macro->name, std::move(macro)});
  apply(m_Log.back());
}

void MacroTable::undefine(std::string_view name) {
  if (name.empty()) return;
  m_Log.push_back({std::string(name), nullptr});
  apply(m_Log.back());
}

void MacroTable::undefineAll() {
  m_Log.push_back({std::string(), nullptr});
  apply(m_Log.back());
}

MacroTable MacroTable::replay(size_t position) const {
  MacroTable table;
  table.advance(*this, 0, position);
  return table;
}

void MacroTable::advance(const MacroTable& source, size_t from, size_t to) {
  for (size_t i = from; i < to && i < source.m_Log.size(); ++i) apply(source.m_Log[i]);
}

}  // namespace scan::verilog
