// Declared types and default expressions are reported as the designer wrote them: the source
// text between two tokens, with comments dropped and each run of white space one blank.
#pragma once

#include <string>
#include <string_view>

#include "scan/verilog/verilog_token.h"

namespace scan::verilog {

/// `text` without comments, each run of white space reduced to one blank and no blank at
/// either end. String literals are kept byte for byte, and so is the blank that ends an
/// escaped identifier inside the text.
std::string normaliseWritten(std::string_view text);

/// The source text from `first` up to (not including) `after`, normalised. Empty when the two
/// do not lie in order in one file, as when one macro use produced both.
std::string writtenBetween(const Token& first, const Token& after);

}  // namespace scan::verilog
