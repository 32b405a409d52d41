// What the two Yosys harnesses share: running a Yosys script, reading the JSON it writes, and
// one form for a port ("input [7:0]") that both our ports and Yosys' are turned into.
#pragma once

#include <nlohmann/json.hpp>

#include <map>
#include <string>
#include <vector>

#include "platform/scan.h"
#include "support/diff_tools.h"

namespace yosys_test {

using namespace difftest;
// Yosys lists ports in declaration order; only an ordered object keeps it.
using Json = nlohmann::ordered_json;

inline std::string fixtureDir() { return sourceDir() + "/tests/fixtures/verilog"; }

/// Writes `script` to `dir`/`name`.ys and runs Yosys on it in `dir`.
inline ToolRun runYosys(const std::string& yosys, const std::string& dir, const std::string& name,
                        const std::string& script) {
  const std::string path = dir + "/" + name + ".ys";
  if (!writeFile(path, script)) return {};
  return runTool({yosys, "-q", "-s", path}, dir);
}

/// The JSON object in `path`; a discarded value when there is none.
inline Json readJson(const std::string& path) {
  std::string text;
  if (!readFile(path, text)) return Json(Json::value_t::discarded);
  Json json = Json::parse(text, nullptr, false);
  return json.is_object() ? json : Json(Json::value_t::discarded);
}

/// `name` as Yosys writes it: an escaped identifier without the backslash and the blank.
inline std::string plainName(std::string name) {
  if (!name.empty() && name[0] == '\\') name.erase(0, 1);
  while (!name.empty() && (name.back() == ' ' || name.back() == '\t')) name.pop_back();
  return name;
}

/// "[left:right]", " ascending" after ascending bounds wider than a bit; "scalar" for a single
/// bit at 0, since Yosys cannot tell a scalar from [0:0].
inline std::string rangeText(long long left, long long right, bool ascending) {
  if (left == 0 && right == 0) return "scalar";
  return "[" + std::to_string(left) + ":" + std::to_string(right) + "]" +
         (ascending && left != right ? " ascending" : "");
}

/// Port name -> "direction range" of our ports. A port of a type that implies its width
/// (integer, int, ...) without a range of its own gets that width from bit 0.
inline std::map<std::string, std::string> ourPorts(const ScanPortList& ports) {
  static const std::map<std::string, int> implied = {{"integer", 32}, {"int", 32}, {"shortint", 16},
                                                     {"longint", 64}, {"byte", 8}, {"time", 64}};
  static const char* const directions[] = {"?", "input", "output", "inout"};
  std::map<std::string, std::string> shown;
  for (const ScanPort* port = ports.firstPort(); port != nullptr; port = ports.nextPort(port)) {
    int32_t left = 0;
    int32_t right = 0;
    if (port->hasRange()) port->getBounds(left, right);
    const auto width = implied.find(port->typeName());
    if (!port->hasRange() && width != implied.end()) left = width->second - 1;
    const int direction = port->direction() >= 1 && port->direction() <= 3 ? port->direction() : 0;
    shown[plainName(port->name())] =
        std::string(directions[direction]) + " " +
        (port->rangeUnknown() ? "unknown: " + port->rangeProblem()
                              : rangeText(left, right, port->isAscending() != 0));
  }
  return shown;
}

/// The same for the ports of a module in Yosys' JSON.
inline std::map<std::string, std::string> theirPorts(const Json& module) {
  std::map<std::string, std::string> shown;
  const Json ports = module.value("ports", Json::object());
  for (const auto& [name, port] : ports.items()) {
    const long long width = static_cast<long long>(port.value("bits", Json::array()).size());
    const long long offset = port.value("offset", 0LL);
    const bool upto = port.value("upto", 0) != 0;
    const long long last = offset + width - 1;
    shown[name] = port.value("direction", "?") + " " +
                  (upto ? rangeText(offset, last, true) : rangeText(last, offset, false));
  }
  return shown;
}

/// The extractor over `files`, each a Verilog file of library work, read with `settings`.
inline std::unique_ptr<ScanExtractor> parsed(const std::vector<std::string>& files,
                                             ScanSettings settings = {}) {
  auto extractor = std::make_unique<ScanExtractor>();
  extractor->configure(std::move(settings));
  for (const std::string& file : files)
    extractor->addDesignFile("work", file.c_str(), ScanExtractor::Verilog);
  extractor->Parse(ScanExtractor::Verilog);
  return extractor;
}

}  // namespace yosys_test
