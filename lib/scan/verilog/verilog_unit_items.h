// The scope items a unit, a package and the compilation-unit scope all read: imports,
// parameter lists, typedefs and functions. Internal to verilog_unit*.cpp.
#pragma once

#include <string>
#include <vector>

#include "scan/verilog/verilog_unit.h"

namespace scan::verilog {

class Parser;

/// `import a::*, b::x;` (the keyword already taken). With `written`, the statement is also
/// written back in one canonical spelling, which holds no macro uses.
void readImports(Parser& parser, Scope& scope, std::vector<std::string>* written = nullptr);
/// A type written as a value (`parameter type T = word_t`, `-g T=...`): a bare type name is
/// no declaration here, so nothing follows it.
bool typeValue(Parser& parser, TypeSpec& type);
/// A parameter list, up to (not including) the closing ')' or ';'. `local` says whether
/// entries before any keyword are localparams; the overridable ones go to `declared` when it
/// is given.
void readParameters(Parser& parser, Scope& scope, bool local = false,
                    std::vector<ParameterDeclaration>* declared = nullptr);
/// The declarations any scope may hold; false when the statement is something else.
bool readScopeItem(Parser& parser, Scope& scope);

}  // namespace scan::verilog
