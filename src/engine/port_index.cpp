// One hash table per case rule, filled the first time that rule is asked for.
#include "engine/port_index.h"

namespace {

std::string folded(std::string_view text) {
  std::string result(text);
  for (char& c : result)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return result;
}

const std::vector<PortRecord*> kNoPorts;

}  // namespace

void PortIndex::build(Table& table, bool foldCase) {
  for (const List_element* e = m_Data.m_Head; e != nullptr; e = e->m_Next) {
    auto* port = static_cast<PortRecord*>(static_cast<const Object_element*>(e)->m_Object);
    if (port == nullptr) continue;
    table[foldCase ? folded(port->m_Name) : port->m_Name].push_back(port);
  }
}

const std::vector<PortRecord*>& PortIndex::named(std::string_view name, bool foldCase) {
  Table& table = foldCase ? m_Folded : m_Exact;
  bool& built = foldCase ? m_FoldedBuilt : m_ExactBuilt;
  if (!built) {
    build(table, foldCase);
    built = true;
  }
  const auto found = table.find(foldCase ? folded(name) : std::string(name));
  return found != table.end() ? found->second : kNoPorts;
}
