// Glue between the extractor's reader contract and the Verilog pieces: files are indexed in
// registration order (macros carry over), packages and the compilation-unit scope are read
// only when an expression first needs them.
#include "scan/verilog/verilog_reader.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdlib>

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/verilog/verilog_eval.h"
#include "scan/verilog/verilog_ports.h"
#include "scan/verilog/verilog_preprocessor.h"
#include "scan/verilog/verilog_unit.h"

namespace scan::verilog {
namespace {

// A value as the design would write it: "8", "1.5", "\"abc\"" (the string as it was
// written, escapes included). Nothing for values no literal writes.
std::optional<std::string> literalText(const Value& value) {
  if (value.isInteger()) return std::to_string(value.asInteger());
  if (value.isBoolean()) return std::string(value.asBoolean() ? "1" : "0");
  if (value.isString()) return "\"" + value.asString() + "\"";
  if (!value.isReal() || !std::isfinite(value.asReal())) return std::nullopt;
  char buffer[64];
  std::to_chars_result written = std::to_chars(buffer, buffer + sizeof buffer, value.asReal());
  std::string text(buffer, written.ptr);
  // "3" would read back as an integer.
  if (text.find_first_of(".e") == std::string::npos) text += ".0";
  return text;
}

// `-D NAME` names a macro, optionally with its formal arguments: F or F(a, b).
bool isMacroName(std::string_view name) {
  if (name.empty() || !isIdentifierStart(name.front())) return false;
  size_t i = 1;
  while (i < name.size() && isIdentifierChar(name[i])) ++i;
  if (i == name.size()) return true;
  return name[i] == '(' && name.back() == ')' && name.find('\n') == std::string_view::npos;
}

}  // namespace

VerilogReader::VerilogReader(Diagnostics& diagnostics, ScanSettings settings)
    : m_Diagnostics(diagnostics), m_Settings(std::move(settings)) {}

VerilogReader::~VerilogReader() = default;

void VerilogReader::prepare(std::vector<std::string> designDirectories) {
  if (m_Index) return;
  // Include search after the including file's folder: the current folder, -I, then
  // PINFORGE_INCLUDE, then the design files' folders.
  std::vector<std::string> directories = m_Settings.includeDirectories;
  if (const char* includePath = std::getenv("PINFORGE_INCLUDE")) {
    std::string_view rest = includePath;
    while (!rest.empty()) {
      size_t colon = rest.find(':');
      if (colon != 0) directories.emplace_back(rest.substr(0, colon));
      if (colon == std::string_view::npos) break;
      rest.remove_prefix(colon + 1);
    }
  }
  for (std::string& dir : designDirectories) directories.push_back(std::move(dir));
  m_Sources = std::make_unique<SourceStore>("", std::move(directories));
  m_Index = std::make_unique<DesignIndex>(m_Diagnostics, m_Macros, *m_Sources);
  defineMacros();
}

// Each -D is read as the `define line a file would hold, so it is parsed, logged and later
// replayed like any other definition.
void VerilogReader::defineMacros() {
  for (const auto& [name, text] : m_Settings.macros) {
    std::string label = "-D " + name;
    if (!isMacroName(name)) {
      m_Diagnostics.fileError(label, "'" + name + "' is not a macro name");
      continue;
    }
    std::string line = "`define " + name + " ";
    for (char c : text.value_or("1")) line += c == '\n' ? std::string("\\\n") : std::string(1, c);
    line += '\n';
    const SourceBuffer* buffer = m_Sources->adopt(SourceBuffer::fromText(label, std::move(line)));
    Preprocessor pre(&m_Diagnostics, m_Macros, *m_Sources);
    pre.start(*buffer, 0, 0);
    Token token;
    while (pre.next(token)) {
    }
  }
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

std::vector<ScanUnitInfo> VerilogReader::listUnits() const {
  std::vector<ScanUnitInfo> units;
  if (!m_Index) return units;
  for (const UnitRecord& record : m_Index->units()) {
    if (record.name.empty() || !record.start.source) continue;
    const SourceBuffer& source = *record.start.source;
    units.push_back({record.library, unitKindName(record.kind), record.name, source.path(),
                     static_cast<int>(source.locate(record.start.offset).line)});
  }
  return units;
}

bool VerilogReader::readUnit(UnitDescription& unit) {
  if (!m_Selected) return true;
  UnitModel model;
  UnitReader reader(m_Diagnostics, m_Macros, *m_Sources);
  reader.readUnit(*m_Selected, model);
  bool overridden = applyOverrides(model, reader);
  Evaluator evaluator(*this);
  unit.generics = describeParameters(model, evaluator);
  RangeHints hints;
  for (const ParameterDeclaration& parameter : model.parameters)
    hints.generics.push_back(parameter.name);
  hints.missingPackages = missingPackages(model);
  LineCounter lines;
  // Ranges that cannot be evaluated are warnings; an error here is a header in error, such
  // as a non-ANSI port without a declaration.
  size_t errorsBefore = m_Diagnostics.errorCount();
  unit.ports = buildPorts(model, evaluator, *m_Index, m_Diagnostics, lines, hints);
  unit.context = context(model, reader);
  return overridden && model.headerErrors == 0 && m_Diagnostics.errorCount() == errorsBefore;
}

// Overrides replace the parameter's default before anything is evaluated, so every
// expression that uses it follows. Names that are no parameter are the extractor's to report.
bool VerilogReader::applyOverrides(UnitModel& model, UnitReader& reader) {
  bool ok = true;
  for (const auto& override : m_Settings.genericOverrides) {
    const std::string& name = override.first;
    const std::string& text = override.second;
    auto declared = std::find_if(model.parameters.begin(), model.parameters.end(),
                                 [&](const ParameterDeclaration& p) { return p.name == name; });
    auto parameter = model.scope.parameters.find(name);
    if (declared == model.parameters.end() || parameter == model.scope.parameters.end()) continue;
    const SourceBuffer* buffer = m_Sources->adopt(SourceBuffer::fromText("-g " + name, text));
    ExprId value = kNoExpr;
    std::shared_ptr<TypeSpec> type;
    if (!reader.readValue(*buffer, declared->isType, model.scope.arena, value, type)) {
      ok = false;
      continue;
    }
    Parameter& target = parameter->second;
    if (declared->isType)
      target.typeValue = std::move(type);
    else
      target.value = value;
    target.cached.reset();
  }
  return ok;
}

std::vector<ScanGeneric> VerilogReader::describeParameters(UnitModel& model, Evaluator& evaluator) {
  std::vector<ScanGeneric> generics;
  LineCounter lines;
  for (const ParameterDeclaration& declared : model.parameters) {
    ScanGeneric generic;
    generic.name = declared.name;
    generic.kind = declared.isType ? ScanGeneric::Kind::Type : ScanGeneric::Kind::Constant;
    generic.typeText = declared.typeText;
    generic.defaultText = declared.defaultText;
    if (declared.source)
      generic.sourceLine = static_cast<int>(lines.lineOf(*declared.source, declared.offset));
    if (!declared.isType) {
      Expr reference;
      reference.kind = Expr::Kind::Name;
      reference.name = declared.name;
      model.scope.arena.push_back(std::move(reference));
      ExprId id = static_cast<ExprId>(model.scope.arena.size() - 1);
      Value value;
      if (evaluator.evaluate(id, model.scope, value)) generic.value = literalText(value);
    }
    generics.push_back(std::move(generic));
  }
  return generics;
}

// Packages the unit imports, directly or through the compilation unit, that no design file
// declares: the likely reason a name cannot be found.
std::vector<std::string> VerilogReader::missingPackages(const UnitModel& model) {
  std::vector<std::string> imported = model.scope.wildcardImports;
  for (const auto& [name, package] : model.scope.namedImports) imported.push_back(package);
  if (Scope* unit = compilationUnit()) {
    imported.insert(imported.end(), unit->wildcardImports.begin(), unit->wildcardImports.end());
    for (const auto& [name, package] : unit->namedImports) imported.push_back(package);
  }
  std::sort(imported.begin(), imported.end());
  imported.erase(std::unique(imported.begin(), imported.end()), imported.end());
  std::vector<std::string> missing;
  for (const std::string& package : imported)
    if (!m_Index->findPackage(package)) missing.push_back(package);
  return missing;
}

// The file-level imports before the unit, then its own; each once.
std::string VerilogReader::context(const UnitModel& model, UnitReader& reader) {
  std::vector<std::string> lines =
      reader.readImports(m_Index->unitScope(), m_Selected->unitScopeBefore);
  lines.insert(lines.end(), model.imports.begin(), model.imports.end());
  std::string text;
  std::vector<std::string> seen;
  for (const std::string& line : lines) {
    if (std::find(seen.begin(), seen.end(), line) != seen.end()) continue;
    seen.push_back(line);
    if (!text.empty()) text += '\n';
    text += line;
  }
  return text;
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
                                                  const ScanSettings& settings) {
  return std::make_unique<verilog::VerilogReader>(diagnostics, settings);
}

}  // namespace scan
