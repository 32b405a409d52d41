// One port of the design unit: name, bounds (-1/-1 for a single bit), direction letter
// ('I', 'O', 'B' or 'N') and the name @MAPSIGNAL gave it.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

struct PortRecord {
  PortRecord(std::string_view name, int32_t left, int32_t right, char dir)
      : m_Name(name), m_Left(left), m_Right(right), m_Dir(dir) {}

  /// Replaces any earlier mapped name with a copy of `name`.
  void setMappedName(std::string_view name) { m_MappedName.emplace(name); }
  /// A port is a bus exactly when its left bound is not -1.
  bool isBus() const { return m_Left != -1; }

  std::string m_Name;
  int32_t m_Left;
  int32_t m_Right;
  char m_Dir;
  std::optional<std::string> m_MappedName;
};

/// One token of an @ITERATE@ body, copied as the reader returned it.
struct TokEntry {
  explicit TokEntry(std::string_view text) : m_Text(text) {}
  std::string m_Text;
};
