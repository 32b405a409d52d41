// libFuzzer entry for the Verilog reader: any bytes are indexed as one file, then the units the
// text names after "module " are looked up and their ports read. It must never crash, hang or
// grow without bound.
#include <cctype>
#include <cstddef>
#include <cstdint>
#include <string>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  std::string text(reinterpret_cast<const char*>(data), size);
  scan::Diagnostics diagnostics(nullptr);
  scan::verilog::VerilogReader reader(diagnostics);
  reader.indexText("fuzz.v", text, "work");
  size_t at = 0;
  for (int looked = 0; looked < 4; ++looked) {
    at = text.find("module ", at);
    if (at == std::string::npos) break;
    at += 7;
    size_t end = at;
    while (end < text.size() &&
           (std::isalnum(static_cast<unsigned char>(text[end])) || text[end] == '_'))
      ++end;
    if (reader.selectUnit("work", std::string_view(text).substr(at, end - at))) {
      scan::UnitDescription unit;
      reader.readUnit(unit);
    }
  }
  return 0;
}
