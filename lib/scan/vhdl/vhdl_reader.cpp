// Glue between the extractor and the VHDL pieces; also where port ranges become reported
// data, warnings or unknown ranges with the fix to apply.
#include "scan/vhdl/vhdl_reader.h"

#include <algorithm>
#include <unordered_map>

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/vhdl/vhdl_header_text.h"
#include "scan/vhdl/vhdl_parser.h"

namespace scan {

std::unique_ptr<LanguageReader> makeVhdlReader(Diagnostics& diagnostics,
                                               const ScanSettings& settings) {
  return std::make_unique<vhdl::VhdlReader>(diagnostics, settings);
}

namespace vhdl {
namespace {

// A line number as the unit description holds it.
int lineNumber(LineCounter& lines, const SourceBuffer& source, size_t offset) {
  return static_cast<int>(std::min<size_t>(lines.lineOf(source, offset), INT32_MAX));
}

// An expression as one line of a message.
std::string oneLine(std::string_view text) {
  std::string out;
  for (char c : text.substr(0, 200)) out.push_back(c == '\n' || c == '\r' || c == '\t' ? ' ' : c);
  if (text.size() > 200) out += "...";
  return quoted(out);
}

const char* kindName(UnitKind kind) {
  switch (kind) {
    case UnitKind::Entity:
      return "entity";
    case UnitKind::Architecture:
      return "architecture";
    case UnitKind::Package:
    case UnitKind::PackageInstance:
      return "package";
    case UnitKind::PackageBody:
      return "package body";
    case UnitKind::Configuration:
      return "configuration";
    case UnitKind::Context:
      return "context";
  }
  return "unit";
}

}  // namespace

void VhdlReader::indexFiles(const std::vector<DesignFileEntry>& files) {
  for (const DesignFileEntry& file : files) {
    std::string error;
    std::unique_ptr<SourceBuffer> source = SourceBuffer::open(file.path, error);
    if (!source) {
      m_Diagnostics.fileError(file.path, error);
      m_Index.addLibrary(file.library);
      continue;
    }
    m_Index.addSource(std::move(source), file.library);
  }
}

void VhdlReader::indexSource(std::unique_ptr<SourceBuffer> source, std::string_view library) {
  m_Index.addSource(std::move(source), library);
}

bool VhdlReader::selectUnit(std::string_view library, std::string_view unit) {
  m_Selected = m_Index.find(UnitKind::Entity, normalizeName(library), normalizeName(unit));
  return m_Selected != nullptr;
}

std::vector<ScanUnitInfo> VhdlReader::listUnits() const {
  std::vector<ScanUnitInfo> out;
  LineCounter lines;
  for (const UnitRecord& record : m_Index.unitsMet()) {
    const SourceBuffer& source = m_Index.source(record);
    std::string_view name = unitNameAt(source.text(), record.offset);
    ScanUnitInfo info;
    info.library = record.library;
    info.kind = kindName(record.kind);
    info.name = name.empty() ? record.name : std::string(name);
    info.file = source.path();
    info.line = lineNumber(lines, source, record.offset);
    out.push_back(std::move(info));
  }
  return out;
}

// The clauses between the end of the unit before it in the same file and its keyword.
std::string VhdlReader::contextOf(const UnitRecord& unit) const {
  size_t begin = 0;
  for (const UnitRecord& other : m_Index.unitsMet())
    if (other.file == unit.file && other.offset < unit.offset)
      begin = std::max(begin, other.offset);
  return contextClauseText(m_Index.source(unit).text(), begin, unit.offset);
}

bool VhdlReader::readUnit(UnitDescription& unit) {
  if (m_Selected == nullptr) return true;
  UnitScope* scope = m_Design.entity(*m_Selected);
  HeaderText header = readHeaderText(scope->source->text(), m_Selected->offset);
  if (m_OverridesApplied != scope) {
    m_Describer.applyOverrides(*scope, header.generics, m_Settings.genericOverrides);
    m_OverridesApplied = scope;
  }
  LineCounter lines;
  unit.generics = m_Describer.generics(*scope, header.generics);
  for (size_t i = 0; i < unit.generics.size(); ++i)
    unit.generics[i].sourceLine = lineNumber(lines, *scope->source, header.generics[i].offset);
  unit.context = contextOf(*m_Selected);
  std::unordered_map<size_t, const InterfaceText*> texts;
  for (const InterfaceText& text : header.ports) texts.emplace(text.offset, &text);
  for (const Decl& decl : scope->decls) {
    if (decl.kind != DeclKind::Port) continue;
    auto text = texts.find(decl.offset);
    unit.ports.push_back(readPort(*scope, decl, text == texts.end() ? nullptr : text->second,
                                  lineNumber(lines, *scope->source, decl.offset)));
  }
  return !scope->parseFailed;
}

ScanPort VhdlReader::readPort(UnitScope& entity, const Decl& decl, const InterfaceText* text,
                              int line) {
  const SourceBuffer& source = *entity.source;
  std::string typeName = decl.subtype.valid() ? std::string(decl.subtype.typeMark.back()) : "";
  ScanPort port(std::string(decl.name), typeName, static_cast<int>(decl.mode), line);
  port.setDeclaredType(text ? text->typeText : typeName);
  RangeValue range;
  const Expr* failed = nullptr;
  std::string name(decl.name);
  EvalContext context{&entity, nullptr};
  Evaluator::Shape shape = m_Evaluator.portShape(context, decl.subtype, range, failed);
  std::string reason = m_Evaluator.reason();
  switch (shape) {
    case Evaluator::Shape::Array:
      if (fitsBound(range.left) && fitsBound(range.right)) {
        port.setRange(static_cast<int32_t>(range.left), static_cast<int32_t>(range.right),
                      range.ascending);
      } else {
        m_Diagnostics.warning(
            source, decl.offset,
            "port '" + name + "': its bounds do not fit in 32 bits; no range reported");
        port.setRangeUnknown("port '" + name + "': its bounds do not fit in 32 bits");
      }
      break;
    case Evaluator::Shape::Unconstrained:
      m_Diagnostics.warning(source, decl.offset,
                            "port '" + name + "' has an unconstrained type; no range reported");
      break;
    case Evaluator::Shape::Failed: {
      // The expression may be a package's, in another file.
      UnitScope* owner = failed ? m_Describer.ownerOf(entity, decl.subtype, *failed) : nullptr;
      std::string_view ownerText = owner ? owner->source->text() : std::string_view();
      std::string what = owner
                             ? oneLine(ownerText.substr(failed->begin, failed->end - failed->begin))
                             : std::string("its range");
      m_Diagnostics.warning(
          source, decl.offset,
          "port '" + name + "': cannot evaluate " + what + " (" + reason + "); no range reported");
      std::string expression =
          owner ? normalizedText(ownerText, failed->begin, failed->end) : std::string("its range");
      const Expr* own = owner == &entity ? failed : nullptr;
      port.setRangeUnknown("port '" + name + "': cannot evaluate " + expression + ": " +
                           m_Describer.failureHint(entity, own, decl.subtype.typeMark, reason));
      break;
    }
    case Evaluator::Shape::Unknown: {
      m_Diagnostics.warning(source, decl.subtype.offset,
                            "port '" + name + "': type '" + typeName +
                                "' is not declared in any visible package; no range reported");
      std::string hint = m_Describer.failureHint(entity, nullptr, decl.subtype.typeMark, "");
      port.setRangeUnknown(
          "port '" + name + "': type '" + typeName + "' is not declared: " +
          (hint.empty() ? "add the design file of the package that declares it" : hint));
      break;
    }
    case Evaluator::Shape::Scalar:
      break;
  }
  port.setKind(m_Describer.portKind(entity, decl.subtype));
  return port;
}

}  // namespace vhdl
}  // namespace scan
