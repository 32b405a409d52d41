// The template language's vocabulary: the 52 variable and directive words in one sorted table,
// the prefix lookup that maps a token to its word, and the port-list kinds (which ports each of
// the seventeen port-list variables selects).
#pragma once

#include <string_view>

/// Indices of the keyword table. Variables come first (0-25), then directives (26-51). The
/// order is the table's sort order and is relied on by callers that store an index.
enum Keyword : int {
  kKwBBusPort = 0,
  kKwBPort = 1,
  kKwBScalarPort = 2,
  kKwBusPort = 3,
  kKwDate = 4,
  kKwDesign = 5,
  kKwExt = 6,
  kKwFileName = 7,
  kKwIBusPort = 8,
  kKwIPort = 9,
  kKwIScalarPort = 10,
  kKwModule = 11,
  kKwNode = 12,
  kKwOBBusPort = 13,
  kKwOBPort = 14,
  kKwOBScalarPort = 15,
  kKwOBusPort = 16,
  kKwOPort = 17,
  kKwOScalarPort = 18,
  kKwPort = 19,
  kKwProject = 20,
  kKwScalarPort = 21,
  kKwSignal = 22,
  kKwTitle = 23,
  kKwTool = 24,
  kKwVer = 25,
  kKwAt = 26,
  kKwComment = 27,
  kKwCr = 28,
  kKwEndIf = 29,
  kKwEndIterate = 30,
  kKwExpandBus = 31,
  kKwIfHas = 32,
  kKwIfNHas = 33,
  kKwInvCase = 34,
  kKwIterate = 35,
  kKwIterator = 36,
  kKwLowCase = 37,
  kKwMap = 38,
  kKwMapSignal = 39,
  kKwNoExpandBus = 40,
  kKwNoMap = 41,
  kKwNoShowRange = 42,
  kKwNoSuppresNewLine = 43,
  kKwPercent = 44,
  kKwSameCase = 45,
  kKwSet = 46,
  kKwShowRange = 47,
  kKwSuppresNewLine = 48,
  kKwTab = 49,
  kKwUpCase = 50,
  kKwVhdlTypeDec = 51,
};

/// Number of words in the table.
inline constexpr int kKeywordCount = 52;
/// lookupKeyword's result for a token that begins with neither "%" nor "@" (plain text).
inline constexpr int kKwPlainText = 52;
/// lookupKeyword's result for a keyword token that matches no word.
inline constexpr int kKwNoMatch = -1;

/// The index of the word that `token` begins with (compared ignoring letter case over the
/// word's whole length); kKwPlainText when the token begins with neither "%" nor "@";
/// kKwNoMatch when no word matches.
int lookupKeyword(std::string_view token);

/// The table word of `index` (lower case, as stored); empty for an index outside 0-51.
std::string_view keywordWord(int index);

/// Which ports a port-list kind selects by width.
enum class WidthFilter { Any, BusOnly, ScalarOnly };

/// The selection of one port-list variable: a port is selected when its direction letter is
/// one of `letters` ("I", "O", "B", "N" combined) and it passes `filter`.
struct PortKind {
  std::string_view letters;
  WidthFilter filter;

  /// True when a port with direction letter `dir` and the given width passes this kind.
  bool selects(char dir, bool isBus) const {
    if (letters.find(dir) == std::string_view::npos) return false;
    if (filter == WidthFilter::BusOnly) return isBus;
    if (filter == WidthFilter::ScalarOnly) return !isBus;
    return true;
  }
};

/// The selection of the port-list variable with keyword index `index`; null when the index is
/// not one of the seventeen port-list kinds.
const PortKind* portKindFor(int index);

/// True for the nine header-value variables (%date%, %module%, ...).
bool isScalarVariable(int index);
