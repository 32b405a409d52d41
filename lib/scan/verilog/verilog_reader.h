// The Verilog/SystemVerilog reader behind the extractor: the index pass over all files as one
// compilation unit, then the selected unit's description on demand: its parameters (with the
// command line's overrides), ports, declared types and package imports.
#pragma once

#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "scan/language_reader.h"
#include "scan/verilog/verilog_index.h"
#include "scan/verilog/verilog_macros.h"
#include "scan/verilog/verilog_scope.h"
#include "scan/verilog/verilog_sources.h"

namespace scan::verilog {

class Evaluator;
class UnitReader;
struct UnitModel;

class VerilogReader final : public LanguageReader, private ScopeProvider {
 public:
  explicit VerilogReader(Diagnostics& diagnostics, ScanSettings settings = {});
  ~VerilogReader() override;

  void indexFiles(const std::vector<DesignFileEntry>& files) override;
  /// Indexes in-memory text as the next file of the compilation unit (fuzzing, tests).
  void indexText(std::string path, std::string text, const std::string& library);
  bool selectUnit(std::string_view library, std::string_view unit) override;
  bool readUnit(UnitDescription& unit) override;
  std::vector<ScanUnitInfo> listUnits() const override;

 private:
  Scope* package(const std::string& name) override;
  Scope* compilationUnit() override;
  void prepare(std::vector<std::string> designDirectories);
  void defineMacros();
  bool applyOverrides(UnitModel& model, UnitReader& reader);
  std::vector<ScanGeneric> describeParameters(UnitModel& model, Evaluator& evaluator);
  std::vector<std::string> missingPackages(const UnitModel& model);
  std::string context(const UnitModel& model, UnitReader& reader);

  Diagnostics& m_Diagnostics;
  ScanSettings m_Settings;
  MacroTable m_Macros;
  std::unique_ptr<SourceStore> m_Sources;
  std::unique_ptr<DesignIndex> m_Index;
  std::vector<std::string> m_Libraries;
  std::unordered_map<std::string, std::unique_ptr<Scope>> m_Packages;
  std::unique_ptr<Scope> m_CompilationUnit;
  const UnitRecord* m_Selected = nullptr;
};

}  // namespace scan::verilog
