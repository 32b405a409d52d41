// What the parser's files share: the words that start a data type, and the nesting guard
// every recursive entry takes. Internal to the parser; only verilog_parser*.cpp include it.
#pragma once

#include "scan/common/reader_limits.h"
#include "scan/verilog/verilog_keywords.h"

namespace scan::verilog {

inline bool isTypeWord(Word word) {
  switch (word) {
    case Word::NetKind:
    case Word::Var:
    case Word::VariableType:
    case Word::AtomType:
    case Word::RealType:
    case Word::Signed:
    case Word::Unsigned:
    case Word::Struct:
    case Word::Union:
    case Word::Enum:
      return true;
    default:
      return false;
  }
}

}  // namespace scan::verilog
