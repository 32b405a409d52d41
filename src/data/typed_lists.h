// The typed lists of the program: the run's design data and the tokens of one @ITERATE@ body.
// Each owns its objects.
#pragma once

#include <string>
#include <vector>

#include "data/list.h"
#include "data/port_record.h"

/// The language the design unit is written in; it decides the words a template writes for it.
enum class DesignLanguage { Vhdl, Verilog };

/// One generic (VHDL) or parameter (Verilog/SV) of the design unit.
struct GenericRecord {
  std::string m_Name;
  /// Declared type as written; empty for an untyped parameter.
  std::string m_Type;
  /// Default expression as written; empty when there is none.
  std::string m_Default;
  /// The value a template writes for it; empty when there is none.
  std::string m_Value;
};

/// The design data of one run: the ports in extraction order, eight header values, and the
/// unit's language, generics and context.
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

  DesignLanguage m_Language = DesignLanguage::Vhdl;
  /// In declaration order.
  std::vector<GenericRecord> m_Generics;
  /// The unit's context clause or package imports, one per line; empty when there is none.
  std::string m_Context;
};

/// The tokens of one @ITERATE@ body, in template order.
class TokList : public OwningObjectList<TokEntry> {};
