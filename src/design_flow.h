// A run from the registered design files to the finished output: parse, look the unit up,
// prepare the header values, build the port list, then expand the template or run the Tcl path.
#pragma once

#include <string_view>

class RunContext;

/// The whole flow, then the trace file's checked close; true when the run's error count is
/// still 0.
bool runDesignFlow(RunContext& context);
/// The flow's stages in order, stopping at the first that fails.
bool runStages(RunContext& context);
/// Reports each design file that could not be read as an error; true when there was none.
bool reportUnreadableFiles(RunContext& context);
/// Reads the found unit's header; an error in it fails the run rather than giving a port list
/// that cannot be trusted. True when the header was read cleanly.
bool checkUnitHeader(RunContext& context);
/// Puts the output in place before the Tcl path, whose script writes the output by name.
bool handOverOutput(RunContext& context);
/// "Unable to <action> output file <name>: <why>" as an error.
void reportOutputFailure(RunContext& context, std::string_view action, std::string_view why);
/// Opens the trace file in debug mode and creates the design data with its header values.
bool prepareRun(RunContext& context);
/// Expands a non-Tcl template with the template processor.
bool runTemplateEngine(RunContext& context);
/// Appends one port record per extracted port to the design data.
bool buildPortList(RunContext& context);
