// The advice a failed run adds to its error: the units whose names come closest to the one asked
// for, the -lang a design file seems to need, and the generics a -g could have meant.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/scan.h"

/// True for a file name ending in ".v", ".sv", ".vh" or ".svh" (any letter case).
bool hasVerilogExtension(std::string_view file);

/// Up to `most` distinct names from `names` closest to `wanted` by edit distance, ignoring
/// letter case; ties keep the order of `names`.
std::vector<std::string> closestNames(std::string_view wanted,
                                      const std::vector<std::string>& names, size_t most);

/// The line that follows "Declaration (Module <wanted>) not found." once `units` were read:
/// how many units were read and up to five entities/modules with the closest names, e.g.
/// "3 design units were read; the closest names are: other, top2." Empty when `units` is
/// empty (nothing to compare with).
std::string unitNotFoundHint(std::string_view wanted, const std::vector<ScanUnitInfo>& units);

/// Advice for a run whose design files seem to be in the other language: read as VHDL, the
/// first file with a Verilog extension; read as Verilog, the first file with a VHDL extension
/// or one that declares an entity. E.g. "top.v looks like Verilog; read it with -lang
/// verilog." Empty when no file looks wrong.
std::string languageHint(const std::vector<ScanExtractor::RegisteredFile>& files, bool verilog);

/// The error for `-g name=...` when `module` has no such generic (parameter when `verilog`):
/// "-g WIDTHX: top has no generic WIDTHX; its generics are WIDTH, DEPTH." or "... top has no
/// generics.".
std::string unknownGenericMessage(std::string_view module, std::string_view name,
                                  const std::vector<ScanGeneric>& generics, bool verilog);
