#include "data/typed_lists.h"

namespace {
std::string copyOrEmpty(const char* text) { return text != nullptr ? text : ""; }
}  // namespace

StbDataList::StbDataList(const char* project, const char* module, const char* fileName,
                         const char* ext, const char* tool, const char* ver, const char* title,
                         const char* date)
    : m_Project(copyOrEmpty(project)),
      m_Module(copyOrEmpty(module)),
      m_FileName(copyOrEmpty(fileName)),
      m_Ext(copyOrEmpty(ext)),
      m_Tool(copyOrEmpty(tool)),
      m_Ver(copyOrEmpty(ver)),
      m_Title(copyOrEmpty(title)),
      m_Date(copyOrEmpty(date)) {}
