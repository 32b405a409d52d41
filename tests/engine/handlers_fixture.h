// Runs one template through a processor over an in-memory design and captures what it wrote,
// and the table every template suite fills: one row per template, its whole output and either a
// clean finish or the exact message with its line; and the loader of the case files that hold
// most rows (template_language_cases.txt, design_words_cases.txt).
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <map>
#include <memory>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>
#include <vector>

#include "engine/forge.h"
#include "support/case_file.h"
#include "support/scratch_dir.h"

namespace handlers_test {

/// A port as a reader hands it over; what the declaration says beyond bounds is optional.
struct Port {
  std::string name;
  int32_t left;
  int32_t right;
  char dir;
  std::string type = {};
  PortTypeKind kind = PortTypeKind::Other;
  PortMode mode = PortMode::FromLetter;
  std::optional<std::string> rangeProblem = {};  // set: the range could not be evaluated
};

struct Design {
  std::vector<Port> ports;
  std::vector<GenericRecord> generics = {};
  std::string context = {};
  DesignLanguage language = DesignLanguage::Vhdl;
};

struct Run {
  std::string output;
  uint32_t status = 0;
  std::string message;
  bool completed = false;
  std::string trace;
  std::vector<std::string> warnings;
};

/// A temporary file holding `text`, positioned at its start. The caller closes it.
inline std::FILE* fileWith(std::string_view text) {
  std::FILE* file = std::tmpfile();
  std::fwrite(text.data(), 1, text.size(), file);
  std::rewind(file);
  return file;
}

/// `design` as the program hands it to the processor (module "top", ext "vhd").
inline std::unique_ptr<StbDataList> build(const Design& design) {
  auto data = std::make_unique<StbDataList>("prj", "top", "out.vhd", "vhd", "pinforge", "", "title",
                                            "date");
  data->m_Language = design.language;
  data->m_Generics = design.generics;
  data->m_Context = design.context;
  for (const Port& p : design.ports) {
    auto* record = new PortRecord(p.name, p.left, p.right, p.dir);
    record->m_DeclaredType = p.type;
    record->m_Kind = p.kind;
    record->m_Mode = p.mode;
    if (p.rangeProblem) record->setRangeUnknown(*p.rangeProblem);
    data->appendOwned(record);
  }
  return data;
}

/// Expands `templateText` (named t.tmpl) over `design` with a fresh processor.
inline Run runOn(std::string_view templateText, const Design& design, bool traced = false) {
  const std::unique_ptr<StbDataList> data = build(design);
  std::FILE* in = fileWith(templateText);
  std::FILE* out = std::tmpfile();
  std::FILE* debug = traced ? std::tmpfile() : nullptr;
  Run run;
  {
    Forge forge(out, in, debug, data.get());
    forge.setTemplateName("t.tmpl");
    run.completed = forge.processTemplate();
    run.status = forge.getResult(run.message);
    run.warnings = forge.warnings();
  }
  run.output = pinforge_test::readBack(out);
  if (debug != nullptr) {
    run.trace = pinforge_test::readBack(debug);
    std::fclose(debug);
  }
  std::fclose(out);
  std::fclose(in);
  return run;
}

/// The message recorded for a template error on `line`.
inline std::string errorAt(int line, std::string_view text) {
  return "Error - Syntax error in template file line " + std::to_string(line) + "\n" +
         std::string(text) + "\n";
}

inline const std::string kNoError = "No errors or warnings";

/// "x" inside `depth` nested blocks: `outermost`, @IFHAS PORT=*@ blocks, then `innermost`.
inline std::string nested(int depth, const std::string& innermost = "@IFHAS PORT=*@",
                          const std::string& outermost = "@IFHAS PORT=*@") {
  std::string text = outermost;
  for (int i = 2; i < depth; ++i) text += "@IFHAS PORT=*@";
  text += innermost + "x";
  for (int i = 0; i < depth; ++i) text += "@ENDIF@";
  return text;
}

inline const std::string kDepth =
    errorAt(1, "Maximum number of nested @IFHAS or @IFNHAS directives exceeded.");

struct Row {
  std::string name;
  Design design;
  std::string templateText;
  std::string output;
  std::string message = {};  // empty: the run finishes without error
  std::string warning = {};  // the one warning the run gives; empty: none
};

class TemplateTest : public ::testing::TestWithParam<Row> {};

inline std::string rowName(const ::testing::TestParamInfo<Row>& param) { return param.param.name; }

/// Names a row in failure reports instead of dumping its bytes.
inline void PrintTo(const Row& row, std::ostream* out) { *out << row.name; }

/// The ports of `list`, "I a, O d[1:0]": a direction letter and a name with a bus's bounds.
inline bool parsePorts(const std::string& list, std::vector<Port>& ports) {
  for (size_t at = 0, end = 0; at < list.size(); at = end + 2) {
    end = std::min(list.find(", ", at), list.size());
    const std::string item = list.substr(at, end - at);
    const size_t open = std::min(item.find('['), item.size());
    if (item.size() < 3 || std::string_view("IOBN").find(item[0]) == std::string::npos ||
        item[1] != ' ')
      return false;
    Port& port = ports.emplace_back(Port{item.substr(2, open - 2), -1, -1, item[0]});
    if (open == item.size()) continue;
    const char* const last = item.data() + item.size() - 1;
    const auto left = std::from_chars(item.data() + open + 1, last, port.left);
    if (left.ec != std::errc() || left.ptr == last || *left.ptr != ':' || *last != ']')
      return false;
    const auto right = std::from_chars(left.ptr + 1, last, port.right);
    if (right.ec != std::errc() || right.ptr != last) return false;
  }
  return true;
}

/// The rows of `name` in tests/engine, a file whose first lines describe its format, over plain
/// ports or `designs` by name. A file or line that cannot be read gives a row that fails.
inline std::vector<Row> rowsFromFile(const std::string& name,
                                     const std::map<std::string, Design>& designs = {}) {
  std::vector<pinforge_test::CaseBlock> blocks;
  if (!pinforge_test::readCaseFile("tests/engine/" + name, blocks))
    return {{"CaseFileUnreadable", {}, "", name + " cannot be read"}};
  std::vector<Row> rows;
  std::vector<Row> faults;
  for (const pinforge_test::CaseBlock& block : blocks) {
    Row& row = rows.emplace_back(Row{block.label, {}, "", ""});
    std::string* into = &row.templateText;
    for (const pinforge_test::CaseSection& section : block.sections) {
      const std::string& directive = section.directive;
      const std::string word = directive.substr(0, directive.find(' '));
      const std::string value = directive.substr(std::min(word.size() + 1, directive.size()));
      if (directive == "output" || directive == "message") {
        into = directive == "output" ? &row.output : &row.message;
      } else if (word == "warning") {
        row.warning = value;
      } else if (word == "design" && designs.count(value) != 0) {
        row.design = designs.at(value);
      } else if (!directive.empty() && word != "note" &&
                 !(word == "ports" && parsePorts(value, row.design.ports))) {
        faults.push_back({"CaseFileLine" + std::to_string(section.line),
                          {},
                          "",
                          "--- " + directive + ": not understood"});
      }
      // Option lines come before the text they qualify, which goes on where it was.
      *into += section.text;
    }
  }
  if (rows.empty()) faults.push_back({"CaseFileEmpty", {}, "", name + " holds no case"});
  rows.insert(rows.end(), faults.begin(), faults.end());
  return rows;
}

}  // namespace handlers_test
