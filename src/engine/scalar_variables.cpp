// The header-value variables (%module%, %date%, ...) and the case conversion that the case
// mode applies to every value and port text the processor writes.
#include "engine/forge.h"
#include "engine/keyword_table.h"

namespace {

bool isUpper(char c) { return c >= 'A' && c <= 'Z'; }
bool isLower(char c) { return c >= 'a' && c <= 'z'; }
char toLower(char c) { return isUpper(c) ? static_cast<char>(c - 'A' + 'a') : c; }
char toUpper(char c) { return isLower(c) ? static_cast<char>(c - 'a' + 'A') : c; }

}  // namespace

bool Forge::writeScalarVariable(int index) {
  const StbDataList& data = *m_DataList;
  const std::string* value = &data.m_Ver;
  switch (index) {
    case kKwDate:
      value = &data.m_Date;
      break;
    case kKwDesign:
    case kKwProject:
      value = &data.m_Project;
      break;
    case kKwExt:
      value = &data.m_Ext;
      break;
    case kKwFileName:
      value = &data.m_FileName;
      break;
    case kKwModule:
      value = &data.m_Module;
      break;
    case kKwTitle:
      value = &data.m_Title;
      break;
    case kKwTool:
      value = &data.m_Tool;
      break;
    default:
      break;
  }
  std::string copy = *value;
  return writeText(applyCase(copy), false);
}

std::string& Forge::applyCase(std::string& text) const {
  switch (m_Case) {
    case INVCASE:
      return invertCase(text);
    case LOWCASE:
      for (char& c : text) c = toLower(c);
      return text;
    case UPCASE:
      for (char& c : text) c = toUpper(c);
      return text;
    default:
      return text;
  }
}

std::string& Forge::invertCase(std::string& text) {
  for (char& c : text) c = isUpper(c) ? toLower(c) : toUpper(c);
  return text;
}
