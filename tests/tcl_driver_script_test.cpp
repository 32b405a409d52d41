// The Tcl driver script's head built from design data made here, so the generics, declared
// types, context and language are checked whatever the readers fill in; and read back by a
// real tclsh, so every byte a value may hold arrives as it was.
#include "tcl_driver_script.h"

#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "run_context.h"
#include "support/process.h"
#include "support/scratch_dir.h"

namespace {

using namespace pinforge_test;

struct Port {
  std::string name;
  int32_t left;
  int32_t right;
  char dir;
  std::string type;
  bool rangeUnknown = false;
};

struct Design {
  DesignLanguage language = DesignLanguage::Vhdl;
  std::vector<Port> ports = {};
  std::vector<GenericRecord> generics = {};
  std::string context = "";
};

/// A run context as the front end leaves it for a Tcl template, holding `design`.
std::unique_ptr<RunContext> contextFor(const Design& design) {
  auto context = std::make_unique<RunContext>();
  context->m_ModuleName = "top";
  context->m_ProjectName = "demo";
  context->m_OutputFileName = "out.txt";
  context->m_InputFileName = "design.vhd";
  context->m_TemplateFileName = "t.tcl";
  context->m_DesignData =
      std::make_unique<StbDataList>("demo", "top", "out", "txt", "pinforge", "", "", "");
  StbDataList& data = *context->m_DesignData;
  data.m_Language = design.language;
  data.m_Generics = design.generics;
  data.m_Context = design.context;
  for (const Port& p : design.ports) {
    auto* record = new PortRecord(p.name, p.left, p.right, p.dir);
    record->m_DeclaredType = p.type;
    if (p.rangeUnknown) record->setRangeUnknown("N has no value; give it with -g N=VALUE");
    data.appendOwned(record);
  }
  return context;
}

constexpr const char* kNames =
    "# This file drives input variables to the tcl template file\n"
    "#   given below in the \"source\" command.\nset ModuleName \"top\"\n"
    "set ProjectName \"demo\"\nset ProjectFile \"\"\nset ProjectName \"demo\"\n"
    "set OutputFileName \"out.txt\"\nset InputFileName \"design.vhd\"\n"
    "set TemplateFileName \"t.tcl\"\nset ErrorFileName \"__UNDEFINED__\"\n"
    "set LibLocation \"\"\n\n# Port Definitions\n";

struct HeadCase {
  const char* name;
  Design design;
  std::string ports;    ///< the port lines, PortName to TotalPorts
  std::string details;  ///< everything after them
};

const HeadCase kHeadCases[] = {
    {.name = "VhdlGenericsTypesAndUnknownBound",
     .design = {.ports = {{"clk", -1, -1, 'I', "std_ulogic"},
                          {"data", 15, 0, 'O', "std_logic_vector(WIDTH-1 downto 0)"},
                          {"wide", -1, -1, 'B', "std_logic_vector(N-1 downto 0)", true},
                          {"st", -1, -1, 'O', "state_t"}},
                .generics = {{"WIDTH", "natural", "8", "16"}, {"N", "positive", "", ""}},
                .context = "library ieee;\nuse ieee.std_logic_1164.all;"},
     .ports = "set PortName [ list  \"clk\" \"data\" \"wide\" \"st\" ]\n"
              "set LeftRange [ list  -1 15 \"\" -1 ]\n"
              "set RightRange [ list  -1 0 \"\" -1 ]\n"
              "set PortDir [ list  \"I\" \"O\" \"B\" \"O\" ]\n"
              "set TotalPorts 4\n",
     .details = "\n# Generic Definitions\nset GenericName [ list  \"WIDTH\" \"N\" ]\n"
                "set GenericType [ list  \"natural\" \"positive\" ]\n"
                "set GenericDefault [ list  \"8\" \"\" ]\nset GenericValue [ list  \"16\" \"\" ]\n"
                "set TotalGenerics 2\n\n# Declared Types and Context\n"
                "set PortType [ list  \"std_ulogic\" \"std_logic_vector(WIDTH-1 downto 0)\" "
                "\"std_logic_vector(N-1 downto 0)\" \"state_t\" ]\n"
                "set Context \"library ieee;\nuse ieee.std_logic_1164.all;\"\n"
                "set Language \"vhdl\"\n"},
    {.name = "VerilogWithoutPortsGenericsOrContext",
     .design = {.language = DesignLanguage::Verilog},
     .ports = "set PortName [ list  ]\nset LeftRange [ list  ]\nset RightRange [ list  ]\n"
              "set PortDir [ list  ]\nset TotalPorts 0\n",
     .details = "\n# Generic Definitions\nset GenericName [ list  ]\nset GenericType [ list  ]\n"
                "set GenericDefault [ list  ]\nset GenericValue [ list  ]\nset TotalGenerics 0\n"
                "\n# Declared Types and Context\nset PortType [ list  ]\nset Context \"\"\n"
                "set Language \"verilog\"\n"},
};

// The names and port lines come first exactly as they always have (a bound that could not be
// evaluated aside), and the new variables follow them.
TEST(TclDriverHead, KeepsTheOldLinesAndAppendsTheDesignDetails) {
  for (const HeadCase& c : kHeadCases) {
    SCOPED_TRACE(c.name);
    EXPECT_EQ(tclDriverScriptHead(*contextFor(c.design)), kNames + c.ports + c.details);
  }
}

/// Runs `script` with tclsh in `dir` (with a locale that reads the script byte by byte).
RunResult runTcl(const ScratchDir& dir, const std::string& script) {
  if (!dir.write("driver.tcl", script)) return {};
  return runProgram({findOnPath("tclsh"), "driver.tcl"}, dir.path(), {{"LC_ALL", "C"}});
}

std::string hex(std::string_view bytes) {
  std::string text;
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    text += {"0123456789abcdef"[byte >> 4], "0123456789abcdef"[byte & 15]};
  }
  return text;
}

// Writes every item of the new variables in hex, one per line, so nothing Tcl does to a
// value can hide.
constexpr const char* kHexDump =
    "proc hex {v} { binary scan $v H* h; return $h }\n"
    "set f [open values.txt w]\n"
    "foreach name {GenericName GenericType GenericDefault GenericValue PortType} {\n"
    "  foreach item [set $name] { puts $f \"$name [hex $item]\" }\n"
    "}\n"
    "puts $f \"TotalGenerics $TotalGenerics\"\n"
    "puts $f \"Context [hex $Context]\"\n"
    "puts $f \"Language $Language\"\n"
    "foreach l $LeftRange r $RightRange { puts $f \"Range <$l> <$r>\" }\n"
    "close $f\n";

TEST(TclDriverRoundTrip, EveryByteOfEveryValueReachesTheTemplate) {
  if (findOnPath("tclsh").empty()) GTEST_SKIP() << "tclsh is not installed";
  std::string everyByte;
  for (int byte = 0; byte < 256; ++byte) everyByte += static_cast<char>(byte);
  const std::string tclWords = "{a b} \"q\" $x [exit 7] \\ \\\n; # }{";
  const Design design = {
      .language = DesignLanguage::Verilog,
      .ports = {{"a", 7, 0, 'I', everyByte}, {"b", -1, -1, 'O', tclWords, true}},
      .generics = {{"G1", everyByte, tclWords, "\r\n"}, {tclWords, "", "", everyByte}},
      .context = everyByte + tclWords};
  ScratchDir dir;
  const RunResult run = runTcl(dir, tclDriverScriptHead(*contextFor(design)) + kHexDump);
  ASSERT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(dir.read("values.txt"),
            "GenericName " + hex("G1") + "\nGenericName " + hex(tclWords) + "\n" + "GenericType " +
                hex(everyByte) + "\nGenericType \n" + "GenericDefault " + hex(tclWords) +
                "\nGenericDefault \n" + "GenericValue " + hex("\r\n") + "\nGenericValue " +
                hex(everyByte) + "\n" + "PortType " + hex(everyByte) + "\nPortType " +
                hex(tclWords) + "\n" + "TotalGenerics 2\n" + "Context " +
                hex(everyByte + tclWords) + "\n" + "Language verilog\n" +
                "Range <7> <0>\nRange <> <>\n");
}

}  // namespace
