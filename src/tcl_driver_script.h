// The head of the Tcl driver script: the run's names and its design data as Tcl variables,
// which the Tcl template's own text follows.
#pragma once

#include <string>

class RunContext;

/// The variable definitions for `context`, whose design data must be set. Every value is
/// written so that Tcl reads it back byte for byte and none can run a command; a port bound
/// that could not be evaluated is an empty item.
std::string tclDriverScriptHead(const RunContext& context);
