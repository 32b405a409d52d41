// The ports of the design looked up by declared name, so that name tests and @MAPSIGNAL cost
// the same whatever the number of ports. Built once per expansion, on first use; the port list
// does not change while a template is expanded.
#pragma once

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "data/typed_lists.h"

class PortIndex {
 public:
  /// Borrows `data`; its ports must neither come nor go while the index lives.
  explicit PortIndex(const StbDataList& data) : m_Data(data) {}

  /// The ports whose declared name equals `name`, in list order; with `foldCase` ASCII letters
  /// compare ignoring case. Empty when there is none.
  const std::vector<PortRecord*>& named(std::string_view name, bool foldCase);

 private:
  using Table = std::unordered_map<std::string, std::vector<PortRecord*>>;
  void build(Table& table, bool foldCase);

  const StbDataList& m_Data;
  Table m_Exact;
  Table m_Folded;
  bool m_ExactBuilt = false;
  bool m_FoldedBuilt = false;
};
