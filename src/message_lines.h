// The front end's own lines on its message stream (standard error, or the "-err" file): the
// usage, the missing switches and the fatal errors that stop a run before the design flow.
// Run messages go through RunContext::reportMessage, the readers' through their diagnostics.
#pragma once

#include <cstdio>
#include <string_view>

/// Writes `text` to `stream` byte for byte, NUL included.
void writeText(std::FILE* stream, std::string_view text);
/// `text` and a newline.
void writeLine(std::FILE* stream, std::string_view text);
/// "FATAL ERROR: <text>" and a newline.
void writeFatalError(std::FILE* stream, std::string_view text);
