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

/// Reads every -g, -D and -I into the context's reader settings, reporting each malformed one
/// as an error; true when all were well formed.
bool readScanSettings(RunContext& context, const UT_CMDARGS& parser);
