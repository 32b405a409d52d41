// Port extraction: reads VHDL or Verilog/SystemVerilog design files, finds one design unit
// by name and reports its ports (name, type, direction, source line and bit range).
// This is the only header the rest of the program includes from src/platform/scan/.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace scan {
class Diagnostics;
class LanguageReader;
}  // namespace scan

/// One port of a design unit, as the extractor reports it.
class ScanPort {
 public:
  /// Direction codes. Only Input and Inout have a meaning of their own to callers; every
  /// other code is some kind of output.
  enum Direction : int {
    Input = 1,
    Output = 2,
    Inout = 3,
    Buffer = 4,
    Linkage = 5,
    Ref = 6,
    InterfacePort = 7,
  };

  ScanPort(std::string name, std::string typeName, int direction, int sourceLine);

  /// Gives the port a range; `ascending` is true for VHDL "to" and Verilog [low:high].
  void setRange(int32_t left, int32_t right, bool ascending);

  /// 1-based line of the port's declaration.
  int sourceLine() const { return m_SourceLine; }
  /// The port's name as declared (Verilog escaped names without their terminating blank).
  const char* name() const { return m_Name.c_str(); }
  /// The type name as written (last component of a selected name); may be empty.
  const char* typeName() const { return m_TypeName.c_str(); }
  /// One of the Direction codes.
  int direction() const { return m_Direction; }
  bool hasRange() const { return m_HasRange; }
  /// Nonzero for an ascending range; only meaningful when hasRange().
  int isAscending() const { return m_Ascending ? 1 : 0; }
  /// Writes the left and right bound in declaration order; only meaningful when hasRange().
  void getBounds(int32_t& left, int32_t& right) const {
    left = m_Left;
    right = m_Right;
  }

 private:
  std::string m_Name;
  std::string m_TypeName;
  int m_Direction;
  int m_SourceLine;
  bool m_HasRange = false;
  bool m_Ascending = false;
  int32_t m_Left = 0;
  int32_t m_Right = 0;
};

/// The ports of the found unit in declaration order, walked port by port.
class ScanPortList {
 public:
  explicit ScanPortList(std::vector<ScanPort> ports) : m_Ports(std::move(ports)) {}

  /// The first port, or null for an empty list.
  const ScanPort* firstPort() const;
  /// The port after `port`, or null after the last. `port` must come from this list.
  const ScanPort* nextPort(const ScanPort* port) const;
  size_t size() const { return m_Ports.size(); }

 private:
  std::vector<ScanPort> m_Ports;
};

/// Reads the registered design files and answers unit lookups.
class ScanExtractor {
 public:
  enum Language : int32_t { Verilog = 0, Vhdl = 1 };
  /// Search mode 1: the named library first, then every other registered library in
  /// registration order (in VHDL "work" is whatever library is being compiled).
  enum DesignUnitSearch : int32_t { SearchNamedLibraryOnly = 0, SearchAllLibraries = 1 };

  ScanExtractor();
  ~ScanExtractor();
  ScanExtractor(const ScanExtractor&) = delete;
  ScanExtractor& operator=(const ScanExtractor&) = delete;

  /// Registers one design file under `library`, in command-line order. The file is not
  /// opened here; an unreadable file is reported when Parse reads it.
  void addDesignFile(const char* library, const char* file, Language language);

  /// Reads every registered file (syntax errors go to standard error). Returns the number of
  /// errors met.
  int Parse(Language language);

  /// Looks `unit` up. Returns 0 when found (it becomes the unit getPorts reports), nonzero
  /// otherwise.
  int findDesignUnit(const char* library, const char* unit, DesignUnitSearch search);

  /// The ports of the unit found last; an empty list when none was found. The list stays
  /// owned by the extractor.
  ScanPortList* getPorts();

  /// A registered design file and its library, in command-line order.
  struct RegisteredFile {
    std::string library;
    std::string path;
  };
  const std::vector<RegisteredFile>& files() const { return m_Files; }
  /// Library names in the order of their first registration.
  const std::vector<std::string>& libraries() const { return m_Libraries; }

 private:
  std::vector<RegisteredFile> m_Files;
  std::vector<std::string> m_Libraries;
  std::unique_ptr<scan::Diagnostics> m_Diagnostics;
  std::unique_ptr<scan::LanguageReader> m_Reader;
  std::unique_ptr<ScanPortList> m_Ports;
  bool m_UnitFound = false;
};
