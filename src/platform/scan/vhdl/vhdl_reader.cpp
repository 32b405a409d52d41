// Placeholder VHDL reader: indexes nothing, so every lookup fails until the real reader lands.
#include "platform/scan/language_reader.h"

namespace scan {
namespace {

class EmptyReader final : public LanguageReader {
 public:
  void indexFiles(const std::vector<DesignFileEntry>&) override {}
  bool selectUnit(std::string_view, std::string_view) override { return false; }
  std::vector<ScanPort> readPorts() override { return {}; }
};

}  // namespace

std::unique_ptr<LanguageReader> makeVhdlReader(Diagnostics&) {
  return std::make_unique<EmptyReader>();
}

}  // namespace scan
