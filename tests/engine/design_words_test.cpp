// Templates over designs that carry what the declarations say beyond names and bounds: generics,
// context, declared port types and modes, port patterns, and ranges nobody could evaluate.
#include <gtest/gtest.h>

#include <string>
#include <tuple>

#include "engine/handlers_fixture.h"

namespace {

using handlers_test::Design;
using handlers_test::errorAt;
using handlers_test::Row;
using handlers_test::rowName;
using handlers_test::TemplateTest;
using K = PortTypeKind;

const Design kEmpty;

const Design kVhdl{
    {{"clk", -1, -1, 'I', "std_ulogic", K::Bit},
     {"rst_n", -1, -1, 'I', "std_logic", K::Bit},
     {"data", 15, 0, 'I', "std_ulogic_vector(WIDTH-1 downto 0)", K::BitVector},
     {"q", -1, -1, 'O', "std_logic", K::Bit, PortMode::Buffer},
     {"trace", -1, -1, 'O', "trace_t", K::Record},
     {"st", -1, -1, 'B', "state_t", K::Enum},
     {"cnt", 3, 0, 'O', "integer range 0 to 15", K::Integer},
     {"n", -1, -1, 'N'}},
    {{"WIDTH", "natural", "8", "16"},
     {"MODE", "string", "\"fast\"", "\"fast\""},
     {"INIT", "std_logic_vector(WIDTH-1 downto 0)", "(others => '0')", "(others => '0')"}},
    "library ieee;\nuse ieee.std_logic_1164.all;\n"};

const Design kVerilog{{{"clk", -1, -1, 'I', "wire", K::Bit},
                       {"d", 7, 0, 'I', "logic [W-1:0]", K::BitVector},
                       {"q", -1, -1, 'O', "logic", K::Bit},
                       {"io", -1, -1, 'B', "wire", K::Bit},
                       {"s", -1, -1, 'B', "bus_if.slave", K::Interface},
                       {"r", -1, -1, 'O', "int", K::Integer, PortMode::Ref}},
                      {{"W", "", "8", "8"}, {"T", "int unsigned", "4", "4"}},
                      "import axi_pkg::*;\n",
                      DesignLanguage::Verilog};

const std::string kProblem =
    "std_logic_vector(WIDTH-1 downto 0): generic WIDTH has no default; give it with -g "
    "WIDTH=VALUE";

const Design kUnknown{{{"en", -1, -1, 'I', "std_logic", K::Bit},
                       {"data", -1, -1, 'I', "std_logic_vector(WIDTH-1 downto 0)", K::BitVector,
                        PortMode::FromLetter, kProblem},
                       {"arr", -1, -1, 'O', "rec_array_t(0 to N-1)", K::Array, PortMode::FromLetter,
                        "N has no value"},
                       {"q", 3, 0, 'O', "std_logic_vector(3 downto 0)", K::BitVector}}};

std::string rangeError(int line, const std::string& port, const std::string& problem) {
  return "Error - Template file line " + std::to_string(line) + " needs the range of port " + port +
         ", which could not be evaluated:\n" + problem + "\n";
}

const Design kOnePort{{{"Clk_In", -1, -1, 'I'}}};

const std::string kGenericOnly = " may only occur inside an @ITERATE@%GENERIC% body.";
const std::string kPortsOnly = " may only occur inside an @ITERATE@ over ports.";

INSTANTIATE_TEST_SUITE_P(
    Generics, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"ListCaseAndWrap", kVhdl, "@LOWCASE@@SET OUTLINEWIDTH=3@%generic%",
         "width, \nmode, \ninit"},
        {"ListInPortBody", kVerilog, "@ITERATE@%IPORT%@ITERATOR@:%generic%@ENDITERATE@",
         "clk:W, T, d:W, T"},
        {"VhdlClause", kVhdl,
         "@SET SIGDELIM=;\n@@ITERATE@%GENERIC%@ITERATOR@ : @GENERIC_TYPE@ := "
         "@GENERIC_DEFAULT@ -- @GENERIC_VALUE@@ENDITERATE@",
         "WIDTH : natural := 8 -- 16;\nMODE : string := \"fast\" -- \"fast\";\n"
         "INIT : std_logic_vector(WIDTH-1 downto 0) := (others => '0') -- (others => '0')"},
        {"VerilogParameterList", kVerilog,
         "#(@ITERATE@%generic%.@ITERATOR@(@GENERIC_VALUE@)@ENDITERATE@)", "#(.W(8), .T(4))"},
        {"NamesTakeCaseValuesDoNot", kVhdl,
         "@UPCASE@@ITERATE@%GENERIC%@LOWCASE@@ITERATOR@=@GENERIC_VALUE@@ENDITERATE@",
         "width=16, mode=\"fast\", init=(others => '0')"},
        {"IfHas", kVhdl,
         "@IFHAS GENERIC=WIDTH@1@ENDIF@@IFHAS GENERIC=width@2@ENDIF@"
         "@IFNHAS GENERIC=*@3@ENDIF@@IFHAS generic=?ODE@4@ENDIF@"
         "@SET CASESENSITIVEIF=OFF@@IFHAS GENERIC=width@5@ENDIF@@IFHAS GENERIC=MOD@6@ENDIF@",
         "145"},
        {"IfHasInGenericBody", kVhdl,
         "@ITERATE@%GENERIC%@IFHAS GENERIC=MODE@@ITERATOR@@ENDIF@@ENDITERATE@",
         "WIDTH, MODE, INIT"},
        {"ErrorInBodyStops", kVhdl, "@ITERATE@%GENERIC%@ITERATOR@@FOO@@ENDITERATE@", "WIDTH",
         errorAt(1, "Keyword: @FOO@ is not a valid Variable or Directive name.")},
        {"FieldInPortBody", kVhdl, "@ITERATE@%PORT%@GENERIC_VALUE@@ENDITERATE@", ", ",
         errorAt(1, "@GENERIC_VALUE@" + kGenericOnly)},
        {"PortWordInGenericBody", kVhdl, "@ITERATE@%GENERIC%@PORT_TYPE@@ENDITERATE@", "",
         errorAt(1, "@PORT_TYPE@" + kPortsOnly)},
        {"PortListInGenericBody", kVhdl, "@ITERATE@%GENERIC%%port%@ENDITERATE@", "",
         errorAt(1,
                 "Variables: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL% are "
                 "not valid within @ITERATE@")},
        {"NestedInPortBody", kVhdl, "@ITERATE@%PORT%@ITERATE@%GENERIC%@ENDITERATE@", ", ",
         errorAt(1, "@ITERATE@ may not occur inside an @ITERATE@ body.")},
        {"Context", kVhdl, "%context%entity",
         "library ieee;\nuse ieee.std_logic_1164.all;\nentity"},
        {"ContextKeepsCase", kVerilog, "@UPCASE@%CONTEXT%", "import axi_pkg::*;\n"},
        {"ContextEmpty", kEmpty, "[%context%]", "[]"}}),
    rowName);

INSTANTIATE_TEST_SUITE_P(
    PortWords, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"VhdlEntityPorts", kVhdl,
         "@SET SIGDELIM=;\n@@ITERATE@%SIGNAL%@ITERATOR@ : @PORT_MODE@ @PORT_TYPE@@ENDITERATE@",
         "clk : in std_ulogic;\nrst_n : in std_logic;\n"
         "data : in std_ulogic_vector(WIDTH-1 downto 0);\nq : buffer std_logic;\n"
         "trace : out trace_t;\nst : inout state_t;\ncnt : out integer range 0 to 15;\nn :  "},
        {"VerilogPorts", kVerilog,
         "@ITERATE@%SIGNAL%[@PORT_MODE@|@PORT_TYPE@|@ITERATOR@]@ENDITERATE@",
         "[input|wire|clk], [input|logic [W-1:0]|d], [output|logic|q], [inout|wire|io], "
         "[|bus_if.slave|s], [ref|int|r]"},
        {"WordsIgnoreCaseMode", kVhdl,
         "@UPCASE@@ITERATE@%IPORT%@PORT_MODE@ @PORT_TYPE@@ENDITERATE@",
         "in std_ulogic, in std_logic, in std_ulogic_vector(WIDTH-1 downto 0)"},
        {"ExpandedBitsKeepType", kVerilog,
         "@EXPANDBUS@@ITERATE@%IBUSPORT%@ITERATOR@:@PORT_TYPE@@ENDITERATE@",
         "d_7_:logic [W-1:0], d_6_:logic [W-1:0], d_5_:logic [W-1:0], d_4_:logic [W-1:0], "
         "d_3_:logic [W-1:0], d_2_:logic [W-1:0], d_1_:logic [W-1:0], d_0_:logic [W-1:0]"},
        {"IfKind", kVhdl,
         "@SET SIGDELIM=@@ITERATE@%SIGNAL%@IFKIND integer|Record@i@ENDIF@"
         "@IFNKIND bit|VECTOR|integer|record@n@ENDIF@@IFKIND enum@e@ENDIF@@ENDITERATE@",
         "inein"},
        {"IfKindOutside", kVhdl, "@IFKIND bit@@ENDIF@", "",
         errorAt(1, "@IFKIND and @IFNKIND" + kPortsOnly)},
        {"IfKindUnknownName", kOnePort, "@ITERATE@%PORT%@IFKIND bits@@ENDIF@@ENDITERATE@", "",
         errorAt(1,
                 "Invalid syntax for @IFKIND or @IFNKIND directive, must be of the form:\n"
                 "@IFKIND KIND|KIND@ with KIND one of bit, vector, integer, record, array, "
                 "enum, interface, other")},
        {"TypeOutside", kVhdl, "x\n@PORT_TYPE@", "x\n", errorAt(2, "@PORT_TYPE@" + kPortsOnly)},
        {"TypeDecKeepsDeclaredTypeOfNonBitPorts", kVhdl,
         "@SET SIGDELIM=;@@ITERATE@%SIGNAL%@VHDL_TYPEDEC@@ENDITERATE@",
         "std_logic;std_logic;std_logic_vector(15 downto 0);std_logic;trace_t;state_t;"
         "std_logic_vector(3 downto 0);std_logic"},
        {"TypeDecOfInterfaceAndInteger", kVerilog,
         "@ITERATE@%BPORT%@VHDL_TYPEDEC@@ENDITERATE@|@ITERATE@%OPORT%@VHDL_TYPEDEC@@ENDITERATE@",
         "std_logic, bus_if.slave|std_logic, std_logic"}}),
    rowName);

// Generics with and without default and type, ports with and without declared type.
const Design kDeclared{
    {{"clk", -1, -1, 'I', "wire", K::Bit}, {"d", 1, 0, 'I'}, {"q", -1, -1, 'O', "logic", K::Bit}},
    {{"WIDTH", "natural", "8", "8"}, {"DEPTH", "positive", "", "16"}, {"P", "", "4", "4"}},
    "",
    DesignLanguage::Verilog};

const Design kEmptyValue{{}, {{"W", "", "", ""}}, "", DesignLanguage::Verilog};

// `word` as the innermost of `depth` nested blocks inside a generic iteration.
std::string nestedInGenericBody(const std::string& word, int depth) {
  return "@ITERATE@%GENERIC%" + handlers_test::nested(depth, word) + "@ENDITERATE@";
}

const std::string kDefaultOnly =
    "@IFDEFAULT@ and @IFNDEFAULT@ may only occur inside an @ITERATE@%GENERIC% body.";
const std::string kTypedOnly =
    "@IFTYPED@ and @IFNTYPED@ may only occur inside an @ITERATE@ over ports or generics.";

INSTANTIATE_TEST_SUITE_P(
    IfDefaultIfTyped, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"VhdlClauseDefaultsOnlyWhereGiven", kDeclared,
         "@SET SIGDELIM=;@@ITERATE@%GENERIC%@ITERATOR@@IFDEFAULT@ := @GENERIC_DEFAULT@@ENDIF@"
         "@ENDITERATE@",
         "WIDTH := 8;DEPTH;P := 4"},
        {"NoDefault", kDeclared,
         "@ITERATE@%GENERIC%@IFNDEFAULT@-g @ITERATOR@=@GENERIC_VALUE@@ENDIF@@ENDITERATE@",
         ", -g DEPTH=16, "},
        {"ValueNobodyGave", kEmptyValue,
         "x\n@ITERATE@%GENERIC%@ITERATOR@ => @GENERIC_VALUE@@ENDITERATE@", "x\nW => ",
         "Error - Template file line 2 needs the value of generic W, which has neither a "
         "default nor a -g value; give one with -g W=VALUE\n"},
        {"VerilogParameterTypes", kDeclared,
         "@ITERATE@%GENERIC%parameter @IFTYPED@@GENERIC_TYPE@ @ENDIF@@ITERATOR@@ENDITERATE@",
         "parameter natural WIDTH, parameter positive DEPTH, parameter P"},
        {"UntypedGeneric", kDeclared, "@ITERATE@%GENERIC%@IFNTYPED@@ITERATOR@@ENDIF@@ENDITERATE@",
         ", , P"},
        {"PortTypes", kDeclared,
         "@ITERATE@%SIGNAL%@IFTYPED@@PORT_TYPE@ @ENDIF@@IFNTYPED@? @ENDIF@@ITERATOR@"
         "@ENDITERATE@",
         "wire clk, ? d, logic q"},
        {"NestWithIfHasAndIfPort", kDeclared,
         "@ITERATE@%PORT%@IFHAS GENERIC=P@@IFNPORT q@@IFTYPED@<@ITERATOR@>@ENDIF@@ENDIF@"
         "@ENDIF@@ENDITERATE@",
         "<clk>, , "},
        {"FailedBlockCountsThem", kDeclared,
         "@IFHAS PORT=zz@@IFDEFAULT@@IFNTYPED@@ENDIF@@IFTYPED@@IFNDEFAULT@@ENDIF@@ENDIF@x"
         "@ENDIF@@ENDIF@y",
         "y"},
        {"NineLevels", kDeclared, nestedInGenericBody("@IFDEFAULT@", 9), "x, , x"},
        {"TenthLevel", kDeclared, nestedInGenericBody("@IFNTYPED@", 10), "", handlers_test::kDepth},
        {"DefaultOutside", kDeclared, "a@IFDEFAULT@b@ENDIF@", "a", errorAt(1, kDefaultOnly)},
        {"NoDefaultInPortBody", kDeclared, "@ITERATE@%PORT%@IFNDEFAULT@@ENDIF@@ENDITERATE@", ", ",
         errorAt(1, kDefaultOnly)},
        {"TypedOutside", kDeclared, "x\n@IFNTYPED@", "x\n", errorAt(2, kTypedOnly)},
        {"WordTakesNoArgument", kDeclared, "@ITERATE@%GENERIC%@IFDEFAULT x@@ENDIF@@ENDITERATE@", "",
         errorAt(1, "Keyword: @IFDEFAULT x@ is not a valid Variable or Directive name.")}}),
    rowName);

const std::string kIfPortForm = errorAt(
    1, "Invalid syntax for @IFPORT or @IFNPORT directive, must be of the form:\n@IFPORT PATTERN@");
const std::string kIfPortAlternative =
    errorAt(1,
            "Invalid syntax for @IFPORT or @IFNPORT directive, an alternative is empty:\n"
            "@IFPORT PATTERN|PATTERN@");

INSTANTIATE_TEST_SUITE_P(
    IfPort, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"CaseRuleOfIfHas", kOnePort,
         "@ITERATE@%PORT%@IFPORT clk*@1@ENDIF@@SET CASESENSITIVEIF=OFF@"
         "@IFPORT clk*@2@ENDIF@@ENDITERATE@",
         "2"},
        {"DeclaredNameNotMapped", kOnePort,
         "@MAPSIGNAL Clk_In TO x@@MAP@@ITERATE@%PORT%@IFPORT x@1@ENDIF@"
         "@IFPORT Clk_In@@ITERATOR@@ENDIF@@ENDITERATE@",
         "x"},
        {"EachBitOfExpandedBus", kVerilog,
         "@EXPANDBUS@@ITERATE@%IPORT%@IFPORT d@@ITERATOR@@ENDIF@@ENDITERATE@",
         ", d_7_, d_6_, d_5_, d_4_, d_3_, d_2_, d_1_, d_0_"},
        {"NestsWithIfHas", kOnePort,
         "@ITERATE@%PORT%@IFHAS PORT=Clk_In@@IFNPORT zz@@IFPORT *@x@ENDIF@@ENDIF@@ENDIF@"
         "@ENDITERATE@",
         "x"},
        {"FailedBlockCountsIt", kOnePort,
         "@IFHAS PORT=zz@@IFPORT@@IFNPORT a b@@ENDIF@@ENDIF@@ENDIF@<>", "<>"},
        {"FailedBlockOutsideIteration", kOnePort, "@IFHAS PORT=zz@@IFPORT x@@ENDIF@@ENDIF@.", "."},
        {"Outside", kOnePort, "@IFPORT x@@ENDIF@", "",
         errorAt(1, "@IFPORT and @IFNPORT" + kPortsOnly)},
        {"InGenericBody", kVhdl, "@ITERATE@%GENERIC%@IFNPORT x@@ENDIF@@ENDITERATE@", "",
         errorAt(1, "@IFPORT and @IFNPORT" + kPortsOnly)},
        {"NoPattern", kOnePort, "@ITERATE@%PORT%@IFPORT@@ENDIF@@ENDITERATE@", "", kIfPortForm},
        {"TwoPatterns", kOnePort, "@ITERATE@%PORT%@IFPORT a b@@ENDIF@@ENDITERATE@", "",
         kIfPortForm},
        {"EmptyAlternativeBetween", kOnePort, "@ITERATE@%PORT%@IFPORT a||b@@ENDIF@@ENDITERATE@", "",
         kIfPortAlternative},
        {"EmptyLastAlternative", kOnePort, "@ITERATE@%PORT%@IFPORT a|@@ENDIF@@ENDITERATE@", "",
         kIfPortAlternative},
        {"LoneBar", kOnePort, "@ITERATE@%PORT%@IFPORT |@@ENDIF@@ENDITERATE@", "",
         kIfPortAlternative}}),
    rowName);

// Does the port's name match the pattern?
TEST(IfPort, Patterns) {
  const std::tuple<const char*, const char*, bool> rows[] = {{"clk", "clk", true},
                                                             {"clk", "clk*", true},
                                                             {"clk_a", "clk*", true},
                                                             {"sclk", "clk*", false},
                                                             {"sys_clk", "*_clk", true},
                                                             {"clk", "*_clk", false},
                                                             {"rst_n", "*_n", true},
                                                             {"rst_n", "r?t_?", true},
                                                             {"rst", "r?t_?", false},
                                                             {"a", "?", true},
                                                             {"", "*", true},
                                                             {"ab", "?", false},
                                                             {"abcbc", "a*bc", true},
                                                             {"abcbd", "a*bc", false},
                                                             {"aXbXc", "*X*X*", true},
                                                             {"aXb", "*X*X*", false},
                                                             {"a*b", "a\\*b", false},
                                                             {"mississippi", "*ss*ss*i", true},
                                                             {"Data", "data", false},
                                                             {"data", "d**a", true},
                                                             {"sys_clk", "clk*|*clk", true},
                                                             {"x_clk_i", "clk*|*clk|*_clk_i", true},
                                                             {"clkx", "a|*x", true},
                                                             {"b", "a|b", true},
                                                             {"a|b", "a|b", false},
                                                             {"ab", "a|b", false},
                                                             {"a|b", "a?b", true}};
  for (const auto& [name, pattern, matches] : rows) {
    const std::string templateText = std::string("@ITERATE@%PORT%@IFPORT ") + pattern +
                                     "@y@ENDIF@@IFNPORT " + pattern + "@n@ENDIF@@ENDITERATE@";
    EXPECT_EQ(handlers_test::runOn(templateText, Design{{{name, -1, -1, 'I'}}}).output,
              matches ? "y" : "n")
        << name << " vs " << pattern;
  }
}

const std::string kDataError = rangeError(1, "data", kProblem);

INSTANTIATE_TEST_SUITE_P(
    UnknownRange, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"NamesAndTypesStillWork", kUnknown,
         "%port%|%signal%|@ITERATE@%PORT%@ITERATOR@ : @PORT_MODE@ @PORT_TYPE@@ENDITERATE@|"
         "@IFHAS IPORT=data@y@ENDIF@@MAPSIGNAL data TO d@@MAP@%iport%",
         "en, data, arr, q|en, data, arr, q|en : in std_logic, data : in "
         "std_logic_vector(WIDTH-1 downto 0), arr : out rec_array_t(0 to N-1), q : out "
         "std_logic_vector(3 downto 0)|yen, d"},
        {"ShowRange", kUnknown, "@SHOWRANGE@%iport%", "en, ", kDataError},
        {"ShowRangeInIteration", kUnknown, "@ITERATE@%IPORT%@SHOWRANGE@@ITERATOR@@ENDITERATE@",
         "en, ", kDataError},
        {"ExpandBus", kUnknown, "@EXPANDBUS@%iport%", "en", kDataError},
        {"ExpandBusIteration", kUnknown, "@EXPANDBUS@@ITERATE@%IPORT%x@ENDITERATE@", "x",
         kDataError},
        {"BusList", kUnknown, "%ibusport%", "", kDataError},
        {"ScalarList", kUnknown, "%iscalarport%", "en", kDataError},
        {"ScalarListOfOtherDirection", kUnknown, "%bscalarport%.", "."},
        {"ScalarIteration", kUnknown, "@ITERATE@%SCALARPORT%@ITERATOR@@ENDITERATE@", "en",
         kDataError},
        {"IfHasBusPort", kUnknown, "@IFHAS BUSPORT=data@y@ENDIF@", "", kDataError},
        {"IfHasBusPortWildcard", kUnknown, "@IFHAS IBUSPORT=d?t?@y@ENDIF@", "", kDataError},
        {"IfHasBusPortOtherName", kUnknown, "@IFHAS BUSPORT=q@y@ENDIF@", "y"},
        {"TypeDecOfArrayWritesDeclaredType", kUnknown, "@ITERATE@%OPORT%@VHDL_TYPEDEC@@ENDITERATE@",
         "rec_array_t(0 to N-1), std_logic_vector(3 downto 0)"},
        {"LongProblemKeptWhole",
         {{{"w", -1, -1, 'I', "std_logic_vector(N-1 downto 0)", K::BitVector, PortMode::FromLetter,
            std::string(600, 'p')}}},
         "@EXPANDBUS@%port%",
         "",
         rangeError(1, "w", std::string(600, 'p'))}}),
    rowName);

}  // namespace
