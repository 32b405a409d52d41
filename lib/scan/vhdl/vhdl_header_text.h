// The source text of an entity header and its context clause as templates write it back:
// each generic's and port's declared type and default, and the library, use and context
// lines, with white space and comments between tokens reduced to single blanks.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace scan::vhdl {

/// One name of a generic or port list, with the texts of its interface declaration.
struct InterfaceText {
  enum class Kind { Object, Type, Package, Subprogram };
  Kind kind = Kind::Object;
  std::string_view name;  ///< as written; a subprogram's designator
  size_t offset = 0;      ///< of the name
  /// Objects: the subtype indication. Packages: what follows `is` ("new work.p generic map
  /// (<>)"). Subprograms: the whole specification ("function f (x : T) return T"). Types:
  /// what follows the name, normally nothing.
  std::string typeText;
  /// Objects: the expression after `:=`. Subprograms: what follows `is` ("<>"). Otherwise
  /// empty.
  std::string defaultText;
};

struct HeaderText {
  std::vector<InterfaceText> generics;
  std::vector<InterfaceText> ports;
};

/// Reads the generic and port lists of the entity whose `entity` keyword is at `offset`
/// in `text` (which must end in a readable NUL). Stops quietly at anything malformed.
HeaderText readHeaderText(std::string_view text, size_t offset);

/// The library, use and context clauses that end the region [begin, end) of `text`, after
/// the last `end` in it: one clause per line, no line end after the last.
std::string contextClauseText(std::string_view text, size_t begin, size_t end);

/// The name, as written, of the design unit whose first keyword is at `offset`.
std::string_view unitNameAt(std::string_view text, size_t offset);

/// The tokens of text[begin, end) joined by one blank wherever the source separates them.
std::string normalizedText(std::string_view text, size_t begin, size_t end);

}  // namespace scan::vhdl
