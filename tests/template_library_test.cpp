// The bundled templates run on the fixture designs of tests/fixtures/templates: each output is
// compared with its reviewed copy in expected/, then handed to the tool that consumes it
// (GHDL, Verilator, Icarus, Python, xmllint, rsvg-convert). A missing tool skips the check,
// except under CI=true where it fails: the pipeline installs them all. After a deliberate
// change, PINFORGE_UPDATE_EXPECTED=1 rewrites expected/ for review with git diff.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <ostream>
#include <string>
#include <vector>

#include "support/diff_tools.h"

namespace {

using difftest::findTool;
using difftest::readFile;
using difftest::runTool;
using difftest::ScratchDir;
using difftest::sourceDir;

/// What consumes a template's output.
enum class Check {
  None,           // the golden comparison says all there is
  GhdlTop,        // analysed after the sources and elaborated as `top`
  GhdlInstance,   // placed in a parent with the vhdl_signals declarations
  GhdlComponent,  // as GhdlInstance, with the vhdl_component declaration as well
  SvTop,          // linted with Verilator (and compiled with Icarus when `icarus`) as `top`
  SvInstance,     // placed in a parent declaring `parent`, then as SvTop
  Python,         // imported when cocotb is installed, else byte-compiled
  JsonNames,      // parsed; its port names must be `names`
  CsvNames,       // parsed; the first column after the header must be `names`
  Svg,            // well-formed XML, rendered to a PNG of the declared size
};

struct Case {
  const char* expected;           // file name under expected/, also the output's name
  const char* templateName;       // found by name, as a user gives it
  std::vector<std::string> args;  // design files (in the fixture folder), -module, -g, ...
  Check check = Check::None;
  const char* top = "";     // unit elaborated or linted
  const char* std = "";     // GHDL --std when the output needs one
  const char* elab = "";    // GHDL -g switch for the top's generic without default
  const char* parent = "";  // SvInstance: declarations of the parent module
  const char* names = "";   // JsonNames/CsvNames: the port names, one per line
  bool icarus = false;
};

void PrintTo(const Case& c, std::ostream* os) { *os << c.templateName << " -> " << c.expected; }

const std::vector<std::string> kCore = {"tl_pkg.vhd", "tl_core.vhd", "-module",
                                        "tl_core",    "-g",          "DATA_W=8"};
const std::vector<std::string> kQuoted = {"tl_quoted.vhd", "-module", "tl_quoted"};
const std::vector<std::string> kSvCore = {"tl_sv_pkg.sv", "tl_sv_core.sv", "-lang",
                                          "sv",           "-module",       "tl_sv_core"};
const std::vector<std::string> kSvBus = {"tl_sv_pkg.sv", "tl_sv_bus.sv", "-lang",
                                         "sv",           "-module",      "tl_sv_bus"};
const std::vector<std::string> kLegacy = {"tl_legacy.v", "-lang", "verilog", "-module",
                                          "tl_legacy"};

constexpr const char* kSvCoreNets =
    "  logic clk, rst_n;\n  req_t req;\n  logic [7:0] din;\n  logic [15:0] dout;\n"
    "  logic [2:0] id;\n";
constexpr const char* kLegacyNets = "  logic clk, reset;\n  logic [3:0] d;\n  logic [7:0] q;\n";

const std::vector<Case>& cases() {
  static const std::vector<Case> table = {
      {"tl_core_component.vhd", "vhdl_component", kCore, Check::GhdlComponent, "", "08"},
      {"tl_core_component_instance.vhd", "vhdl_component_instance", kCore, Check::GhdlComponent, "",
       "08"},
      {"tl_core_instance.vhd", "vhdl_instance", kCore, Check::GhdlInstance, "", "08"},
      {"tl_core_signals.vhd", "vhdl_signals", kCore, Check::GhdlInstance, "", "08"},
      {"tl_core_wrapper.vhd", "vhdl_wrapper", kCore, Check::GhdlTop, "tl_core_wrapper", "",
       "-gDATA_W=8"},
      {"tb_tl_core.vhd", "vhdl_testbench", kCore, Check::GhdlTop, "tb_tl_core"},
      {"tl_quoted_wrapper.vhd", "vhdl_wrapper", kQuoted, Check::GhdlTop, "tl_quoted_wrapper"},
      {"tb_tl_quoted.vhd", "vhdl_testbench", kQuoted, Check::GhdlTop, "tb_tl_quoted"},
      {"tl_sv_core_instance.sv", "verilog_instance", kSvCore, Check::SvInstance, "", "", "",
       kSvCoreNets},
      {"tl_sv_core_wrapper.sv", "verilog_wrapper", kSvCore, Check::SvTop, "tl_sv_core_wrapper"},
      {"tb_tl_sv_core.sv", "sv_testbench", kSvCore, Check::SvTop, "tb_tl_sv_core"},
      {"tl_sv_bus_instance.sv", "verilog_instance", kSvBus, Check::SvInstance, "", "", "",
       "  logic clk;\n  tl_bus_if bus ();\n  logic [7:0] seen;\n"},
      {"tl_sv_bus_wrapper.sv", "verilog_wrapper", kSvBus, Check::SvTop, "tl_sv_bus_wrapper"},
      {"tl_legacy_instance.sv", "verilog_instance", kLegacy, Check::SvInstance, "", "", "",
       kLegacyNets, "", true},
      {"tl_legacy_wrapper.sv", "verilog_wrapper", kLegacy, Check::SvTop, "tl_legacy_wrapper", "",
       "", "", "", true},
      {"tb_tl_legacy.sv", "sv_testbench", kLegacy, Check::SvTop, "tb_tl_legacy", "", "", "", "",
       true},
      {"test_tl_core.py", "cocotb_test", kCore, Check::Python},
      {"test_tl_sv_core.py", "cocotb_test", kSvCore, Check::Python},
      {"tl_core.json", "ports_json", kCore, Check::JsonNames, "", "", "", "",
       "clk\nrst_n\nreq\ndin\ndout\nstate\npad\n"},
      {"tl_quoted.json", "ports_json", kQuoted, Check::JsonNames, "", "", "", "",
       "\\a\"b\\\n\\c\\\\d\\\n\\e,f\\\n"},
      {"tl_quoted.csv", "ports_csv", kQuoted, Check::CsvNames, "", "", "", "",
       "\\a\"b\\\n\\c\\\\d\\\n\\e,f\\\n"},
      {"tl_sv_core.csv", "ports_csv", kSvCore, Check::CsvNames, "", "", "", "",
       "clk\nrst_n\nreq\ndin\ndout\nid\n"},
      {"tl_core.svg", "symbol_svg", kCore, Check::Svg},
      {"tl_sv_bus.svg", "symbol_svg", kSvBus, Check::Svg},
      {"tl_core_pins.txt", "pins", kCore},
      {"tl_legacy_pins.txt", "pins", kLegacy},
      {"tl_core_ports.txt", "port_table", kCore},
      {"tl_core.md", "ports_markdown", kCore},
      {"tl_quoted.md", "ports_markdown", kQuoted},
      {"tl_core.xdc", "xdc_pins", kCore},
      {"tl_sv_core.xdc", "xdc_pins", kSvCore},
  };
  return table;
}

const std::string& fixtureDir() {
  static const std::string dir = sourceDir() + "/tests/fixtures/templates";
  return dir;
}

bool isTclTemplate(const std::string& name) {
  return std::filesystem::exists(sourceDir() + "/templates/" + name + ".tcl");
}

/// A tool's full path. When it is missing, empty, and the name is kept in `missingTool` (or,
/// under CI=true, a failure is recorded).
std::string needTool(const std::string& name, std::string& missingTool) {
  std::string path = findTool(name);
  if (path.empty()) {
    const char* ci = std::getenv("CI");
    if (ci != nullptr && std::string(ci) == "true") {
      ADD_FAILURE() << name << " is not installed, and CI needs every template checked";
    } else {
      missingTool = name;
    }
  }
  return path;
}

/// Runs pinforge in `dir` (which holds copies of the fixtures) and returns what it wrote.
bool generate(const ScratchDir& dir, const std::string& templateName,
              const std::vector<std::string>& designArgs, const std::string& output,
              std::string& text) {
  std::vector<std::string> args = {"-lib", "work"};
  args.insert(args.end(), designArgs.begin(), designArgs.end());
  for (const char* word : {"-prj", "tl", "-template"}) args.push_back(word);
  args.insert(args.end(), {templateName, "-o", output});
  const pinforge_test::RunResult run = pinforge_test::runPinforge(args, dir.path());
  EXPECT_EQ(run.status, 0) << templateName << ": " << run.out << run.err;
  text = dir.read(output);
  return run.status == 0;
}

/// The design sources named in a case's arguments, in order.
std::vector<std::string> sources(const Case& c) {
  std::vector<std::string> files;
  for (const std::string& arg : c.args)
    if (arg.find('.') != std::string::npos && arg.find('=') == std::string::npos)
      files.push_back(arg);
  return files;
}

void expectRuns(const std::vector<std::string>& argv, const ScratchDir& dir) {
  const difftest::ToolRun run = runTool(argv, dir.path());
  std::string line;
  for (const std::string& word : argv) line += word + " ";
  EXPECT_EQ(run.status, 0) << line << "\n" << run.output;
}

std::string svgAttribute(const std::string& svg, const std::string& name) {
  const size_t root = svg.find("<svg");
  const size_t at = svg.find(" " + name + "=\"", root);
  if (root == std::string::npos || at == std::string::npos) return "";
  const size_t begin = at + name.size() + 3;
  return svg.substr(begin, svg.find('"', begin) - begin);
}

unsigned pngDimension(const std::string& png, size_t offset) {
  if (png.size() < offset + 4) return 0;
  unsigned value = 0;
  for (size_t i = 0; i < 4; ++i) value = value << 8 | static_cast<unsigned char>(png[offset + i]);
  return value;
}

void checkGhdl(const ScratchDir& dir, const Case& c, const std::string& output,
               std::string& missingTool) {
  const std::string ghdl = needTool("ghdl", missingTool);
  if (ghdl.empty()) return;
  std::string unit = output;
  std::string top = c.top;
  if (c.check != Check::GhdlTop) {
    std::string context, signals, component, parent;
    ASSERT_TRUE(dir.write("context.tmpl", "%context%\n"));
    ASSERT_TRUE(generate(dir, "context.tmpl", c.args, "context.txt", context));
    ASSERT_TRUE(generate(dir, "vhdl_signals", c.args, "signals.txt", signals));
    if (c.check == Check::GhdlComponent) {
      ASSERT_TRUE(generate(dir, "vhdl_component", c.args, "component.txt", component));
    }
    // A declaration template is checked by the instance that needs it, and the reverse.
    std::string instance = dir.read(output);
    if (c.templateName == std::string("vhdl_component") ||
        c.templateName == std::string("vhdl_signals")) {
      const char* instanceTemplate =
          c.check == Check::GhdlComponent ? "vhdl_component_instance" : "vhdl_instance";
      ASSERT_TRUE(generate(dir, instanceTemplate, c.args, "instance.txt", instance));
    }
    parent = context +
             "\nentity tl_parent is\nend entity tl_parent;\n\n"
             "architecture a of tl_parent is\n" +
             component + signals + "\nbegin\n" + instance + "end architecture a;\n";
    ASSERT_TRUE(dir.write("tl_parent.vhd", parent));
    unit = "tl_parent.vhd";
    top = "tl_parent";
  }
  std::vector<std::string> analyse = {ghdl, "-a"};
  if (*c.std != '\0') analyse.push_back(std::string("--std=") + c.std);
  std::vector<std::string> elaborate = analyse;
  elaborate[1] = "-e";
  for (const std::string& file : sources(c)) analyse.push_back(file);
  analyse.push_back(unit);
  elaborate.push_back(top);
  expectRuns(analyse, dir);
  expectRuns(elaborate, dir);
  // GHDL's mcode back end binds top-level generics when the design starts, not at -e.
  if (*c.elab != '\0') {
    elaborate[1] = "-r";
    elaborate.insert(elaborate.end(), {c.elab, "--stop-time=0ns"});
    expectRuns(elaborate, dir);
  }
}

void checkSv(const ScratchDir& dir, const Case& c, const std::string& output,
             std::string& missingTool) {
  std::string unit = output;
  std::string top = c.top;
  if (c.check == Check::SvInstance) {
    ASSERT_TRUE(dir.write("tl_parent.sv", "import tl_sv_pkg::*;\n\nmodule tl_parent;\n" +
                                              std::string(c.parent) + dir.read(output) +
                                              "endmodule\n"));
    unit = "tl_parent.sv";
    top = "tl_parent";
  }
  std::vector<std::string> files = sources(c);
  // The parent imports the package, so it is read even when the DUT does not need it.
  if (c.check == Check::SvInstance && files.front() != "tl_sv_pkg.sv")
    files.insert(files.begin(), "tl_sv_pkg.sv");
  files.push_back(unit);
  const std::string verilator = needTool("verilator", missingTool);
  if (!verilator.empty()) {
    // The testbench states its timeunit and the fixtures do not.
    std::vector<std::string> argv = {verilator,           "--lint-only",  "--timing",
                                     "-Wno-TIMESCALEMOD", "--top-module", top};
    argv.insert(argv.end(), files.begin(), files.end());
    expectRuns(argv, dir);
  }
  if (!c.icarus) return;
  const std::string iverilog = needTool("iverilog", missingTool);
  if (iverilog.empty()) return;
  std::vector<std::string> argv = {iverilog, "-g2012", "-o", "sim.vvp", "-s", top};
  argv.insert(argv.end(), files.begin(), files.end());
  expectRuns(argv, dir);
}

void checkData(const ScratchDir& dir, const Case& c, const std::string& output,
               std::string& missingTool) {
  const std::string python = needTool("python3", missingTool);
  if (python.empty()) return;
  if (c.check == Check::Python) {
    const std::string module = std::filesystem::path(output).stem().string();
    const bool cocotb = runTool({python, "-c", "import cocotb"}, dir.path()).status == 0;
    if (cocotb)
      expectRuns({python, "-c", "import " + module}, dir);
    else
      expectRuns({python, "-m", "py_compile", output}, dir);
    return;
  }
  const char* script =
      c.check == Check::JsonNames
          ? "import json,sys\nfor p in json.load(open(sys.argv[1]))['ports']: print(p['name'])\n"
          : "import csv,sys\nfor r in list(csv.reader(open(sys.argv[1], newline='')))[1:]: "
            "print(r[0])\n";
  const difftest::ToolRun run = runTool({python, "-c", script, output}, dir.path());
  EXPECT_EQ(run.status, 0) << run.output;
  EXPECT_EQ(run.output, c.names);
}

void checkSvg(const ScratchDir& dir, const std::string& output, std::string& missingTool) {
  const std::string xmllint = needTool("xmllint", missingTool);
  if (!xmllint.empty()) expectRuns({xmllint, "--noout", output}, dir);
  const std::string rsvg = needTool("rsvg-convert", missingTool);
  if (rsvg.empty()) return;
  expectRuns({rsvg, "-o", "symbol.png", output}, dir);
  const std::string svg = dir.read(output);
  const std::string png = dir.read("symbol.png");
  EXPECT_EQ(std::to_string(pngDimension(png, 16)), svgAttribute(svg, "width"));
  EXPECT_EQ(std::to_string(pngDimension(png, 20)), svgAttribute(svg, "height"));
}

class TemplateLibrary : public ::testing::TestWithParam<Case> {};

TEST_P(TemplateLibrary, MatchesReviewedOutputAndItsConsumerAcceptsIt) {
  const Case& c = GetParam();
  if (pinforge_test::binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  std::string missingTool;
  if (isTclTemplate(c.templateName) && needTool("tclsh", missingTool).empty()) {
    if (!missingTool.empty()) GTEST_SKIP() << "tclsh is not installed";
    return;
  }
  ScratchDir dir;
  std::error_code error;
  for (const auto& entry : std::filesystem::directory_iterator(fixtureDir(), error))
    if (entry.is_regular_file())
      std::filesystem::copy_file(entry.path(), dir.file(entry.path().filename().string()), error);
  ASSERT_FALSE(error) << error.message();

  std::string text;
  ASSERT_TRUE(generate(dir, c.templateName, c.args, c.expected, text));
  const std::string expectedPath = fixtureDir() + "/expected/" + c.expected;
  if (std::getenv("PINFORGE_UPDATE_EXPECTED") != nullptr) {
    ASSERT_TRUE(difftest::writeFile(expectedPath, text));
  }
  EXPECT_EQ(text, readFile(expectedPath)) << "reviewed output: " << expectedPath;

  switch (c.check) {
    case Check::None:
      break;
    case Check::GhdlTop:
    case Check::GhdlInstance:
    case Check::GhdlComponent:
      checkGhdl(dir, c, c.expected, missingTool);
      break;
    case Check::SvTop:
    case Check::SvInstance:
      checkSv(dir, c, c.expected, missingTool);
      break;
    case Check::Python:
    case Check::JsonNames:
    case Check::CsvNames:
      checkData(dir, c, c.expected, missingTool);
      break;
    case Check::Svg:
      checkSvg(dir, c.expected, missingTool);
      break;
  }
  if (!missingTool.empty()) GTEST_SKIP() << missingTool << " is not installed";
}

INSTANTIATE_TEST_SUITE_P(Bundled, TemplateLibrary, ::testing::ValuesIn(cases()),
                         [](const ::testing::TestParamInfo<Case>& info) {
                           return difftest::fixtureTestName(info.param.expected);
                         });

TEST(TemplateLibraryTable, CoversEveryBundledTemplate) {
  std::error_code error;
  for (const auto& entry : std::filesystem::directory_iterator(sourceDir() + "/templates", error)) {
    const std::string name = entry.path().stem().string();
    bool covered = false;
    for (const Case& c : cases()) covered = covered || name == c.templateName;
    EXPECT_TRUE(covered) << "template " << name << " has no case in template_library_test";
  }
  EXPECT_FALSE(error) << error.message();
}

}  // namespace
