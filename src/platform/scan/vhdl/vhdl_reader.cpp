// Glue between the extractor and the VHDL pieces; also where port ranges become reported
// data or warnings.
#include "platform/scan/vhdl/vhdl_reader.h"

#include <algorithm>

#include "platform/scan/common/diagnostics.h"
#include "platform/scan/vhdl/vhdl_parser.h"

namespace scan {

std::unique_ptr<LanguageReader> makeVhdlReader(Diagnostics& diagnostics, const ScanSettings&) {
  return std::make_unique<vhdl::VhdlReader>(diagnostics);
}

namespace vhdl {
namespace {

// Line numbers of increasing offsets without a line table for the whole file.
class LineCounter {
 public:
  explicit LineCounter(std::string_view text) : m_Text(text) {}
  int lineOf(size_t offset) {
    offset = std::min(offset, m_Text.size());
    if (offset < m_Offset) {
      m_Offset = 0;
      m_Line = 1;
    }
    m_Line += std::count(m_Text.begin() + static_cast<std::ptrdiff_t>(m_Offset),
                         m_Text.begin() + static_cast<std::ptrdiff_t>(offset), '\n');
    m_Offset = offset;
    return static_cast<int>(std::min<size_t>(m_Line, INT32_MAX));
  }

 private:
  std::string_view m_Text;
  size_t m_Offset = 0;
  size_t m_Line = 1;
};

// An expression as one line of a message.
std::string oneLine(std::string_view text) {
  std::string out;
  for (char c : text.substr(0, 200)) out.push_back(c == '\n' || c == '\r' || c == '\t' ? ' ' : c);
  if (text.size() > 200) out += "...";
  return quoted(out);
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

std::vector<ScanUnitInfo> VhdlReader::listUnits() const { return {}; }

bool VhdlReader::readUnit(UnitDescription& unit) {
  std::vector<ScanPort>& ports = unit.ports;
  if (m_Selected == nullptr) return true;
  UnitScope* scope = m_Design.entity(*m_Selected);
  const SourceBuffer& source = *scope->source;
  LineCounter lines(source.text());
  EvalContext context{scope, nullptr};
  for (const Decl& decl : scope->decls) {
    if (decl.kind != DeclKind::Port) continue;
    std::string typeName = decl.subtype.valid() ? std::string(decl.subtype.typeMark.back()) : "";
    ScanPort port(std::string(decl.name), typeName, static_cast<int>(decl.mode),
                  lines.lineOf(decl.offset));
    RangeValue range;
    const Expr* failed = nullptr;
    std::string name(decl.name);
    switch (m_Evaluator.portShape(context, decl.subtype, range, failed)) {
      case Evaluator::Shape::Array:
        if (fitsBound(range.left) && fitsBound(range.right))
          port.setRange(static_cast<int32_t>(range.left), static_cast<int32_t>(range.right),
                        range.ascending);
        else
          m_Diagnostics.warning(source, decl.offset,
                                "port '" + name + "': its bounds do not fit in 32 bits; no range reported");
        break;
      case Evaluator::Shape::Unconstrained:
        m_Diagnostics.warning(source, decl.offset,
                              "port '" + name + "' has an unconstrained type; no range reported");
        break;
      case Evaluator::Shape::Failed: {
        std::string what =
            failed ? oneLine(source.text().substr(failed->begin, failed->end - failed->begin))
                   : std::string("its range");
        m_Diagnostics.warning(source, decl.offset,
                              "port '" + name + "': cannot evaluate " + what + " (" +
                                  m_Evaluator.reason() + "); no range reported");
        break;
      }
      case Evaluator::Shape::Unknown:
        m_Diagnostics.warning(source, decl.subtype.offset,
                              "port '" + name + "': type '" + typeName +
                                  "' is not declared in any visible package; no range reported");
        break;
      case Evaluator::Shape::Scalar:
        break;
    }
    ports.push_back(std::move(port));
  }
  return !scope->parseFailed;
}

}  // namespace vhdl
}  // namespace scan
