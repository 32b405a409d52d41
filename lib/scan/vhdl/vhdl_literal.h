// Values of VHDL literals: decimal and based numbers, strings, characters and bit strings.
#pragma once

#include "scan/common/value.h"
#include "scan/vhdl/vhdl_lexer.h"

namespace scan::vhdl {

/// The value of a Number, String, Character or BitString token: integers and reals for
/// numbers (none when out of range), the characters for strings and character literals, and
/// one character per bit for bit strings. None for malformed literals.
Value literalValue(const Token& token);

}  // namespace scan::vhdl
