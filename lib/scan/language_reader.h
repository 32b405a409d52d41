// The contract between the extractor and a language's reader: index every file once, then
// select one unit and parse its header into ports.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/scan.h"

namespace scan {

class Diagnostics;

/// A design file and the library it was registered under.
using DesignFileEntry = ScanExtractor::RegisteredFile;

/// What a reader tells about the selected unit.
struct UnitDescription {
  std::vector<ScanPort> ports;
  std::vector<ScanGeneric> generics;
  std::string context;
};

/// One language's reader. The extractor owns it for the rest of the run.
class LanguageReader {
 public:
  virtual ~LanguageReader() = default;

  /// Reads every file once, in order, recording the design units each declares. Unreadable
  /// files and syntax errors are reported through the diagnostics; reading goes on.
  virtual void indexFiles(const std::vector<DesignFileEntry>& files) = 0;

  /// Looks `unit` up in `library` only. True when found; the unit is then the one readUnit
  /// describes.
  virtual bool selectUnit(std::string_view library, std::string_view unit) = 0;

  /// Parses the selected unit's header and evaluates every port's range. Ports whose range
  /// cannot be evaluated are reported as warnings and come without a range. Returns false
  /// when the header itself is in error (see ScanExtractor::unitHasErrors); `unit` is then
  /// filled as far as it could be.
  virtual bool readUnit(UnitDescription& unit) = 0;

  /// Every unit the index pass met, in file order.
  virtual std::vector<ScanUnitInfo> listUnits() const = 0;
};

/// Settings reach the readers when they are made, before any file is read.
std::unique_ptr<LanguageReader> makeVhdlReader(Diagnostics& diagnostics,
                                               const ScanSettings& settings);
std::unique_ptr<LanguageReader> makeVerilogReader(Diagnostics& diagnostics,
                                                  const ScanSettings& settings);

}  // namespace scan
