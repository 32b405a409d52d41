// Glue between the extractor's reader contract and the Verilog pieces: files are indexed in
// registration order (macros carry over), packages and the compilation-unit scope are read
// only when an expression first needs them.
#include "platform/scan/verilog/verilog_reader.h"

#include <algorithm>
#include <cstdlib>

#include "platform/scan/common/diagnostics.h"
#include "platform/scan/verilog/verilog_eval.h"
#include "platform/scan/verilog/verilog_ports.h"
#include "platform/scan/verilog/verilog_unit.h"

namespace scan::verilog {

VerilogReader::VerilogReader(Diagnostics& diagnostics) : m_Diagnostics(diagnostics) {}

VerilogReader::~VerilogReader() = default;

void VerilogReader::prepare(std::vector<std::string> designDirectories) {
  if (m_Index) return;
  const char* includePath = std::getenv("PINFORGE_INCLUDE");
  m_Sources = std::make_unique<SourceStore>(includePath ? includePath : "",
                                            std::move(designDirectories));
  m_Index = std::make_unique<DesignIndex>(m_Diagnostics, m_Macros, *m_Sources);
}

void VerilogReader::indexFiles(const std::vector<DesignFileEntry>& files) {
  std::vector<std::string> directories;
  for (const DesignFileEntry& file : files) {
    std::string dir = SourceStore::directoryOf(file.path);
    if (std::find(directories.begin(), directories.end(), dir) == directories.end())
      directories.push_back(dir);
  }
  prepare(std::move(directories));
  for (const DesignFileEntry& file : files) {
    if (std::find(m_Libraries.begin(), m_Libraries.end(), file.library) == m_Libraries.end())
      m_Libraries.push_back(file.library);
    std::string error;
    const SourceBuffer* buffer = m_Sources->openFile(file.path, error);
    if (!buffer) {
      m_Diagnostics.fileError(file.path, "cannot read the file: " + error);
      continue;
    }
    m_Index->indexFile(*buffer, file.library);
  }
}

void VerilogReader::indexText(std::string path, std::string text, const std::string& library) {
  prepare({});
  if (std::find(m_Libraries.begin(), m_Libraries.end(), library) == m_Libraries.end())
    m_Libraries.push_back(library);
  const SourceBuffer* buffer =
      m_Sources->adopt(SourceBuffer::fromText(std::move(path), std::move(text)));
  m_Index->indexFile(*buffer, library);
}

bool VerilogReader::selectUnit(std::string_view library, std::string_view unit) {
  m_Selected = nullptr;
  if (!m_Index) return false;
  const UnitRecord* record = m_Index->find(unit);
  if (!record) return false;
  // A library no file was registered under holds nothing: accept the unit from any library.
  bool known = std::find(m_Libraries.begin(), m_Libraries.end(), library) != m_Libraries.end();
  if (known && record->library != library) return false;
  m_Selected = record;
  return true;
}

std::vector<ScanUnitInfo> VerilogReader::listUnits() const { return {}; }

bool VerilogReader::readUnit(UnitDescription& unit) {
  if (!m_Selected) return true;
  UnitModel model;
  UnitReader reader(m_Diagnostics, m_Macros, *m_Sources);
  reader.readUnit(*m_Selected, model);
  Evaluator evaluator(*this);
  LineCounter lines;
  // Ranges that cannot be evaluated are warnings; an error here is a header in error, such
  // as a non-ANSI port without a declaration.
  size_t errorsBefore = m_Diagnostics.errorCount();
  unit.ports = buildPorts(model, evaluator, *m_Index, m_Diagnostics, lines);
  return model.headerErrors == 0 && m_Diagnostics.errorCount() == errorsBefore;
}

Scope* VerilogReader::package(const std::string& name) {
  auto known = m_Packages.find(name);
  if (known != m_Packages.end()) return known->second.get();
  const UnitRecord* record = m_Index ? m_Index->findPackage(name) : nullptr;
  if (!record) {
    m_Packages.emplace(name, nullptr);
    return nullptr;
  }
  // Registered before reading, so a package that imports itself finds the partial scope.
  Scope* scope = m_Packages.emplace(name, std::make_unique<Scope>()).first->second.get();
  scope->name = name;
  UnitReader reader(m_Diagnostics, m_Macros, *m_Sources);
  reader.readScope(record->declarations, *scope);
  return scope;
}

Scope* VerilogReader::compilationUnit() {
  if (m_CompilationUnit) return m_CompilationUnit.get();
  m_CompilationUnit = std::make_unique<Scope>();
  m_CompilationUnit->isCompilationUnit = true;
  if (m_Index) {
    UnitReader reader(m_Diagnostics, m_Macros, *m_Sources);
    reader.readScope(m_Index->unitScope(), *m_CompilationUnit);
  }
  return m_CompilationUnit.get();
}

}  // namespace scan::verilog

namespace scan {

std::unique_ptr<LanguageReader> makeVerilogReader(Diagnostics& diagnostics,
                                                  const ScanSettings&) {
  return std::make_unique<verilog::VerilogReader>(diagnostics);
}

}  // namespace scan
