// The command-line front end: reads the switches, opens the run's files, registers the design
// files, checks the required inputs, runs the design flow and decides the exit status.
#pragma once

#include <string_view>

class RunContext;
class UT_CMDARGS;

/// The switch declaration handed to the command-line parser and the text shown after "Usage: ".
inline constexpr const char* kUsageText =
    "pinforge {-lib <libname> {<vhdfile>}} \t[-lang vhdl|verilog] \t[-module <module_name>] "
    "[-prj <project>] [-template <template_file>] \t[-o <stbfile>] [-err <errfile>] "
    "[-deleteonerror] [--nodelist] [--a] [--inc] {-g <name>=<value>} {-D <macro>} {-I <incdir>} "
    "[--list]";

/// One whole run of the program over the process's arguments; returns the exit status (0 on
/// success, 1 when errors occurred). Installs the interrupt handlers and closes the "-err"
/// file, so it is meant to be called once, from main.
int runFrontEnd(int argc, char** argv);

/// Registers the design files of every "-lib" occurrence, each under the library name of its
/// own occurrence, in command-line order; the context's library name ends as the last one.
void registerLibraries(RunContext& context, const UT_CMDARGS& parser);

/// True when the module, project and input file names were given and the output and template
/// streams are open.
bool checkRequiredInputs(const RunContext& context);

/// The declaration of switch `name` in the usage text without its enclosing brackets
/// ("-prj <project>", "-lib <libname> {<vhdfile>}"); empty for an undeclared switch.
std::string_view usageOf(std::string_view name);

/// Reads every -g, -D and -I into the context's reader settings, reporting each malformed one
/// as an error; true when all were well formed.
bool readScanSettings(RunContext& context, const UT_CMDARGS& parser);
