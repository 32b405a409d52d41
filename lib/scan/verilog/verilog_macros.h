// Text macros of one compilation unit. Every definition and removal is also logged, so the
// table as it stood when a unit began can be rebuilt later for that unit's header parse.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace scan {
class SourceBuffer;
}

namespace scan::verilog {

struct Macro {
  std::string name;
  bool functionLike = false;
  std::vector<std::string> formals;
  std::vector<std::optional<std::string>> defaults;  ///< one per formal
  std::string body;
  /// The body holds `` or `" and must be rewritten even without arguments.
  bool needsRewrite = false;
};

class MacroTable {
 public:
  /// The macro named `name`, or null.
  std::shared_ptr<const Macro> find(std::string_view name) const;
  void define(std::shared_ptr<const Macro> macro);
  void undefine(std::string_view name);
  void undefineAll();

  /// Number of changes so far; a position in the log.
  size_t logSize() const { return m_Log.size(); }
  /// The table as it stood after the first `position` changes.
  MacroTable replay(size_t position) const;
  /// Applies the changes [from, to) of `source`'s log to this table.
  void advance(const MacroTable& source, size_t from, size_t to);

 private:
  struct Hash {
    using is_transparent = void;
    size_t operator()(std::string_view s) const { return std::hash<std::string_view>{}(s); }
  };
  struct Change {
    std::string name;                    ///< empty with a null macro: undefine all
    std::shared_ptr<const Macro> macro;  ///< null: undefine
  };
  void apply(const Change& change);

  std::unordered_map<std::string, std::shared_ptr<const Macro>, Hash, std::equal_to<>> m_Map;
  std::vector<Change> m_Log;
};

}  // namespace scan::verilog
