// libFuzzer entry for the template engine: expands arbitrary bytes as a template over a small
// design (scalars, buses of both directions, a node) with tracing on. Must never crash.
#include <cstddef>
#include <cstdint>
#include <cstdio>

#include "data/typed_lists.h"
#include "engine/forge.h"

namespace {

std::FILE* sink() {
  static std::FILE* const devNull = std::fopen("/dev/null", "w");
  return devNull;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  // The stream only reads; fmemopen's signature merely lacks the const.
  std::FILE* templateStream = fmemopen(const_cast<uint8_t*>(data), size, "r");
  if (templateStream == nullptr) return 0;

  StbDataList design("proj", "Top_Level2", "top_pins", "vhd", "pinforge", "", "top", "today");
  design.appendOwned(new PortRecord("clk", -1, -1, 'I'));
  design.appendOwned(new PortRecord("data", 7, 0, 'I'));
  design.appendOwned(new PortRecord("addr", 0, 3, 'O'));
  design.appendOwned(new PortRecord("odd", 3, -2, 'B'));
  design.appendOwned(new PortRecord("q", -1, -1, 'O'));
  design.appendOwned(new PortRecord("n1", -1, -1, 'N'));
  {
    Forge forge(sink(), templateStream, sink(), &design);
    forge.processTemplate();
    std::string message;
    forge.getResult(message);
    if (message.size() > Forge::kMessageCapacity) __builtin_trap();
  }
  std::fclose(templateStream);
  return 0;
}
