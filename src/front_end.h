// The command-line front end: reads the switches, opens the run's files, registers the design
// files, checks the required inputs, runs the design flow and decides the exit status.
#pragma once

class RunContext;
class UT_CMDARGS;

/// The switch declaration handed to the command-line parser and the text shown after "Usage: ".
inline constexpr const char* kUsageText =
    "pinforge {-lib <libname> {<vhdfile>}} \t[-lang vhdl|verilog] \t[-module <module_name>] "
    "[-prj <project>] [-template <template_file>] \t[-o <stbfile>] [-err <errfile>] "
    "[-deleteonerror] [--nodelist] [--a] [--inc]";

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
