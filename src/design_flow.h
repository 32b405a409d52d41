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
/// Reports, as a warning, the -lang the design files seem to need, if any.
void reportLanguageHint(RunContext& context);
/// Reports each -g that names no generic of the found unit as an error, listing the unit's
/// generics; true when every -g names one. Valid after checkUnitHeader.
bool checkGenericOverrides(RunContext& context);
/// Puts the output in place before the Tcl path, whose script writes the output by name.
bool handOverOutput(RunContext& context);
/// "Unable to <action> output file <name>: <why>" as an error.
void reportOutputFailure(RunContext& context, std::string_view action, std::string_view why);
/// Opens the trace file in debug mode and creates the design data with its header values.
bool prepareRun(RunContext& context);
/// Expands a non-Tcl template with the template processor.
bool runTemplateEngine(RunContext& context);
/// Appends one port record per extracted port to the design data, with its declared type,
/// kind, mode and, for a range that could not be evaluated, the reader's problem text.
bool buildPortList(RunContext& context);
/// Gives the design data the unit's language, generics and context. A generic's value is its
/// -g text when one was given, else its evaluated value, else its default text.
void buildUnitData(RunContext& context);
