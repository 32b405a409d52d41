// libFuzzer entry for the template engine: expands arbitrary bytes as a template over a small
// design (scalars, buses of both directions, a node, typed and untyped ports, a port whose range
// is unknown, generics with and without type and default) with tracing on. Must never crash.
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

#include "data/typed_lists.h"
#include "engine/forge.h"

namespace {

std::FILE* sink() {
  static std::FILE* const devNull = std::fopen("/dev/null", "w");
  return devNull;
}

PortRecord* typedPort(const char* name, int32_t left, int32_t right, char dir, const char* type,
                      PortTypeKind kind) {
  auto* port = new PortRecord(name, left, right, dir);
  port->m_DeclaredType = type;
  port->m_Kind = kind;
  return port;
}

// Only the message about a range that could not be evaluated may pass the capacity: it carries
// the reader's whole explanation.
bool isRangeError(std::string_view message) {
  return message.starts_with("Error - Template file line ") &&
         message.find(", which could not be evaluated:\n") != std::string_view::npos;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  // The stream only reads; fmemopen's signature merely lacks the const.
  std::FILE* templateStream = fmemopen(const_cast<uint8_t*>(data), size, "r");
  if (templateStream == nullptr) return 0;

  StbDataList design("proj", "Top_Level2", "top_pins", "vhd", "pinforge", "", "top", "today");
  design.appendOwned(typedPort("clk", -1, -1, 'I', "std_ulogic", PortTypeKind::Bit));
  design.appendOwned(
      typedPort("data", 7, 0, 'I', "std_logic_vector(WIDTH-1 downto 0)", PortTypeKind::BitVector));
  design.appendOwned(new PortRecord("addr", 0, 3, 'O'));
  design.appendOwned(new PortRecord("odd", 3, -2, 'B'));
  design.appendOwned(typedPort("q", -1, -1, 'O', "trace_t", PortTypeKind::Record));
  design.appendOwned(new PortRecord("n1", -1, -1, 'N'));
  PortRecord* unknown =
      typedPort("wide", -1, -1, 'I', "std_logic_vector(N-1 downto 0)", PortTypeKind::BitVector);
  unknown->setRangeUnknown(std::string(300, 'r'));
  design.appendOwned(unknown);
  design.m_Generics = {
      {"WIDTH", "natural", "8", "8"}, {"N", "positive", "", ""}, {"P", "", "4", "4"}};
  design.m_Context = "library ieee;\n";
  {
    Forge forge(sink(), templateStream, sink(), &design);
    forge.setTemplateName("fuzz.tmpl");
    forge.processTemplate();
    std::string message;
    forge.getResult(message);
    if (message.size() > Forge::kMessageCapacity && !isRangeError(message)) __builtin_trap();
  }
  std::fclose(templateStream);
  return 0;
}
