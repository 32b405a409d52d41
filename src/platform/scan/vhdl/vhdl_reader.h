// The VHDL side of the port extractor: indexes every file, finds an entity ignoring case and
// reports its ports with evaluated ranges.
#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "platform/scan/language_reader.h"
#include "platform/scan/vhdl/vhdl_design.h"
#include "platform/scan/vhdl/vhdl_eval.h"
#include "platform/scan/vhdl/vhdl_index.h"

namespace scan::vhdl {

class VhdlReader final : public LanguageReader {
 public:
  explicit VhdlReader(Diagnostics& diagnostics)
      : m_Diagnostics(diagnostics), m_Index(diagnostics), m_Design(m_Index, diagnostics),
        m_Evaluator(m_Design) {}

  void indexFiles(const std::vector<DesignFileEntry>& files) override;
  /// Indexes text already in memory as part of `library`.
  void indexSource(std::unique_ptr<SourceBuffer> source, std::string_view library);
  bool selectUnit(std::string_view library, std::string_view unit) override;
  bool readUnit(UnitDescription& unit) override;
  std::vector<ScanUnitInfo> listUnits() const override;

  const DesignIndex& index() const { return m_Index; }

 private:
  Diagnostics& m_Diagnostics;
  DesignIndex m_Index;
  Design m_Design;
  Evaluator m_Evaluator;
  const UnitRecord* m_Selected = nullptr;
};

}  // namespace scan::vhdl
