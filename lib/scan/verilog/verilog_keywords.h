// The few Verilog keywords the reader acts on, recognised without hashing: the index pass
// classifies every identifier of a netlist, so rejecting ordinary names must cost almost
// nothing.
#pragma once

#include <cstdint>
#include <string_view>

namespace scan::verilog {

enum class Word : uint8_t {
  None,
  Module,
  Macromodule,
  Endmodule,
  Interface,
  Endinterface,
  Program,
  Endprogram,
  Package,
  Endpackage,
  Primitive,
  Endprimitive,
  Class,
  Endclass,
  Checker,
  Endchecker,
  Config,
  Endconfig,
  Function,
  Endfunction,
  Task,
  Endtask,
  Clocking,
  Endclocking,
  Covergroup,
  Endgroup,
  Property,
  Endproperty,
  Sequence,
  Endsequence,
  Specify,
  Endspecify,
  Extern,
  Typedef,
  Library,
  Import,
  Export,
  Parameter,
  Localparam,
  Input,
  Output,
  Inout,
  Ref,
  Generate,
  Default,
  Global,
  Virtual,
  Static,
  Automatic,
  Signed,
  Unsigned,
  Type,
  Var,
  NetKind,       ///< wire, tri, wand, supply0, ...
  VariableType,  ///< reg, logic, bit
  AtomType,      ///< integer, int, byte, shortint, longint, time
  RealType,      ///< real, shortreal, realtime, string, chandle, event
  OtherEnd,      ///< end, endcase, endgenerate, join, ... (a statement may follow)
  Begin,
  If,
  Else,
  For,
  While,
  Repeat,
  Return,
  Case,
  Endcase,
  Struct,
  Union,
  Enum,
  Packed,
  Genvar,
  Modport,
};

Word classify(std::string_view word);

/// The closing keyword of a block keyword (Module -> Endmodule), or None.
Word closingWord(Word opening);

/// True for a word that starts a data type or net kind (`wire`, `logic`, `int`, `signed`,
/// `struct`, ...).
inline bool isTypeWord(Word word) {
  switch (word) {
    case Word::NetKind:
    case Word::Var:
    case Word::VariableType:
    case Word::AtomType:
    case Word::RealType:
    case Word::Signed:
    case Word::Unsigned:
    case Word::Struct:
    case Word::Union:
    case Word::Enum:
      return true;
    default:
      return false;
  }
}

}  // namespace scan::verilog
