// Runs one template through a processor over in-memory design data and captures what it wrote:
// the output, the result status, message and warnings, and (on request) the trace lines.
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "engine/forge.h"
#include "support/scratch_dir.h"

namespace handlers_test {

struct PortSpec {
  const char* name;
  int32_t left;
  int32_t right;
  char dir;
};

struct Run {
  std::string output;
  uint32_t status = 0;
  std::string message;
  bool completed = false;
  std::string trace;
  std::vector<std::string> warnings;
};

/// The template name every run here gives the processor.
inline constexpr std::string_view kTemplateName = "t.tmpl";

/// A temporary file holding `text`, positioned at its start. The caller closes it.
inline std::FILE* fileWith(std::string_view text) {
  std::FILE* file = std::tmpfile();
  std::fwrite(text.data(), 1, text.size(), file);
  std::rewind(file);
  return file;
}

using pinforge_test::readBack;

/// Design data with the header values every run here uses (module "top", ext "vhd").
inline StbDataList* newDesignData() {
  return new StbDataList("prj", "top", "out.vhd", "vhd", "pinforge", "", "title", "date");
}

/// Expands `templateText` over `data` with a fresh processor.
inline Run runOn(std::string_view templateText, StbDataList& data, bool traced = false) {
  std::FILE* in = fileWith(templateText);
  std::FILE* out = std::tmpfile();
  std::FILE* debug = traced ? std::tmpfile() : nullptr;
  Run run;
  {
    Forge forge(out, in, debug, &data);
    forge.setTemplateName(kTemplateName);
    run.completed = forge.processTemplate();
    run.status = forge.getResult(run.message);
    run.warnings = forge.warnings();
  }
  run.output = readBack(out);
  if (debug != nullptr) {
    run.trace = readBack(debug);
    std::fclose(debug);
  }
  std::fclose(out);
  std::fclose(in);
  return run;
}

/// Expands `templateText` over `ports` with a fresh processor (module "top", ext "vhd").
inline Run runTemplate(std::string_view templateText, const std::vector<PortSpec>& ports,
                       bool traced = false) {
  const std::unique_ptr<StbDataList> data(newDesignData());
  for (const PortSpec& p : ports) data->appendOwned(new PortRecord(p.name, p.left, p.right, p.dir));
  return runOn(templateText, *data, traced);
}

/// The message recorded for a template error on `line`.
inline std::string errorAt(int line, std::string_view text) {
  std::string message = "Error - Syntax error in template file line " + std::to_string(line) + "\n";
  message += text;
  message += '\n';
  return message;
}

inline const std::string kNoError = "No errors or warnings";

}  // namespace handlers_test
