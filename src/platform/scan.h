// Port extraction: reads VHDL or Verilog/SystemVerilog design files, finds one design unit
// by name and reports its ports (name, type, direction, source line and bit range).
// The program reaches the readers (lib/scan/) only through this header.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <utility>
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

  /// What a port's declared type is, as far as a generated declaration cares.
  enum class Kind : int { Bit, BitVector, Integer, Record, Array, Enum, Interface, Other };

  ScanPort(std::string name, std::string typeName, int direction, int sourceLine);

  /// Gives the port a range; `ascending` is true for VHDL "to" and Verilog [low:high].
  void setRange(int32_t left, int32_t right, bool ascending);

  /// The declared type as written, white space normalised to single blanks
  /// ("std_ulogic_vector(XLEN-1 downto 0)", "logic [W-1:0]", "bus_if.slave").
  void setDeclaredType(std::string text) { m_DeclaredType = std::move(text); }
  const std::string& declaredType() const { return m_DeclaredType; }
  void setKind(Kind kind) { m_Kind = kind; }
  Kind kind() const { return m_Kind; }

  /// Marks the range as one that exists but could not be evaluated. `problem` says which
  /// expression, which name could not be evaluated and how to fix it (`-g NAME=VALUE`, or
  /// the file that declares the package); it is the text of the error a template that uses
  /// the range gets.
  void setRangeUnknown(std::string problem) { m_RangeProblem = std::move(problem); }
  bool rangeUnknown() const { return !m_RangeProblem.empty(); }
  const std::string& rangeProblem() const { return m_RangeProblem; }

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
  std::string m_DeclaredType;
  std::string m_RangeProblem;
  Kind m_Kind = Kind::Other;
  int m_Direction;
  int m_SourceLine;
  bool m_HasRange = false;
  bool m_Ascending = false;
  int32_t m_Left = 0;
  int32_t m_Right = 0;
};

/// One generic (VHDL) or parameter (Verilog/SV) of a design unit, in declaration order.
/// `localparam`s are not parameters.
struct ScanGeneric {
  enum class Kind : int { Constant, Type, Package, Subprogram };
  std::string name;
  Kind kind = Kind::Constant;
  /// Declared type as written, white space normalised; empty for an untyped parameter.
  std::string typeText;
  /// Default expression as written, white space normalised; empty when there is none.
  std::string defaultText;
  /// The value after `-g` overrides when it is a constant integer, boolean, real, string,
  /// bit or enumeration literal, written in the design's language ("8", "true", "\"abc\"",
  /// "'1'", "3.5", "IDLE"; for Verilog "8", "1.5", "\"abc\"").
  std::optional<std::string> value;
  int sourceLine = 0;
};

/// One design unit the readers found, for listings and "did you mean" hints.
struct ScanUnitInfo {
  std::string library;
  /// entity, architecture, package, package body, configuration, context, module, interface,
  /// program (an SV package is "package").
  std::string kind;
  std::string name;
  std::string file;
  int line = 0;
};

/// What the command line tells the readers before anything is read or evaluated.
struct ScanSettings {
  /// `-g NAME=VALUE`, in command-line order; VALUE is an expression in the design's language.
  std::vector<std::pair<std::string, std::string>> genericOverrides;
  /// `-D NAME[=TEXT]`: Verilog macros defined before the first file.
  std::vector<std::pair<std::string, std::optional<std::string>>> macros;
  /// `-I DIR`: Verilog include folders, searched after the including file's folder and before
  /// PINFORGE_INCLUDE.
  std::vector<std::string> includeDirectories;
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

  /// Settings for the readers; takes effect at the next Parse.
  void configure(ScanSettings settings) { m_Settings = std::move(settings); }

  /// Registers one design file under `library`, in command-line order. The file is not
  /// opened here; an unreadable file is reported when Parse reads it.
  void addDesignFile(const char* library, const char* file, Language language);

  /// Reads every registered file (syntax errors go to standard error). Returns the number of
  /// errors met.
  int Parse(Language language);

  /// The registered design files Parse could not read (missing, unreadable, a directory), in
  /// command-line order; their reasons went to standard error. Valid after Parse.
  const std::vector<std::string>& unreadableFiles() const;

  /// Looks `unit` up in `library`, then, with SearchAllLibraries, in the others in the order
  /// of their registration. True when found: it becomes the unit getPorts reports.
  bool selectDesignUnit(const char* library, const char* unit, DesignUnitSearch search);

  /// The ports of the unit found last; an empty list when none was found. The list stays
  /// owned by the extractor.
  ScanPortList* getPorts();

  /// True when reading the found unit's header met an error (a lexical or syntax error in
  /// it, an unterminated comment or string, a NUL byte, over-deep nesting, a macro that
  /// cannot expand): its port list is then not to be trusted. Valid after getPorts.
  bool unitHasErrors() const { return m_UnitErrors; }

  /// The generics/parameters of the unit found last, in declaration order. Valid after
  /// getPorts.
  const std::vector<ScanGeneric>& getGenerics() const { return m_Generics; }

  /// The context the found unit needs to compile elsewhere: for VHDL its context clause
  /// (library, use and context lines, one per line, as written with white space normalised),
  /// for SystemVerilog its package imports (file-level and in its header, one per line).
  /// Valid after getPorts.
  const std::string& getContext() const { return m_Context; }

  /// Every design unit read, in file order.
  std::vector<ScanUnitInfo> listUnits() const;

  /// `-g` names that match no generic of the found unit (VHDL names ignore case). Valid after
  /// getPorts.
  std::vector<std::string> unknownOverrides() const;

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
  std::vector<ScanGeneric> m_Generics;
  std::string m_Context;
  ScanSettings m_Settings;
  Language m_Language = Vhdl;
  bool m_UnitFound = false;
  bool m_UnitErrors = false;
};
