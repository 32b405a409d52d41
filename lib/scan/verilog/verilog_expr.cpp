// The operator spellings of Verilog expressions: read once when an expression is parsed,
// written back only in messages.
#include "scan/verilog/verilog_expr.h"

#include <array>
#include <utility>

namespace scan::verilog {
namespace {

constexpr std::array<std::pair<Op, std::string_view>, 35> kSpellings = {{
    {Op::Plus, "+"},
    {Op::Minus, "-"},
    {Op::Times, "*"},
    {Op::Divide, "/"},
    {Op::Modulo, "%"},
    {Op::Power, "**"},
    {Op::LogicalAnd, "&&"},
    {Op::LogicalOr, "||"},
    {Op::LogicalNot, "!"},
    {Op::BitAnd, "&"},
    {Op::BitOr, "|"},
    {Op::BitXor, "^"},
    {Op::BitXnor, "~^"},
    {Op::BitXnorAlt, "^~"},
    {Op::BitNot, "~"},
    {Op::BitNand, "~&"},
    {Op::BitNor, "~|"},
    {Op::Equal, "=="},
    {Op::NotEqual, "!="},
    {Op::CaseEqual, "==="},
    {Op::CaseNotEqual, "!=="},
    {Op::WildEqual, "==?"},
    {Op::WildNotEqual, "!=?"},
    {Op::Less, "<"},
    {Op::LessEqual, "<="},
    {Op::Greater, ">"},
    {Op::GreaterEqual, ">="},
    {Op::ShiftLeft, "<<"},
    {Op::ShiftRight, ">>"},
    {Op::ArithShiftLeft, "<<<"},
    {Op::ArithShiftRight, ">>>"},
    {Op::RangeSelect, ":"},
    {Op::PlusSelect, "+:"},
    {Op::MinusSelect, "-:"},
    {Op::PatternReplicate, "{"},
}};

}  // namespace

Op operatorOf(std::string_view text) {
  for (const auto& [op, spelling] : kSpellings)
    if (spelling == text) return op;
  return Op::None;
}

std::string_view operatorText(Op op) {
  if (op == Op::PatternKeyed) return ":";
  for (const auto& [candidate, spelling] : kSpellings)
    if (candidate == op) return spelling;
  return {};
}

}  // namespace scan::verilog
