// The VHDL side of the port extractor: indexes every file, finds an entity ignoring case and
// describes it: its generics, its ports with declared types and evaluated ranges, and its
// context clause.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "scan/language_reader.h"
#include "scan/vhdl/vhdl_describe.h"
#include "scan/vhdl/vhdl_design.h"
#include "scan/vhdl/vhdl_eval.h"
#include "scan/vhdl/vhdl_index.h"

namespace scan::vhdl {

class VhdlReader final : public LanguageReader {
 public:
  explicit VhdlReader(Diagnostics& diagnostics, ScanSettings settings = {})
      : m_Diagnostics(diagnostics),
        m_Settings(std::move(settings)),
        m_Index(diagnostics),
        m_Design(m_Index, diagnostics),
        m_Evaluator(m_Design),
        m_Describer(m_Design, m_Evaluator, diagnostics) {}

  void indexFiles(const std::vector<DesignFileEntry>& files) override;
  /// Indexes text already in memory as part of `library`.
  void indexSource(std::unique_ptr<SourceBuffer> source, std::string_view library);
  bool selectUnit(std::string_view library, std::string_view unit) override;
  bool readUnit(UnitDescription& unit) override;
  std::vector<ScanUnitInfo> listUnits() const override;

  const DesignIndex& index() const { return m_Index; }

 private:
  ScanPort readPort(UnitScope& entity, const Decl& decl, const InterfaceText* text, int line);
  std::string contextOf(const UnitRecord& unit) const;

  Diagnostics& m_Diagnostics;
  ScanSettings m_Settings;
  DesignIndex m_Index;
  Design m_Design;
  Evaluator m_Evaluator;
  Describer m_Describer;
  const UnitRecord* m_Selected = nullptr;
  const UnitScope* m_OverridesApplied = nullptr;
};

}  // namespace scan::vhdl
