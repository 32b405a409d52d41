// The extractor keeps the registered files per library and hands them to the reader of the
// run's language; lookups walk the libraries in search order.
#include <algorithm>

#include "platform/scan.h"
#include "scan/common/ascii.h"
#include "scan/common/diagnostics.h"
#include "scan/language_reader.h"

ScanExtractor::ScanExtractor() : m_Diagnostics(std::make_unique<scan::Diagnostics>(stderr)) {}

ScanExtractor::~ScanExtractor() = default;

void ScanExtractor::addDesignFile(const char* library, const char* file, Language) {
  std::string name = library ? library : "work";
  if (std::find(m_Libraries.begin(), m_Libraries.end(), name) == m_Libraries.end())
    m_Libraries.push_back(name);
  m_Files.push_back({name, file ? file : ""});
}

int ScanExtractor::Parse(Language language) {
  // Files are read in command-line order across libraries: Verilog macros persist from
  // file to file in that order.
  m_Language = language;
  m_Reader = language == Verilog ? scan::makeVerilogReader(*m_Diagnostics, m_Settings)
                                 : scan::makeVhdlReader(*m_Diagnostics, m_Settings);
  m_Reader->indexFiles(m_Files);
  return static_cast<int>(m_Diagnostics->errorCount());
}

const std::vector<std::string>& ScanExtractor::unreadableFiles() const {
  return m_Diagnostics->unreadableFiles();
}

bool ScanExtractor::selectDesignUnit(const char* library, const char* unit,
                                     DesignUnitSearch search) {
  m_UnitFound = false;
  m_UnitErrors = false;
  m_Ports.reset();
  m_Generics.clear();
  m_Context.clear();
  if (!m_Reader || unit == nullptr) return false;
  std::string wanted = library ? library : "work";
  std::vector<std::string> order{wanted};
  if (search == SearchAllLibraries)
    for (const std::string& lib : m_Libraries)
      if (lib != wanted) order.push_back(lib);
  for (const std::string& lib : order) {
    if (m_Reader->selectUnit(lib, unit)) {
      m_UnitFound = true;
      return true;
    }
  }
  return false;
}

ScanPortList* ScanExtractor::getPorts() {
  if (!m_Ports) {
    scan::UnitDescription unit;
    if (m_UnitFound) m_UnitErrors = !m_Reader->readUnit(unit);
    m_Generics = std::move(unit.generics);
    m_Context = std::move(unit.context);
    m_Ports = std::make_unique<ScanPortList>(std::move(unit.ports));
  }
  return m_Ports.get();
}

std::vector<ScanUnitInfo> ScanExtractor::listUnits() const {
  return m_Reader ? m_Reader->listUnits() : std::vector<ScanUnitInfo>{};
}

std::vector<std::string> ScanExtractor::unknownOverrides() const {
  // VHDL names ignore case; Verilog names do not.
  auto same = [this](const std::string& a, const std::string& b) {
    return m_Language == Vhdl ? scan::equalsIgnoringCase(a, b) : a == b;
  };
  std::vector<std::string> unknown;
  for (const auto& [name, value] : m_Settings.genericOverrides) {
    bool found = false;
    for (const ScanGeneric& generic : m_Generics) found = found || same(name, generic.name);
    if (!found) unknown.push_back(name);
  }
  return unknown;
}
