// The bundled templates run on the fixture designs of tests/fixtures/templates: each output is
// compared with its reviewed copy in expected/, then handed to the tool that consumes it
// (GHDL, Verilator, Icarus, Python, xmllint, rsvg-convert). A missing tool skips the check,
// except under CI=true where it fails: the pipeline installs them all. After a deliberate
// change, PINFORGE_UPDATE_EXPECTED=1 rewrites expected/ for review with git diff.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "support/diff_tools.h"

namespace {

using Words = std::vector<std::string>;

/// What consumes a template's output. The unit a check elaborates or lints is the output's
/// stem, or a parent made around the output when it is a declaration or an instance.
enum class Check {
  None,           // the reviewed copy says all there is
  GhdlTop,        // analysed after the sources and elaborated (and run with `detail` if any)
  GhdlInstance,   // placed in a parent with the vhdl_signals declarations
  GhdlComponent,  // as GhdlInstance, with the vhdl_component declaration as well
  SvTop,          // linted with Verilator (and compiled with Icarus for the Verilog-2001 design)
  SvInstance,     // placed in a parent declaring `detail`, then as SvTop
  Python,         // imported when cocotb is installed, else byte-compiled
  JsonNames,      // parsed; its port names must be `detail`, one per line
  CsvNames,       // parsed; the first column after the header must be `detail`
  Svg,            // well-formed XML, rendered to a PNG of the declared size
};

struct Case {
  const char* expected;      // file name under expected/, also the output's name
  const char* templateName;  // found by name, as a user gives it
  Words args;                // design files (in the fixture folder), -module, -g, ...
  Check check = Check::None;
  const char* detail = "";
};

void PrintTo(const Case& c, std::ostream* os) { *os << c.templateName << " -> " << c.expected; }

const Words kCore = {"tl_pkg.vhd", "tl_core.vhd", "-module", "tl_core", "-g", "DATA_W=8"};
const Words kQuoted = {"tl_quoted.vhd", "-module", "tl_quoted"};
const Words kSvCore = {"tl_sv_pkg.sv", "tl_sv_core.sv", "-lang", "sv", "-module", "tl_sv_core"};
const Words kSvBus = {"tl_sv_pkg.sv", "tl_sv_bus.sv", "-lang", "sv", "-module", "tl_sv_bus"};
const Words kLegacy = {"tl_legacy.v", "-lang", "verilog", "-module", "tl_legacy"};
constexpr const char* kQuotedNames = "\\a\"b\\\n\\c\\\\d\\\n\\e,f\\\n";

const std::vector<Case> kCases = {
    {"tl_core_component.vhd", "vhdl_component", kCore, Check::GhdlComponent},
    {"tl_core_component_instance.vhd", "vhdl_component_instance", kCore, Check::GhdlComponent},
    {"tl_core_instance.vhd", "vhdl_instance", kCore, Check::GhdlInstance},
    {"tl_core_signals.vhd", "vhdl_signals", kCore, Check::GhdlInstance},
    {"tl_core_wrapper.vhd", "vhdl_wrapper", kCore, Check::GhdlTop, "-gDATA_W=8"},
    {"tb_tl_core.vhd", "vhdl_testbench", kCore, Check::GhdlTop},
    {"tl_quoted_wrapper.vhd", "vhdl_wrapper", kQuoted, Check::GhdlTop},
    {"tb_tl_quoted.vhd", "vhdl_testbench", kQuoted, Check::GhdlTop},
    {"tl_sv_core_instance.sv", "verilog_instance", kSvCore, Check::SvInstance,
     "  logic clk, rst_n;\n  req_t req;\n  logic [7:0] din;\n  logic [15:0] dout;\n"
     "  logic [2:0] id;\n"},
    {"tl_sv_core_wrapper.sv", "verilog_wrapper", kSvCore, Check::SvTop},
    {"tb_tl_sv_core.sv", "sv_testbench", kSvCore, Check::SvTop},
    {"tl_sv_bus_instance.sv", "verilog_instance", kSvBus, Check::SvInstance,
     "  logic clk;\n  tl_bus_if bus ();\n  logic [7:0] seen;\n"},
    {"tl_sv_bus_wrapper.sv", "verilog_wrapper", kSvBus, Check::SvTop},
    {"tl_legacy_instance.sv", "verilog_instance", kLegacy, Check::SvInstance,
     "  logic clk, reset;\n  logic [3:0] d;\n  logic [7:0] q;\n"},
    {"tl_legacy_wrapper.sv", "verilog_wrapper", kLegacy, Check::SvTop},
    {"tb_tl_legacy.sv", "sv_testbench", kLegacy, Check::SvTop},
    {"test_tl_core.py", "cocotb_test", kCore, Check::Python},
    {"test_tl_sv_core.py", "cocotb_test", kSvCore, Check::Python},
    {"tl_core.json", "ports_json", kCore, Check::JsonNames,
     "clk\nrst_n\nreq\ndin\ndout\nstate\npad\n"},
    {"tl_quoted.json", "ports_json", kQuoted, Check::JsonNames, kQuotedNames},
    {"tl_quoted.csv", "ports_csv", kQuoted, Check::CsvNames, kQuotedNames},
    {"tl_sv_core.csv", "ports_csv", kSvCore, Check::CsvNames, "clk\nrst_n\nreq\ndin\ndout\nid\n"},
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

const std::string kFixtures = "/tests/fixtures/templates";

/// One case's scratch copy of the fixtures, and the tools it runs there.
struct Bench {
  const Case& c;
  difftest::ScratchDir dir;
  std::string missingTool;  ///< a tool that was not installed, when not under CI

  /// Whether `name` is on PATH; a missing tool is noted, or fails the test under CI=true.
  bool have(const std::string& name) {
    if (!difftest::findTool(name).empty()) return true;
    if (difftest::inCi())
      ADD_FAILURE() << name << " is not installed, and CI needs every template checked";
    else
      missingTool = name;
    return false;
  }
  /// `argv` run with argv[0] found on PATH; nothing when it is not installed.
  std::optional<difftest::ToolRun> tool(Words argv) {
    if (!have(argv[0])) return std::nullopt;
    argv[0] = difftest::findTool(argv[0]);
    return difftest::runTool(argv, dir.path());
  }
  /// As `tool`, and the run must succeed.
  std::optional<difftest::ToolRun> expectRuns(const Words& argv) {
    std::string line;
    for (const std::string& word : argv) line += word + " ";
    std::optional<difftest::ToolRun> run = tool(argv);
    if (run) {
      EXPECT_EQ(run->status, 0) << line << "\n" << run->output;
    }
    return run;
  }
  /// What pinforge wrote to `output` from `templateName` and the case's design.
  std::string generate(const std::string& templateName, const std::string& output) {
    Words args = {"-lib", "work"};
    args.insert(args.end(), c.args.begin(), c.args.end());
    args.insert(args.end(), {"-prj", "tl", "-template", templateName, "-o", output});
    const pinforge_test::RunResult run = pinforge_test::runPinforge(args, dir.path());
    EXPECT_EQ(run.status, 0) << templateName << ": " << run.out << run.err;
    return dir.read(output);
  }
  /// The design sources among the case's arguments, in order.
  Words sources() const {
    Words files;
    for (const std::string& arg : c.args)
      if (arg.find('.') != std::string::npos && arg.find('=') == std::string::npos)
        files.push_back(arg);
    return files;
  }
  /// The output's stem: the unit it declares, or the Python module it is.
  std::string top() const { return std::filesystem::path(c.expected).stem().string(); }

  void checkGhdl() {
    std::string unit = c.expected, top = this->top();
    Words analyse = {"ghdl", "-a"};
    if (c.check != Check::GhdlTop) {
      analyse.push_back("--std=08");
      const bool component = c.check == Check::GhdlComponent;
      // A declaration template is checked by the instance that needs it, and the reverse.
      const std::string name = c.templateName;
      const std::string instance =
          name == "vhdl_component" || name == "vhdl_signals"
              ? generate(component ? "vhdl_component_instance" : "vhdl_instance", "instance.txt")
              : dir.read(c.expected);
      ASSERT_TRUE(dir.write("context.tmpl", "%context%\n"));
      const std::string declarations =
          (component ? generate("vhdl_component", "component.txt") : "") +
          generate("vhdl_signals", "signals.txt");
      unit = "tl_parent.vhd";
      top = "tl_parent";
      ASSERT_TRUE(dir.write(unit, generate("context.tmpl", "context.txt") +
                                      "\nentity tl_parent is\nend entity tl_parent;\n\n"
                                      "architecture a of tl_parent is\n" +
                                      declarations + "\nbegin\n" + instance +
                                      "end architecture a;\n"));
    }
    Words elaborate = analyse;
    elaborate[1] = "-e";
    for (const std::string& file : sources()) analyse.push_back(file);
    analyse.push_back(unit);
    elaborate.push_back(top);
    expectRuns(analyse);
    expectRuns(elaborate);
    // GHDL's mcode back end binds top-level generics when the design starts, not at -e.
    if (*c.detail != '\0') {
      elaborate[1] = "-r";
      elaborate.insert(elaborate.end(), {c.detail, "--stop-time=0ns"});
      expectRuns(elaborate);
    }
  }

  void checkSv() {
    std::string unit = c.expected, top = this->top();
    Words files = sources();
    if (c.check == Check::SvInstance) {
      unit = "tl_parent.sv";
      top = "tl_parent";
      ASSERT_TRUE(dir.write(unit, "import tl_sv_pkg::*;\n\nmodule tl_parent;\n" +
                                      std::string(c.detail) + dir.read(c.expected) +
                                      "endmodule\n"));
      // The parent imports the package, so it is read even when the DUT does not need it.
      if (files.front() != "tl_sv_pkg.sv") files.insert(files.begin(), "tl_sv_pkg.sv");
    }
    files.push_back(unit);
    // The testbench states its timeunit and the fixtures do not.
    Words lint = {"verilator", "--lint-only", "--timing", "-Wno-TIMESCALEMOD", "--top-module", top};
    lint.insert(lint.end(), files.begin(), files.end());
    expectRuns(lint);
    if (c.args != kLegacy) return;
    Words compile = {"iverilog", "-g2012", "-o", "sim.vvp", "-s", top};
    compile.insert(compile.end(), files.begin(), files.end());
    expectRuns(compile);
  }

  void checkData() {
    if (c.check == Check::Python) {
      const std::optional<difftest::ToolRun> cocotb = tool({"python3", "-c", "import cocotb"});
      if (!cocotb) return;
      expectRuns(cocotb->status == 0 ? Words{"python3", "-c", "import " + top()}
                                     : Words{"python3", "-m", "py_compile", c.expected});
      return;
    }
    const char* script =
        c.check == Check::JsonNames
            ? "import json,sys\nfor p in json.load(open(sys.argv[1]))['ports']: print(p['name'])\n"
            : "import csv,sys\nfor r in list(csv.reader(open(sys.argv[1], newline='')))[1:]: "
              "print(r[0])\n";
    const std::optional<difftest::ToolRun> run = expectRuns({"python3", "-c", script, c.expected});
    if (run) {
      EXPECT_EQ(run->output, c.detail);
    }
  }

  void checkSvg() {
    expectRuns({"xmllint", "--noout", c.expected});
    const std::optional<difftest::ToolRun> render =
        expectRuns({"rsvg-convert", "-o", "symbol.png", c.expected});
    if (!render || render->status != 0) return;
    const std::string svg = dir.read(c.expected);
    const std::string png = dir.read("symbol.png");
    for (const auto& [name, offset] :
         {std::pair{"width", size_t{16}}, std::pair{"height", size_t{20}}}) {
      const size_t at = svg.find(std::string(" ") + name + "=\"", svg.find("<svg"));
      ASSERT_NE(at, std::string::npos) << name;
      const size_t begin = at + std::string(name).size() + 3;
      unsigned pixels = 0;
      for (size_t i = 0; i < 4 && png.size() >= offset + 4; ++i)
        pixels = pixels << 8 | static_cast<unsigned char>(png[offset + i]);
      EXPECT_EQ(std::to_string(pixels), svg.substr(begin, svg.find('"', begin) - begin)) << name;
    }
  }
};

class TemplateLibrary : public ::testing::TestWithParam<Case> {};

TEST_P(TemplateLibrary, MatchesReviewedOutputAndItsConsumerAcceptsIt) {
  if (pinforge_test::binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  Bench bench{GetParam(), {}, {}};
  const Case& c = bench.c;
  const std::string fixtures = difftest::sourceDir() + kFixtures;
  if (std::filesystem::exists(difftest::sourceDir() + "/templates/" + c.templateName + ".tcl") &&
      !bench.have("tclsh")) {
    if (!bench.missingTool.empty()) GTEST_SKIP() << "tclsh is not installed";
    return;
  }
  std::error_code error;
  for (const auto& entry : std::filesystem::directory_iterator(fixtures, error))
    if (entry.is_regular_file())
      std::filesystem::copy_file(entry.path(), bench.dir.file(entry.path().filename().string()),
                                 error);
  ASSERT_FALSE(error) << error.message();

  const std::string text = bench.generate(c.templateName, c.expected);
  const std::string expectedPath = fixtures + "/expected/" + c.expected;
  if (std::getenv("PINFORGE_UPDATE_EXPECTED") != nullptr) {
    ASSERT_TRUE(difftest::writeFile(expectedPath, text));
  }
  EXPECT_EQ(text, difftest::readFile(expectedPath)) << "reviewed output: " << expectedPath;
  const Check k = c.check;
  if (k == Check::GhdlTop || k == Check::GhdlInstance || k == Check::GhdlComponent)
    bench.checkGhdl();
  else if (k == Check::SvTop || k == Check::SvInstance)
    bench.checkSv();
  else if (k == Check::Svg)
    bench.checkSvg();
  else if (k != Check::None)
    bench.checkData();
  if (!bench.missingTool.empty()) GTEST_SKIP() << bench.missingTool << " is not installed";
}

INSTANTIATE_TEST_SUITE_P(Bundled, TemplateLibrary, ::testing::ValuesIn(kCases),
                         [](const ::testing::TestParamInfo<Case>& row) {
                           return difftest::fixtureTestName(row.param.expected);
                         });

TEST(TemplateLibraryTable, CoversEveryBundledTemplate) {
  std::error_code error;
  for (const auto& entry :
       std::filesystem::directory_iterator(difftest::sourceDir() + "/templates", error)) {
    const std::string name = entry.path().stem().string();
    bool covered = false;
    for (const Case& c : kCases) covered = covered || name == c.templateName;
    EXPECT_TRUE(covered) << "template " << name << " has no case in template_library_test";
  }
  EXPECT_FALSE(error) << error.message();
}

}  // namespace
