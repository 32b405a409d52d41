// The typed lists of the program: the run's design data and the tokens of one @ITERATE@ body.
// Each owns its objects.
#pragma once

#include <string>

#include "data/list.h"
#include "data/port_record.h"

/// The design data of one run: the ports in extraction order and eight header values.
class StbDataList : public OwningObjectList<PortRecord> {
 public:
  /// Copies the eight header values; a null value is stored as empty text.
  StbDataList(const char* project, const char* module, const char* fileName, const char* ext,
              const char* tool, const char* ver, const char* title, const char* date);

  std::string m_Project;
  std::string m_Module;
  std::string m_FileName;
  std::string m_Ext;
  std::string m_Tool;
  std::string m_Ver;
  std::string m_Title;
  std::string m_Date;
};

/// The tokens of one @ITERATE@ body, in template order.
class TokList : public OwningObjectList<TokEntry> {};
