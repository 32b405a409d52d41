// What the Verilog reader tells about the selected unit besides port ranges: parameters with
// their values after -g, declared types and defaults as written, kinds, package imports (the
// cases of description_cases.txt), then -I with PINFORGE_INCLUDE, hostile -g and -D values,
// and the unit listing.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "verilog_read.h"

namespace {

using verilog_test::fixture;
using verilog_test::Input;

const char* kindName(ScanPort::Kind kind) {
  static const char* const names[] = {"bit",   "vector", "integer",   "record",
                                      "array", "enum",   "interface", "other"};
  return names[static_cast<int>(kind)];
}

// "data in 'logic [W-1:0]' vector [7:0]"; an unknown range is "?", none is "-".
std::string portLine(const ScanPort& port) {
  const std::string range = port.rangeUnknown() ? "?"
                            : port.hasRange()   ? verilog_test::bounds(port)
                                                : "-";
  return std::string(port.name()) + " " + verilog_test::directionName(port.direction()) + " '" +
         port.declaredType() + "' " + kindName(port.kind()) + " " + range;
}

// "W 'int' = '8' -> 8 @27"; a type parameter is marked "type", a missing value "none".
std::string genericLine(const ScanGeneric& generic) {
  return generic.name + (generic.kind == ScanGeneric::Kind::Type ? " type" : "") + " '" +
         generic.typeText + "' = '" + generic.defaultText + "' -> " +
         generic.value.value_or("none") + " @" + std::to_string(generic.sourceLine);
}

// The verdict, then "parameter ..." for each parameter, "port ..." for each port and the
// context lines, as in description_cases.txt.
std::string description(const verilog_test::Read& result) {
  std::string out = result.ok ? "ok" : "bad";
  for (const ScanGeneric& generic : result.unit.generics)
    out += "\nparameter " + genericLine(generic);
  for (const ScanPort& port : result.unit.ports) out += "\nport " + portLine(port);
  return out + (result.unit.context.empty() ? "" : "\n" + result.unit.context);
}

std::vector<std::string> portsOf(const verilog_test::Read& result) {
  std::vector<std::string> lines;
  for (const ScanPort& port : result.unit.ports) lines.push_back(portLine(port));
  return lines;
}

class VerilogDescriptionTest : public testing::TestWithParam<verilog_test::Case> {};

TEST_P(VerilogDescriptionTest, DescribesTheUnit) {
  EXPECT_EQ(description(verilog_test::read(GetParam().input())), GetParam().outcome);
}

INSTANTIATE_TEST_SUITE_P(Cases, VerilogDescriptionTest,
                         testing::ValuesIn(verilog_test::casesFromFile("description_cases.txt")),
                         verilog_test::Label());

struct SearchCase {
  const char* label;
  std::vector<std::string> includeDirectories;
  const char* environment;  ///< PINFORGE_INCLUDE, relative to the fixtures
  std::vector<std::pair<std::string, std::optional<std::string>>> macros;
  std::vector<std::string> ports;
};

TEST(VerilogCommandLineTest, IncludeFoldersAndMacros) {
  const std::vector<SearchCase> cases = {
      {"IncludeFolderBeforeTheEnvironment",
       {fixture("search/first")},
       "search/second",
       {{"DEFINED_WIDTH", "3"}},
       {"a in '[`DESC_WIDTH-1:0]' vector [5:0]", "b in '[`DEFINED_WIDTH-1:0]' vector [2:0]"}},
      {"EnvironmentAlone",
       {},
       "search/second",
       {{"DEFINED_WIDTH", "2 + 2"}},
       {"a in '[`DESC_WIDTH-1:0]' vector [9:0]", "b in '[`DEFINED_WIDTH-1:0]' vector [3:0]"}},
      {"MacroWithoutTextIsOne",
       {fixture("search/second"), fixture("search/first")},
       "",
       {{"DEFINED_WIDTH", std::nullopt}},
       {"a in '[`DESC_WIDTH-1:0]' vector [9:0]", "b in '[`DEFINED_WIDTH-1:0]' vector [0:0]"}},
  };
  for (const SearchCase& c : cases) {
    SCOPED_TRACE(c.label);
    std::string environment = *c.environment ? fixture(c.environment) : "";
    setenv("PINFORGE_INCLUDE", environment.c_str(), 1);
    ScanSettings settings;
    settings.includeDirectories = c.includeDirectories;
    settings.macros = c.macros;
    const verilog_test::Read result =
        verilog_test::read({{}, "include_order", settings, {fixture("search/include_order.v")}});
    ASSERT_TRUE(result.found);
    EXPECT_EQ(portsOf(result), c.ports);
  }
  unsetenv("PINFORGE_INCLUDE");
}

TEST(VerilogCommandLineTest, HostileValuesEndInMessages) {
  const std::vector<std::string> values = {std::string("1\0", 2), "`NO_SUCH_MACRO",
                                           std::string(100000, '('), "\"open", "1 /* open"};
  for (const std::string& value : values) {
    SCOPED_TRACE(value.substr(0, 20));
    ScanSettings settings;
    settings.genericOverrides = {{"W", value}};
    settings.macros = {{"LINES", "1 +\n 2"}, {"OTHER", value}};
    const verilog_test::Read result =
        verilog_test::read({{"module m #(parameter W = 1) (input [W:0] a, input [`LINES:0] b);\n"
                             "endmodule\n"},
                            "m",
                            settings});
    ASSERT_TRUE(result.found);
    EXPECT_FALSE(result.ok);
    EXPECT_FALSE(result.messages.empty());
    ASSERT_EQ(portsOf(result).size(), 2u);
    EXPECT_EQ(portsOf(result)[1], "b in '[`LINES:0]' vector [3:0]");
  }
}

TEST(VerilogListingTest, EveryUnitInFileOrder) {
  const verilog_test::Read result =
      verilog_test::read({{"program p; endprogram\nmacromodule r (input a); endmodule\n"
                           "interface class c; endclass\nmodule described; endmodule\n"},
                          "described",
                          {},
                          {fixture("described.sv")}});
  EXPECT_EQ(result.units, (std::vector<std::string>{
                              "work package desc_pkg described.sv:2",
                              "work package other_pkg described.sv:13",
                              "work interface bus_if described.sv:19",
                              "work module ansi_typed described.sv:25",
                              "work module nonansi_typed described.sv:54",
                              "work program p t.v:1",
                              "work module r t.v:2",
                              "work module described t.v:4",
                          }));
}

}  // namespace
