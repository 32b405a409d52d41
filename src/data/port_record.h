// One port of the design unit: name, bounds (-1/-1 for a single bit), direction letter
// ('I', 'O', 'B' or 'N'), the name @MAPSIGNAL gave it, and what the design declares about it
// (type text, kind, and whether its range could be evaluated at all).
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

/// What a port's declared type is, as far as a generated declaration cares.
enum class PortTypeKind { Bit, BitVector, Integer, Record, Array, Enum, Interface, Other };

/// The port's mode as declared, where the direction letter cannot tell it (buffer, linkage and
/// ref are all written 'O'). FromLetter: the letter says it all.
enum class PortMode { FromLetter, Buffer, Linkage, Ref };

struct PortRecord {
  PortRecord(std::string_view name, int32_t left, int32_t right, char dir)
      : m_Name(name), m_Left(left), m_Right(right), m_Dir(dir) {}

  /// Replaces any earlier mapped name with a copy of `name`.
  void setMappedName(std::string_view name) { m_MappedName.emplace(name); }
  /// A port is a bus exactly when its left bound is not -1.
  bool isBus() const { return m_Left != -1; }

  /// Marks the range as one that exists but could not be evaluated; `problem` is the text of
  /// the error a template that uses the range gets. The bounds then mean nothing.
  void setRangeUnknown(std::string_view problem) { m_RangeProblem.emplace(problem); }
  bool isRangeUnknown() const { return m_RangeProblem.has_value(); }
  /// The problem text; empty unless isRangeUnknown().
  std::string_view rangeProblem() const {
    return m_RangeProblem ? std::string_view(*m_RangeProblem) : std::string_view();
  }

  std::string m_Name;
  int32_t m_Left;
  int32_t m_Right;
  char m_Dir;
  std::optional<std::string> m_MappedName;
  /// The declared type as written, white space normalised; empty when not known.
  std::string m_DeclaredType;
  /// Other when not known; the engine then treats the port by its bounds alone.
  PortTypeKind m_Kind = PortTypeKind::Other;
  PortMode m_Mode = PortMode::FromLetter;

 private:
  std::optional<std::string> m_RangeProblem;
};

/// One token of an @ITERATE@ body, copied as the reader returned it.
struct TokEntry {
  explicit TokEntry(std::string_view text) : m_Text(text) {}
  std::string m_Text;
};
