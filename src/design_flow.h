// A run from the registered design files to the finished output: parse, look the unit up,
// prepare the header values, build the port list, then expand the template or run the Tcl path.
#pragma once

class RunContext;

/// The whole flow, stopping at the first stage that fails, then the trace file's checked
/// close; true when the run's error count is still 0.
bool runDesignFlow(RunContext& context);
/// Reads the found unit's header; an error in it fails the run rather than giving a port list
/// that cannot be trusted. True when the header was read cleanly.
bool checkUnitHeader(RunContext& context);
/// Creates the design data with its header values (project, module, output, title, date);
/// true when the run's error count is still 0.
bool createDesignData(RunContext& context);
/// Appends one port record per extracted port to the design data, with its declared type,
/// kind, mode and, for a range that could not be evaluated, the reader's problem text.
bool buildPortList(RunContext& context);
/// Gives the design data the unit's language, generics and context. A generic's value is its
/// -g text when one was given, else its evaluated value, else its default text.
void buildUnitData(RunContext& context);
