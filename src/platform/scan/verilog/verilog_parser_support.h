// What the parser's files share: the nesting limit every recursive entry checks and the words
// that start a data type. Internal to the parser; only verilog_parser*.cpp include it.
#pragma once

#include "platform/scan/verilog/verilog_keywords.h"

namespace scan::verilog {

constexpr int kMaxDepth = 400;

inline bool isTypeWord(Word word) {
  switch (word) {
    case Word::NetKind: case Word::Var: case Word::VariableType: case Word::AtomType:
    case Word::RealType: case Word::Signed: case Word::Unsigned: case Word::Struct:
    case Word::Union: case Word::Enum:
      return true;
    default:
      return false;
  }
}

class DepthGuard {
 public:
  explicit DepthGuard(int& depth) : m_Depth(depth) { ++m_Depth; }
  ~DepthGuard() { --m_Depth; }
  bool tooDeep() const { return m_Depth > kMaxDepth; }

 private:
  int& m_Depth;
};

}  // namespace scan::verilog
