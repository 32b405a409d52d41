// The sorted keyword table and the port-list kinds of the template language.
#include "engine/keyword_table.h"

#include <array>

namespace {

// Sorted by bytes with letters compared as lower case; words that take argument text carry no
// closing character. No word is the beginning of another, so a prefix match is unambiguous.
constexpr std::array<std::string_view, kKeywordCount> kWords = {
    "%bbusport%",
    "%bport%",
    "%bscalarport%",
    "%busport%",
    "%context%",
    "%date%",
    "%design%",
    "%ext%",
    "%filename%",
    "%generic%",
    "%ibusport%",
    "%iport%",
    "%iscalarport%",
    "%module%",
    "%node%",
    "%obbusport%",
    "%obport%",
    "%obscalarport%",
    "%obusport%",
    "%oport%",
    "%oscalarport%",
    "%port%",
    "%project%",
    "%scalarport%",
    "%signal%",
    "%title%",
    "%tool%",
    "%ver%",
    "@at@",
    "@comment",
    "@cr@",
    "@endif@",
    "@enditerate@",
    "@expandbus@",
    "@generic_default@",
    "@generic_type@",
    "@generic_value@",
    "@ifdefault@",
    "@ifhas",
    "@ifkind",
    "@ifndefault@",
    "@ifnhas",
    "@ifnkind",
    "@ifnport",
    "@ifntyped@",
    "@ifport",
    "@iftyped@",
    "@invcase@",
    "@iterate@",
    "@iterator@",
    "@lowcase@",
    "@map@",
    "@mapsignal",
    "@noexpandbus@",
    "@nomap@",
    "@noshowrange@",
    "@nosuppresnewline@",
    "@percent@",
    "@port_mode@",
    "@port_type@",
    "@samecase@",
    "@set",
    "@showrange@",
    "@suppresnewline@",
    "@tab@",
    "@upcase@",
    "@vhdl_typedec@",
};

unsigned char lower(unsigned char c) { return (c >= 'A' && c <= 'Z') ? c + ('a' - 'A') : c; }

// Compares the token's first word.size() bytes with the word, ignoring letter case. A token
// shorter than the word compares as its prefix would (a missing byte sorts first).
int compareWithWord(std::string_view token, std::string_view word) {
  for (size_t i = 0; i < word.size(); ++i) {
    if (i >= token.size()) return -1;
    const unsigned char t = lower(static_cast<unsigned char>(token[i]));
    const unsigned char w = static_cast<unsigned char>(word[i]);
    if (t != w) return t < w ? -1 : 1;
  }
  return 0;
}

constexpr PortKind kB{"B", WidthFilter::Any};
constexpr PortKind kBBus{"B", WidthFilter::BusOnly};
constexpr PortKind kBScalar{"B", WidthFilter::ScalarOnly};
constexpr PortKind kIob{"IOB", WidthFilter::Any};
constexpr PortKind kIobBus{"IOB", WidthFilter::BusOnly};
constexpr PortKind kIobScalar{"IOB", WidthFilter::ScalarOnly};
constexpr PortKind kI{"I", WidthFilter::Any};
constexpr PortKind kIBus{"I", WidthFilter::BusOnly};
constexpr PortKind kIScalar{"I", WidthFilter::ScalarOnly};
constexpr PortKind kN{"N", WidthFilter::Any};
constexpr PortKind kOb{"OB", WidthFilter::Any};
constexpr PortKind kObBus{"OB", WidthFilter::BusOnly};
constexpr PortKind kObScalar{"OB", WidthFilter::ScalarOnly};
constexpr PortKind kO{"O", WidthFilter::Any};
constexpr PortKind kOBus{"O", WidthFilter::BusOnly};
constexpr PortKind kOScalar{"O", WidthFilter::ScalarOnly};
constexpr PortKind kIobn{"IOBN", WidthFilter::Any};

}  // namespace

int lookupKeyword(std::string_view token) {
  if (token.empty() || (token[0] != '%' && token[0] != '@')) return kKwPlainText;
  int low = 0;
  int high = kKeywordCount - 1;
  while (low <= high) {
    const int middle = low + (high - low) / 2;
    const int order = compareWithWord(token, kWords[middle]);
    if (order == 0) return middle;
    if (order < 0) {
      high = middle - 1;
    } else {
      low = middle + 1;
    }
  }
  return kKwNoMatch;
}

std::string_view keywordWord(int index) {
  if (index < 0 || index >= kKeywordCount) return {};
  return kWords[index];
}

const PortKind* portKindFor(int index) {
  switch (index) {
    case kKwBBusPort:
      return &kBBus;
    case kKwBPort:
      return &kB;
    case kKwBScalarPort:
      return &kBScalar;
    case kKwBusPort:
      return &kIobBus;
    case kKwIBusPort:
      return &kIBus;
    case kKwIPort:
      return &kI;
    case kKwIScalarPort:
      return &kIScalar;
    case kKwNode:
      return &kN;
    case kKwOBBusPort:
      return &kObBus;
    case kKwOBPort:
      return &kOb;
    case kKwOBScalarPort:
      return &kObScalar;
    case kKwOBusPort:
      return &kOBus;
    case kKwOPort:
      return &kO;
    case kKwOScalarPort:
      return &kOScalar;
    case kKwPort:
      return &kIob;
    case kKwScalarPort:
      return &kIobScalar;
    case kKwSignal:
      return &kIobn;
    default:
      return nullptr;
  }
}

bool isScalarVariable(int index) {
  switch (index) {
    case kKwDate:
    case kKwDesign:
    case kKwExt:
    case kKwFileName:
    case kKwModule:
    case kKwProject:
    case kKwTitle:
    case kKwTool:
    case kKwVer:
      return true;
    default:
      return false;
  }
}
