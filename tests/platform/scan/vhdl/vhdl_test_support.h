// Runs the extractor over fixture files and flattens the reported ports for comparison.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "platform/scan.h"

namespace vhdl_test {

/// tests/fixtures/vhdl/<name>, from the source tree.
inline std::string fixture(const std::string& name) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  std::string here = __FILE__;
  std::string base = root ? std::string(root) + "/tests" : here.substr(0, here.rfind("/tests/") + 6);
  return base + "/fixtures/vhdl/" + name;
}

struct Port {
  std::string name;
  std::string type;
  int direction = 0;
  int line = 0;
  bool hasRange = false;
  int32_t left = 0;
  int32_t right = 0;
  bool ascending = false;

  bool operator==(const Port& o) const {
    return name == o.name && type == o.type && direction == o.direction && line == o.line &&
           hasRange == o.hasRange && (!hasRange || (left == o.left && right == o.right &&
                                                    ascending == o.ascending));
  }
};

inline std::ostream& operator<<(std::ostream& os, const Port& p) {
  os << p.name << " : " << p.type << " dir " << p.direction << " line " << p.line;
  if (p.hasRange) os << " (" << p.left << (p.ascending ? " to " : " downto ") << p.right << ")";
  return os;
}

struct Run {
  bool found = false;
  std::vector<Port> ports;
  std::string messages;  ///< everything written to standard error
  int errors = 0;
};

/// Registers `files` (library, fixture name) in order, parses, looks `unit` up in "work"
/// with search mode 1 and collects its ports.
inline Run extract(const std::vector<std::pair<std::string, std::string>>& files,
                   const std::string& unit, bool fixtures = true) {
  Run run;
  testing::internal::CaptureStderr();
  {
    ScanExtractor extractor;
    for (const auto& [library, file] : files)
      extractor.addDesignFile(library.c_str(), (fixtures ? fixture(file) : file).c_str(),
                              ScanExtractor::Vhdl);
    run.errors = extractor.Parse(ScanExtractor::Vhdl);
    run.found = extractor.findDesignUnit("work", unit.c_str(),
                                         ScanExtractor::SearchAllLibraries) == 0;
    ScanPortList* list = extractor.getPorts();
    for (const ScanPort* p = list->firstPort(); p != nullptr; p = list->nextPort(p)) {
      Port port{p->name(), p->typeName(), p->direction(), p->sourceLine(), p->hasRange()};
      if (p->hasRange()) {
        p->getBounds(port.left, port.right);
        port.ascending = p->isAscending() != 0;
      }
      run.ports.push_back(port);
    }
  }
  run.messages = testing::internal::GetCapturedStderr();
  return run;
}

/// A port without a range.
inline Port scalar(const char* name, const char* type, int direction, int line) {
  return Port{name, type, direction, line, false};
}

/// A port with a range.
inline Port ranged(const char* name, const char* type, int direction, int line, int32_t left,
                   const char* dir, int32_t right) {
  return Port{name, type, direction, line, true, left, right, std::string(dir) == "to"};
}

}  // namespace vhdl_test
