// The template language's vocabulary: the 67 variable and directive words in one sorted table,
// the prefix lookup that maps a token to its word, and the port-list kinds (which ports each of
// the seventeen port-list variables selects).
#pragma once

#include <string_view>

/// Indices of the keyword table. Variables come first (0-27), then directives (28-66). The
/// order is the table's sort order and is relied on by callers that store an index.
enum Keyword : int {
  kKwBBusPort = 0,
  kKwBPort = 1,
  kKwBScalarPort = 2,
  kKwBusPort = 3,
  kKwContext = 4,
  kKwDate = 5,
  kKwDesign = 6,
  kKwExt = 7,
  kKwFileName = 8,
  kKwGeneric = 9,
  kKwIBusPort = 10,
  kKwIPort = 11,
  kKwIScalarPort = 12,
  kKwModule = 13,
  kKwNode = 14,
  kKwOBBusPort = 15,
  kKwOBPort = 16,
  kKwOBScalarPort = 17,
  kKwOBusPort = 18,
  kKwOPort = 19,
  kKwOScalarPort = 20,
  kKwPort = 21,
  kKwProject = 22,
  kKwScalarPort = 23,
  kKwSignal = 24,
  kKwTitle = 25,
  kKwTool = 26,
  kKwVer = 27,
  kKwAt = 28,
  kKwComment = 29,
  kKwCr = 30,
  kKwEndIf = 31,
  kKwEndIterate = 32,
  kKwExpandBus = 33,
  kKwGenericDefault = 34,
  kKwGenericType = 35,
  kKwGenericValue = 36,
  kKwIfDefault = 37,
  kKwIfHas = 38,
  kKwIfKind = 39,
  kKwIfNDefault = 40,
  kKwIfNHas = 41,
  kKwIfNKind = 42,
  kKwIfNPort = 43,
  kKwIfNTyped = 44,
  kKwIfPort = 45,
  kKwIfTyped = 46,
  kKwInvCase = 47,
  kKwIterate = 48,
  kKwIterator = 49,
  kKwLowCase = 50,
  kKwMap = 51,
  kKwMapSignal = 52,
  kKwNoExpandBus = 53,
  kKwNoMap = 54,
  kKwNoShowRange = 55,
  kKwNoSuppresNewLine = 56,
  kKwPercent = 57,
  kKwPortMode = 58,
  kKwPortType = 59,
  kKwSameCase = 60,
  kKwSet = 61,
  kKwShowRange = 62,
  kKwSuppresNewLine = 63,
  kKwTab = 64,
  kKwUpCase = 65,
  kKwVhdlTypeDec = 66,
};

/// Number of words in the table.
inline constexpr int kKeywordCount = 67;
/// Number of variable words ("%...%"); they come before every directive.
inline constexpr int kVariableCount = 28;
/// lookupKeyword's result for a token that begins with neither "%" nor "@" (plain text).
inline constexpr int kKwPlainText = 67;
/// lookupKeyword's result for a keyword token that matches no word.
inline constexpr int kKwNoMatch = -1;

/// The index of the word that `token` begins with (compared ignoring letter case over the
/// word's whole length); kKwPlainText when the token begins with neither "%" nor "@";
/// kKwNoMatch when no word matches.
int lookupKeyword(std::string_view token);

/// The table word of `index` (lower case, as stored); empty for an index outside 0-66.
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
