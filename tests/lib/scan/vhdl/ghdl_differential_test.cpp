// Holds the VHDL reader against GHDL. For every design (each fixture file, and a few with -g
// overrides) GHDL's own parse tree gives each entity's port names, modes, type marks and
// lines, and a generated probe architecture, elaborated with the generic values, reports each
// port's bounds; the extractor must agree on all of it.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <iostream>
#include <memory>
#include <regex>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/scan.h"
#include "support/diff_tools.h"
#include "support/ghdl_xml.h"

namespace {

using namespace difftest;
using Overrides = std::vector<std::pair<std::string, std::string>>;

struct Design {
  std::string file;
  std::string unit;  ///< the one entity compared; empty for every entity of the file
  Overrides overrides;
};

std::vector<Design> designs() {
  std::vector<Design> all;
  for (const std::string& file : fixtureFiles("vhdl", {".vhd", ".vhdl"}))
    all.push_back({file, "", {}});
  const std::string top = sourceDir() + "/tests/fixtures/vhdl/describe_top.vhd";
  all.push_back({top, "describe_open", {{"WIDTH", "3"}}});
  all.push_back({top, "describe_open", {{"width", "0"}, {"DEPTH", "7"}}});
  all.push_back({top, "describe_top", {{"XLEN", "64"}, {"HALF", "5"}}});
  return all;
}

void PrintTo(const Design& design, std::ostream* out) { *out << design.file; }

std::string designName(const ::testing::TestParamInfo<Design>& info) {
  std::string name = info.param.file;
  for (const auto& [generic, value] : info.param.overrides) name += "_" + generic + "_" + value;
  return fixtureTestName(name);
}

// How a probe line asks GHDL about a port. A line GHDL does not analyse is retried with the
// next kind, so no guess about the port's type is needed.
enum class Probe {
  Array,       // integer-indexed array: 'left, 'right and 'ascending of the object
  Scalar,      // scalar subtype: its bounds through 'image, whatever the type
  Positional,  // array with an enumeration index: only 'length and 'ascending are integers
  Opaque,      // records: nothing to compare but "no range"
};

struct ProbedEntity {
  const GhdlEntity* entity;
  std::vector<Probe> probes;
};

// The fields of the probe line of one port; kind is 0 when none came.
struct Report {
  char kind = 0;  ///< 'A', 'S', 'E' or 'N' as the probe kinds above
  std::string field[3];
};

const char* const kProbeArchitecture = "pinforge_probe";

std::string probeLine(size_t index, const std::string& port, Probe probe) {
  const std::string head = "    report \"P|" + std::to_string(index) + "|";
  switch (probe) {
    case Probe::Array:
      return head + "A|\" & integer'image(" + port + "'left) & \"|\" & integer'image(" + port +
             "'right) & \"|\" & boolean'image(" + port + "'ascending);\n";
    case Probe::Scalar: {
      // No 'ascending here: GHDL 2.0 crashes on it for a subtype that depends on generics.
      const std::string type = port + "'subtype";
      return head + "S|\" & " + type + "'image(" + type + "'left) & \"|\" & " + type + "'image(" +
             type + "'right);\n";
    }
    case Probe::Positional:
      return head + "E|\" & integer'image(" + port + "'length) & \"|\" & boolean'image(" + port +
             "'ascending);\n";
    case Probe::Opaque:
      break;
  }
  return head + "N\";\n";
}

bool isInteger(const std::string& image) {
  static const std::regex integer("-?[0-9]+");
  return std::regex_match(image, integer);
}

std::vector<Report> parseReports(const std::string& output, size_t portCount) {
  static const std::regex line(
      R"(\(report note\): P\|([0-9]{1,9})\|([ASEN])(?:\|([^|\n]*))?(?:\|([^|\n]*))?(?:\|([^|\n]*))?)");
  std::vector<Report> reports(portCount);
  for (std::sregex_iterator it(output.begin(), output.end(), line), end; it != end; ++it) {
    const size_t index = std::stoul((*it)[1]);
    if (index < portCount) reports[index] = {(*it)[2].str()[0], {(*it)[3], (*it)[4], (*it)[5]}};
  }
  return reports;
}

std::string withoutComments(const std::string& text) {
  static const std::regex comment("--[^\n]*");
  return std::regex_replace(text, comment, "");
}

// Whether the comment-free `text` has a match of `pattern`, letter case ignored.
bool declares(const std::string& text, const char* pattern) {
  return std::regex_search(withoutComments(text), std::regex(pattern, std::regex::icase));
}

// A package of its own (not a package body or instantiation): files that declare one are
// analysed ahead of every design so designs can use packages from other files.
const char* const kPackageHeader = R"((^|[^.\w])package\s+\w+\s+is\s(?!\s*new\b))";
const char* const kEntityHeader = R"((^|[^.\w])entity\s+(\w+|\\[^\\]+\\)\s+is\b)";

// Adds the library names of the library clauses of `text` other than the predefined ones.
void addNamedLibraries(const std::string& text, std::set<std::string>& libraries) {
  static const std::regex clause(R"((^|[^.\w])library\s+(\w+(\s*,\s*\w+)*)\s*;)",
                                 std::regex::icase);
  static const std::regex word("\\w+");
  const std::string code = withoutComments(text);
  for (std::sregex_iterator it(code.begin(), code.end(), clause), end; it != end; ++it) {
    const std::string names = (*it)[2];
    for (std::sregex_iterator w(names.begin(), names.end(), word); w != end; ++w) {
      const std::string library = lowerCase(w->str());
      if (library != "ieee" && library != "std" && library != "work") libraries.insert(library);
    }
  }
}

std::string rangeText(const ScanPort& port) {
  if (!port.hasRange()) return "no range";
  int32_t left = 0;
  int32_t right = 0;
  port.getBounds(left, right);
  return std::to_string(left) + (port.isAscending() ? " to " : " downto ") + std::to_string(right);
}

std::string theirRange(const Report& r) {
  if (r.kind == 0) return "nothing reported";
  const std::string &left = r.field[0], &right = r.field[1];
  if ((r.kind != 'A' && r.kind != 'S') || !isInteger(left) || !isInteger(right)) return "no range";
  const bool ascending =
      r.kind == 'A' ? r.field[2] == "true" : std::stoll(left) <= std::stoll(right);
  return left + (ascending ? " to " : " downto ") + right;
}

// Whether our range says what GHDL's report does, in whatever form each can give.
bool rangeAgrees(const ScanPort& ours, const Report& r, bool constrained) {
  const std::string range = rangeText(ours);
  if (r.kind != 0 && range == theirRange(r)) return true;
  // An enumeration index has no integer bounds: positions of the right length and direction.
  if (r.kind == 'E' && ours.hasRange() && isInteger(r.field[0])) {
    int32_t left = 0;
    int32_t right = 0;
    ours.getBounds(left, right);
    const long long span = ours.isAscending() ? 1LL + right - left : 1LL + left - right;
    return std::max(span, 0LL) == std::stoll(r.field[0]) &&
           (ours.isAscending() != 0) == (r.field[1] == "true");
  }
  if (r.kind != 'S') return false;
  // A scalar type mark without a constraint of its own (integer, natural, a named integer
  // subtype) need not be reported as a range; and a scalar probe cannot tell "5 to 5" from
  // "5 downto 5".
  return (!constrained && !ours.hasRange()) || (isInteger(r.field[0]) && r.field[0] == r.field[1] &&
                                                range == r.field[0] + " downto " + r.field[1]);
}

std::string lineText(const GhdlPort& port) {
  // A declaration that lists several names may be reported at any of their lines.
  return "line " + std::to_string(port.firstLineOfList) +
         (port.firstLineOfList != port.line ? ".." + std::to_string(port.line) : "");
}

// GHDL's range and what kind of probe gave it.
std::string theirRangeField(const Report& r) {
  static const char* const kKinds[] = {"", " (array)", " (scalar)", " (enumeration-indexed)",
                                       " (record)"};
  return theirRange(r) + kKinds[r.kind == 0 ? 0 : std::string_view("ASEN").find(r.kind) + 1];
}

std::string theirPort(const GhdlPort& port, const Report& r) {
  return lowerCase(port.name) + " " + port.mode + " " + lowerCase(port.typeMark) + " " +
         lineText(port) + " " + theirRangeField(r) + "\n";
}

// Our port in the words of theirPort; where the two differ only in form, ours takes GHDL's.
std::string ourPort(const ScanPort& port, const GhdlPort* theirs, const Report* r) {
  static const char* const kModes[] = {"?", "in", "out", "inout", "buffer", "linkage"};
  const int direction = port.direction();
  const int line = port.sourceLine();
  return lowerCase(port.name()) + " " +
         (direction >= 1 && direction <= 5 ? kModes[direction] : std::to_string(direction)) + " " +
         lowerCase(port.typeName()) + " " +
         (theirs && line >= theirs->firstLineOfList && line <= theirs->line
              ? lineText(*theirs)
              : "line " + std::to_string(line)) +
         " " +
         (theirs && rangeAgrees(port, *r, theirs->constrained) ? theirRangeField(*r)
                                                               : rangeText(port)) +
         "\n";
}

class GhdlDifferential : public ::testing::TestWithParam<Design> {
 public:
  // Every file that declares a package goes into a shared library directory, once into
  // "work" and once into each library some fixture names. Files are retried while any
  // succeeds, so packages that use each other need no particular file order.
  static void SetUpTestSuite() {
    s_Ghdl = findTool("ghdl");
    if (s_Ghdl.empty()) return;
    s_Root = std::make_unique<ScratchDir>();
    if (!s_Root->makeDir("shared")) return;
    std::vector<std::string> packageFiles;
    std::set<std::string> libraries{"work"};
    for (const std::string& file : fixtureFiles("vhdl", {".vhd", ".vhdl"})) {
      std::string text;
      if (!readFile(file, text)) continue;
      if (declares(text, kPackageHeader)) packageFiles.push_back(file);
      addNamedLibraries(text, libraries);
    }
    for (const std::string& library : libraries) {
      std::vector<std::string> pending = packageFiles;
      for (size_t before = 0; before != pending.size();) {
        before = pending.size();
        std::erase_if(pending, [&](const std::string& file) {
          if (ghdl({"-a", "--work=" + library, file}, s_Root->file("shared")).status != 0)
            return false;
          if (library == "work") s_PackageFiles.push_back(file);
          return true;
        });
      }
    }
  }

  static void TearDownTestSuite() {
    s_Root.reset();
    s_PackageFiles.clear();
  }

 protected:
  static ToolRun ghdl(std::vector<std::string> args, const std::string& workdir) {
    args.insert(args.begin() + 1,
                {"--std=08", "-frelaxed", "--workdir=" + workdir, "-P" + workdir});
    args.insert(args.begin(), s_Ghdl);
    // Inside the work directory: GHDL's code-generating back ends write executables there.
    return runTool(args, workdir);
  }

  // A copy of the shared libraries, so units of the same name in different designs never
  // meet.
  static std::string copyOfShared(const std::string& name) {
    const std::string dir = s_Root->file(name);
    std::error_code error;
    std::filesystem::copy(s_Root->file("shared"), dir, error);
    return dir;
  }

  // Writes a probe architecture for each entity and analyses them together, downgrading the
  // probe of every line GHDL rejects until the file analyses.
  static bool analyseProbes(const std::string& workdir, std::vector<ProbedEntity>& entities) {
    // Every round changes something, so this ends; the bound only guards against surprises.
    for (int round = 0; round < 64; ++round) {
      std::string text;
      std::vector<Probe*> atLine(1, nullptr);
      for (ProbedEntity& e : entities) {
        text += std::string("architecture ") + kProbeArchitecture + " of " + e.entity->name +
                " is\nbegin\n  process\n  begin\n";
        atLine.resize(atLine.size() + 4, nullptr);
        for (size_t p = 0; p < e.probes.size(); ++p) {
          text += probeLine(p, e.entity->ports[p].name, e.probes[p]);
          atLine.push_back(&e.probes[p]);
        }
        text += "    wait;\n  end process;\nend architecture;\n";
        atLine.resize(atLine.size() + 3, nullptr);
      }
      if (!writeFile(workdir + "/pinforge_probe.vhd", text)) return false;
      const ToolRun run = ghdl({"-a", workdir + "/pinforge_probe.vhd"}, workdir);
      if (run.status == 0) return true;
      bool changed = false;
      std::set<size_t> handled;
      // The last mention of the probe file in a message line names the line at fault; one
      // step per line and round.
      static const std::regex mention(
          R"(pinforge_probe\.vhd:([0-9]{1,9}):[0-9]+:(?!.*pinforge_probe\.vhd:[0-9]+:[0-9]+:))");
      for (std::sregex_iterator it(run.output.begin(), run.output.end(), mention), end; it != end;
           ++it) {
        const size_t line = std::stoul((*it)[1]);
        if (line >= atLine.size() || !handled.insert(line).second) continue;
        Probe* probe = atLine[line];
        if (probe != nullptr && *probe != Probe::Opaque) {
          *probe = static_cast<Probe>(static_cast<int>(*probe) + 1);
          changed = true;
        }
      }
      if (!changed) {
        ADD_FAILURE() << "the probe architectures do not analyse:\n" << run.output;
        return false;
      }
    }
    return false;
  }

  static void compareEntity(const std::string& where, const GhdlEntity& entity,
                            const std::vector<Report>& reports, const ScanPortList& ours) {
    std::string theirs;
    for (size_t i = 0; i < entity.ports.size(); ++i)
      theirs += theirPort(entity.ports[i], reports[i]);
    std::string mine;
    for (const ScanPort* port = ours.firstPort(); port != nullptr; port = ours.nextPort(port)) {
      size_t i = 0;
      while (i < entity.ports.size() && lowerCase(entity.ports[i].name) != lowerCase(port->name()))
        ++i;
      mine += i < entity.ports.size() ? ourPort(*port, &entity.ports[i], &reports[i])
                                      : ourPort(*port, nullptr, nullptr);
    }
    EXPECT_EQ(mine, theirs) << where << " (ours, then GHDL's)";
  }

  static std::string s_Ghdl;
  static std::unique_ptr<ScratchDir> s_Root;
  static std::vector<std::string> s_PackageFiles;
};

std::string GhdlDifferential::s_Ghdl;
std::unique_ptr<ScratchDir> GhdlDifferential::s_Root;
std::vector<std::string> GhdlDifferential::s_PackageFiles;

TEST_P(GhdlDifferential, PortsMatchGhdl) {
  DIFFTEST_REQUIRE_TOOL(s_Ghdl, "ghdl");
  ASSERT_TRUE(s_Root && s_Root->exists("shared")) << "no scratch directory";
  const Design& design = GetParam();
  const std::string& file = design.file;
  std::string text;
  ASSERT_TRUE(readFile(file, text)) << file;
  if (!declares(text, kEntityHeader)) GTEST_SKIP() << file << " declares no entity";
  const std::string workdir = copyOfShared(designName({design, 0}));
  const ToolRun analysis = ghdl({"-a", file}, workdir);
  if (analysis.status != 0)
    GTEST_SKIP() << "GHDL rejects " << file << ": " << firstErrorLine(analysis.output);
  const ToolRun dump = ghdl({"--file-to-xml", file}, workdir);
  ASSERT_EQ(dump.status, 0) << "ghdl --file-to-xml failed: " << firstErrorLine(dump.output);
  std::vector<GhdlEntity> entities;
  ASSERT_TRUE(readGhdlEntities(dump.output, file, entities)) << "unreadable GHDL dump";

  std::vector<ProbedEntity> probed;
  for (const GhdlEntity& entity : entities) {
    if (!design.unit.empty() && entity.name != design.unit) continue;
    // GHDL elaborates a generic without a value from its type's first value; ours has none.
    std::string unset;
    for (const std::string& generic : entity.genericsWithoutDefault) {
      bool given = false;
      for (const auto& [name, value] : design.overrides)
        given = given || lowerCase(name) == lowerCase(generic);
      if (!given) unset = generic;
    }
    if (!unset.empty())
      std::cout << "  note: " << file << ": entity " << entity.name << " left out: generic "
                << unset << " has no value\n";
    else
      probed.push_back({&entity, std::vector<Probe>(entity.ports.size(), Probe::Array)});
  }
  if (probed.empty()) GTEST_SKIP() << file << " has no entity GHDL can elaborate on its own";
  if (!analyseProbes(workdir, probed)) return;

  ScanExtractor extractor;
  extractor.configure({design.overrides, {}, {}});
  extractor.addDesignFile("work", file.c_str(), ScanExtractor::Vhdl);
  for (const std::string& package : s_PackageFiles)
    if (package != file) extractor.addDesignFile("work", package.c_str(), ScanExtractor::Vhdl);
  extractor.Parse(ScanExtractor::Vhdl);

  int compared = 0;
  for (const ProbedEntity& probe : probed) {
    const GhdlEntity& entity = *probe.entity;
    std::vector<std::string> args{"--elab-run", entity.name, kProbeArchitecture};
    for (const auto& [name, value] : design.overrides) args.push_back("-g" + name + "=" + value);
    const ToolRun run = ghdl(args, workdir);
    if (run.status != 0) {
      std::cout << "  note: " << file << ": entity " << entity.name
                << " left out, GHDL cannot elaborate it as top: " << firstErrorLine(run.output)
                << "\n";
      continue;
    }
    ++compared;
    const bool found =
        extractor.selectDesignUnit("work", entity.name.c_str(), ScanExtractor::SearchAllLibraries);
    compareEntity(file + ": entity " + entity.name + " (line " + std::to_string(entity.line) +
                      (found ? ")" : "), not found by ours"),
                  entity, parseReports(run.output, entity.ports.size()), *extractor.getPorts());
  }
  if (compared == 0) GTEST_SKIP() << "GHDL elaborates no entity of " << file;
}

INSTANTIATE_TEST_SUITE_P(Designs, GhdlDifferential, ::testing::ValuesIn(designs()), designName);

// The dump reader: a port whose type mark it lost would be compared on nothing.
TEST(GhdlDumpReader, ReadsEntityHeadersOfTheNamedFileOnly) {
  const std::string xml = R"(<?xml version="1.0"?>
<root>
 <library_unit kind="entity_declaration" file="/x/a.vhd" line="2" identifier="top">
  <generic_chain>
   <el kind="interface_constant_declaration" identifier="w"><default_value kind="lit"/></el>
   <el kind="interface_constant_declaration" identifier="n"></el>
  </generic_chain>
  <port_chain>
   <el line="4" identifier="a" mode="in" has_identifier_list="true">
    <subtype_indication kind="array_subtype_definition">
     <subtype_type_mark kind="simple_name" identifier="std_logic_vector"/>
    </subtype_indication>
   </el>
   <el line="5" identifier="b" mode="in" has_identifier_list="false">
    <subtype_indication ref="7"/>
   </el>
   <el line="6" identifier="\x&#x26;y\" mode="buffer" has_identifier_list="false">
    <subtype_indication kind="selected_name" identifier="word_t">
     <prefix kind="simple_name" identifier="pkg"/>
    </subtype_indication>
   </el>
  </port_chain>
 </library_unit>
 <library_unit kind="entity_declaration" file="/x/other.vhd" identifier="elsewhere"/>
</root>
)";
  std::vector<GhdlEntity> entities;
  ASSERT_TRUE(readGhdlEntities(xml, "/x/a.vhd", entities));
  ASSERT_EQ(entities.size(), 1u);
  EXPECT_EQ(entities[0].name, "top");
  EXPECT_EQ(entities[0].genericsWithoutDefault, std::vector<std::string>{"n"});
  std::string ports;
  for (const GhdlPort& p : entities[0].ports)
    ports += p.name + " " + p.mode + " " + std::to_string(p.firstLineOfList) + ".." +
             std::to_string(p.line) + " " + p.typeMark + (p.constrained ? " constrained\n" : "\n");
  EXPECT_EQ(ports,
            "a in 4..4 std_logic_vector constrained\nb in 4..5 std_logic_vector constrained\n"
            "\\x&y\\ buffer 6..6 word_t\n");
}

}  // namespace
