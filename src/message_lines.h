// How the program prints its own lines: byte for byte, never through a printf format. The front
// end's usage and FATAL ERROR lines go to its message stream (standard error, or the "-err"
// file) from here; run messages are RunContext::reportMessage's, which prints through here too.
#pragma once

#include <cstdio>
#include <string>
#include <string_view>

/// Writes `text` to `stream` byte for byte, NUL included.
void writeText(std::FILE* stream, std::string_view text);
/// `text` and a newline.
void writeLine(std::FILE* stream, std::string_view text);
/// "FATAL ERROR: <text>" and a newline: a failure that ends the run before the design flow.
void writeFatalError(std::FILE* stream, std::string_view text);
/// "Unable to <action> <what> <name>: <why>", the wording of every file failure of a run.
std::string fileFailureText(std::string_view action, std::string_view what, std::string_view name,
                            std::string_view why);
