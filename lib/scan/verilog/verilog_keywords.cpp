// Keywords grouped by length, so an identifier is compared with at most a handful of words.
#include "scan/verilog/verilog_keywords.h"

#include <array>
#include <utility>

namespace scan::verilog {
namespace {

struct Entry {
  std::string_view text;
  Word word;
};

constexpr Entry kEntries[] = {
    {"if", Word::If},
    {"ref", Word::Ref},
    {"tri", Word::NetKind},
    {"reg", Word::VariableType},
    {"bit", Word::VariableType},
    {"int", Word::AtomType},
    {"end", Word::OtherEnd},
    {"var", Word::Var},
    {"for", Word::For},
    {"wor", Word::NetKind},
    {"task", Word::Task},
    {"wire", Word::NetKind},
    {"wand", Word::NetKind},
    {"tri0", Word::NetKind},
    {"tri1", Word::NetKind},
    {"byte", Word::AtomType},
    {"time", Word::AtomType},
    {"real", Word::RealType},
    {"join", Word::OtherEnd},
    {"type", Word::Type},
    {"else", Word::Else},
    {"case", Word::Case},
    {"enum", Word::Enum},
    {"class", Word::Class},
    {"input", Word::Input},
    {"inout", Word::Inout},
    {"logic", Word::VariableType},
    {"uwire", Word::NetKind},
    {"trior", Word::NetKind},
    {"begin", Word::Begin},
    {"while", Word::While},
    {"event", Word::RealType},
    {"union", Word::Union},
    {"module", Word::Module},
    {"output", Word::Output},
    {"config", Word::Config},
    {"import", Word::Import},
    {"export", Word::Export},
    {"extern", Word::Extern},
    {"signed", Word::Signed},
    {"static", Word::Static},
    {"triand", Word::NetKind},
    {"trireg", Word::NetKind},
    {"string", Word::RealType},
    {"repeat", Word::Repeat},
    {"return", Word::Return},
    {"struct", Word::Struct},
    {"packed", Word::Packed},
    {"global", Word::Global},
    {"genvar", Word::Genvar},
    {"endtask", Word::Endtask},
    {"modport", Word::Modport},
    {"program", Word::Program},
    {"package", Word::Package},
    {"checker", Word::Checker},
    {"typedef", Word::Typedef},
    {"library", Word::Library},
    {"specify", Word::Specify},
    {"integer", Word::AtomType},
    {"supply0", Word::NetKind},
    {"supply1", Word::NetKind},
    {"default", Word::Default},
    {"virtual", Word::Virtual},
    {"chandle", Word::RealType},
    {"longint", Word::AtomType},
    {"endcase", Word::Endcase},
    {"join_any", Word::OtherEnd},
    {"endclass", Word::Endclass},
    {"function", Word::Function},
    {"clocking", Word::Clocking},
    {"property", Word::Property},
    {"sequence", Word::Sequence},
    {"endgroup", Word::Endgroup},
    {"generate", Word::Generate},
    {"shortint", Word::AtomType},
    {"unsigned", Word::Unsigned},
    {"realtime", Word::RealType},
    {"endmodule", Word::Endmodule},
    {"interface", Word::Interface},
    {"primitive", Word::Primitive},
    {"endconfig", Word::Endconfig},
    {"parameter", Word::Parameter},
    {"automatic", Word::Automatic},
    {"shortreal", Word::RealType},
    {"join_none", Word::OtherEnd},
    {"localparam", Word::Localparam},
    {"endprogram", Word::Endprogram},
    {"endpackage", Word::Endpackage},
    {"endchecker", Word::Endchecker},
    {"covergroup", Word::Covergroup},
    {"endspecify", Word::Endspecify},
    {"macromodule", Word::Macromodule},
    {"endfunction", Word::Endfunction},
    {"endclocking", Word::Endclocking},
    {"endproperty", Word::Endproperty},
    {"endsequence", Word::Endsequence},
    {"endgenerate", Word::OtherEnd},
    {"endinterface", Word::Endinterface},
    {"endprimitive", Word::Endprimitive},
};

constexpr size_t kMaxLength = 12;

// First index in kEntries of each length (entries are grouped by increasing length).
constexpr std::array<std::pair<size_t, size_t>, kMaxLength + 1> makeRanges() {
  std::array<std::pair<size_t, size_t>, kMaxLength + 1> ranges{};
  for (size_t i = 0; i < std::size(kEntries); ++i) {
    size_t length = kEntries[i].text.size();
    if (ranges[length].second == 0) ranges[length].first = i;
    ranges[length].second = i + 1;
  }
  return ranges;
}

constexpr auto kRanges = makeRanges();

// Which (first, second) letter pairs start some keyword: most identifiers fail this test.
constexpr std::array<bool, 26 * 26> makePairs() {
  std::array<bool, 26 * 26> pairs{};
  for (const Entry& entry : kEntries)
    pairs[static_cast<size_t>((entry.text[0] - 'a') * 26 + (entry.text[1] - 'a'))] = true;
  return pairs;
}

constexpr auto kPairs = makePairs();

}  // namespace

Word classify(std::string_view word) {
  if (word.size() < 2 || word.size() > kMaxLength) return Word::None;
  char first = word.front();
  char second = word[1];
  if (first < 'a' || first > 'w' || second < 'a' || second > 'z') return Word::None;
  if (!kPairs[static_cast<size_t>((first - 'a') * 26 + (second - 'a'))]) return Word::None;
  auto [begin, end] = kRanges[word.size()];
  for (size_t i = begin; i < end; ++i) {
    std::string_view text = kEntries[i].text;
    if (text[0] == first && text[1] == second && text == word) return kEntries[i].word;
  }
  return Word::None;
}

Word closingWord(Word opening) {
  switch (opening) {
    case Word::Module:
    case Word::Macromodule:
      return Word::Endmodule;
    case Word::Interface:
      return Word::Endinterface;
    case Word::Program:
      return Word::Endprogram;
    case Word::Package:
      return Word::Endpackage;
    case Word::Primitive:
      return Word::Endprimitive;
    case Word::Class:
      return Word::Endclass;
    case Word::Checker:
      return Word::Endchecker;
    case Word::Config:
      return Word::Endconfig;
    case Word::Function:
      return Word::Endfunction;
    case Word::Task:
      return Word::Endtask;
    case Word::Clocking:
      return Word::Endclocking;
    case Word::Covergroup:
      return Word::Endgroup;
    case Word::Property:
      return Word::Endproperty;
    case Word::Sequence:
      return Word::Endsequence;
    case Word::Specify:
      return Word::Endspecify;
    default:
      return Word::None;
  }
}

}  // namespace scan::verilog
