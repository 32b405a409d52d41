// A run from the registered design files to the finished output: parse, look the unit up,
// prepare the header values, build the port list, then expand the template or run the Tcl path.
#pragma once

class RunContext;

/// The whole flow; true when the run's error count is still 0.
bool runDesignFlow(RunContext& context);
/// Opens the trace file in debug mode and creates the design data with its header values.
bool prepareRun(RunContext& context);
/// Expands a non-Tcl template with the template processor.
bool runTemplateEngine(RunContext& context);
/// Appends one port record per extracted port to the design data.
bool buildPortList(RunContext& context);
