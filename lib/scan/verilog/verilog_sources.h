// The design and include files of a Verilog run, each opened once and kept for the whole run
// (units remember their place in them), plus the include search.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "scan/common/source_buffer.h"

namespace scan {
class Diagnostics;
}

namespace scan::verilog {

class SourceStore {
 public:
  /// Include search, after the including file's directory and the current directory:
  /// `includePath` (a PATH-like list), then `designDirectories` in order.
  SourceStore(std::string_view includePath, std::vector<std::string> designDirectories);

  /// Opens a design file; null (with the system's reason in `error`) when it cannot be read.
  const SourceBuffer* openFile(const std::string& path, std::string& error);
  /// Takes over a buffer made elsewhere (in-memory text).
  const SourceBuffer* adopt(std::unique_ptr<SourceBuffer> buffer);
  /// Finds `name` for an `include in `includer`. Null when no directory holds it (`error`
  /// empty) or when the first file found cannot be read (`error` says why).
  const SourceBuffer* findInclude(std::string_view name, const SourceBuffer* includer,
                                  std::string& error);

  /// The directory part of a path ("." when it has none).
  static std::string directoryOf(const std::string& path);

 private:
  std::vector<std::string> m_SearchPath;
  std::vector<std::unique_ptr<SourceBuffer>> m_Buffers;
  std::unordered_map<std::string, const SourceBuffer*> m_ByPath;
};

}  // namespace scan::verilog
