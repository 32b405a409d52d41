// The case files of the table-driven suites: plain text in, expected text out, so a case reads
// like the input and output it is about. The layout is shared; what each section means is the
// suite's (each file says so in the paragraph it opens with).
#pragma once

#include <cstdlib>
#include <string>
#include <vector>

#include "support/scratch_dir.h"

namespace pinforge_test {

/// One part of a case: the text below a "--- <directive>" line (the first part, before any
/// such line, has an empty directive). Each text line ends in a line break unless the line
/// "\ No newline at end of file" follows it.
struct CaseSection {
  std::string directive;
  std::string text;
  size_t line = 0;  ///< of the directive, for messages
};

/// One case: "=== <label>" and the sections up to the next case.
struct CaseBlock {
  std::string label;
  size_t line = 0;  ///< of the label, for messages
  std::vector<CaseSection> sections;
};

/// The cases of the file at `relative` in the source tree; the lines before the first label
/// describe the format and are skipped. False when the file cannot be read.
inline bool readCaseFile(const std::string& relative, std::vector<CaseBlock>& cases) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  std::string data;
  if (!readFile(std::string(root ? root : ".") + "/" + relative, data)) return false;
  for (size_t at = 0, end = 0, number = 1; at < data.size(); at = end + 1, ++number) {
    end = std::min(data.find('\n', at), data.size());
    const std::string line = data.substr(at, end - at);
    if (line.rfind("=== ", 0) == 0) {
      cases.push_back({line.substr(4), number, {{"", "", number}}});
    } else if (cases.empty()) {
      continue;
    } else if (line.rfind("--- ", 0) == 0) {
      cases.back().sections.push_back({line.substr(4), "", number});
    } else if (line == "\\ No newline at end of file") {
      std::string& text = cases.back().sections.back().text;
      if (!text.empty()) text.pop_back();
    } else {
      cases.back().sections.back().text += line + "\n";
    }
  }
  return true;
}

}  // namespace pinforge_test
