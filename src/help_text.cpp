// The help is assembled at run time because the template list is whatever the search folders
// hold on this machine.
#include "help_text.h"

#include <string_view>
#include <vector>

#include "template_search.h"

#ifndef PINFORGE_VERSION
#define PINFORGE_VERSION "unknown"
#endif

namespace {

constexpr std::string_view kSwitches =
    "\n"
    "Switches:\n"
    "  -lib <libname> {<file>}   register design files under a library; repeatable\n"
    "  -lang <language>          vhdl, verilog, systemverilog or sv (default: vhdl, or verilog "
    "when every design file ends in .v, .sv, .vh or .svh)\n"
    "  -module <module_name>     the entity or module to generate for\n"
    "  -prj <project>            the project name the template writes\n"
    "  -template <template>      a template file, or the name of one in the folders below\n"
    "  -o <file>                 the output file\n"
    "  -err <file>               write the usage and FATAL ERROR lines to this file\n"
    "  -deleteonerror            leave no output of the run's own when it fails\n"
    "  -g <name>=<value>         set a generic or parameter of the unit; repeatable\n"
    "  -D <name>[=<text>]        define a Verilog macro; repeatable\n"
    "  -I <folder>               add a Verilog include folder; repeatable\n"
    "  --list                    list the design units of the files instead of generating\n"
    "  --a                       debug mode: trace file forge.deb and one line per port\n"
    "  --nodelist                accepted; changes nothing\n"
    "  --inc                     accepted; changes nothing\n"
    "  --help                    this text\n"
    "  --version                 the version\n"
    "  -h, -help, -?             the usage line only\n"
    "  @<file>                   take the arguments from a response file\n"
    "\n"
    "Examples:\n"
    "  pinforge -lib work rtl/fifo.vhd -module fifo -prj demo -template vhdl_instance -o "
    "fifo_inst.vhd\n"
    "  pinforge -lang sv -lib work rtl/top.sv -module top -prj demo -g WIDTH=16 -template "
    "verilog_instance -o top_inst.sv\n"
    "\n"
    "A -template that names no file is looked up as <name>, <name>.tmpl and <name>.tcl in these\n"
    "folders, in order (the folders of PINFORGE_TEMPLATE_PATH, separated by ':', come first):\n";

}  // namespace

std::string versionText() { return std::string("pinforge ") + PINFORGE_VERSION + "\n"; }

std::string helpText() {
  std::string text(kSwitches);
  for (const std::string& folder : templateFolders()) text += "  " + folder + "\n";
  text += "\nTemplates:\n";
  const std::vector<std::string> names = availableTemplates();
  if (names.empty()) text += "  (none found)\n";
  for (const std::string& name : names) text += "  " + name + "\n";
  return text;
}
