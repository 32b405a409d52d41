// The unit's generics (VHDL) or parameters (Verilog) and its context: the delimited name list,
// the iteration over them with the words that write a generic's type, default and value, and
// the context text.
#include <string>

#include "engine/forge.h"

bool Forge::writeGenericList() {
  bool first = true;
  for (const GenericRecord& generic : m_DataList->m_Generics) {
    if (!first && writeText(m_SigDelim, false)) return true;
    first = false;
    std::string name = generic.m_Name;
    if (writeText(applyCase(name), false)) return true;
  }
  return false;
}

bool Forge::doIterateGenerics(TokList* list) {
  const std::vector<GenericRecord>& generics = m_DataList->m_Generics;
  m_Iterating = true;
  bool stop = false;
  for (size_t i = 0; i < generics.size() && !stop; ++i) {
    m_CurrentGeneric = &generics[i];
    trace("doIterate() Iterating for generic=%.*s\n",
          static_cast<int>(m_CurrentGeneric->m_Name.size()), m_CurrentGeneric->m_Name.data());
    for (TokEntry* entry = list->first(); entry != nullptr && !stop; entry = list->next())
      stop = doToken(entry->m_Text, list, nullptr);
    if (!stop && i + 1 < generics.size()) stop = writeText(m_SigDelim, false);
  }
  m_CurrentGeneric = nullptr;
  m_Iterating = false;
  return stop;
}

bool Forge::writeGenericField(int index) {
  if (m_CurrentGeneric == nullptr) {
    std::string message(keywordWord(index));
    for (char& c : message)
      if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
    message += " may only occur inside an @ITERATE@%GENERIC% body.";
    reportError(message);
    return true;
  }
  switch (index) {
    case kKwGenericType:
      return writeText(m_CurrentGeneric->m_Type, false);
    case kKwGenericDefault:
      return writeText(m_CurrentGeneric->m_Default, false);
    default:
      if (m_CurrentGeneric->m_Value.empty()) {
        reportValueError(*m_CurrentGeneric);
        return true;
      }
      return writeText(m_CurrentGeneric->m_Value, false);
  }
}

bool Forge::writeContext() { return writeText(m_DataList->m_Context, false); }
