// The template processor: expands one template into one output file, holding the borrowed
// streams and design data, the token reader, the output state variables set by the template,
// the conditional stack, the output column and the first error. Each handler family lives in a
// file of its own; this header is their shared contract.
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "data/port_record.h"
#include "data/typed_lists.h"
#include "engine/expansion_list.h"
#include "engine/keyword_table.h"
#include "engine/port_index.h"
#include "engine/token_reader.h"

class Forge {
 public:
  /// Case modes of m_Case.
  enum CaseMode : uint32_t { SAMECASE = 0, INVCASE = 1, LOWCASE = 2, UPCASE = 3 };
  /// Range placements of m_RangePosition.
  enum RangePosition : uint32_t { AsPrefix = 0, AsPostfix = 1 };
  /// Status values.
  enum : uint32_t { kStatusOk = 0, kStatusTemplateError = 2 };
  /// Deepest nesting of conditional blocks (@IFHAS, @IFPORT, @IFDEFAULT@, @IFTYPED@ and their
  /// negations together).
  static constexpr uint32_t kMaxConditionalDepth = 9;
  /// m_Message keeps at most this many bytes.
  static constexpr size_t kMessageCapacity = 255;

  /// Borrows the streams and the data list; `debug` may be null (no tracing).
  Forge(std::FILE* output, std::FILE* templateStream, std::FILE* debug, StbDataList* dataList);
  ~Forge();
  Forge(const Forge&) = delete;
  Forge& operator=(const Forge&) = delete;

  /// The status (0 or 2) and a copy of the message.
  uint32_t getResult(std::string& message) const;
  /// Records the first template error, prefixed with the reader's current line; later calls
  /// change nothing. A message longer than kMessageCapacity is cut between characters and
  /// still ends with a newline.
  void reportError(std::string_view text);
  /// Records, as the first error, that the template needs the range of `port`, which the
  /// design could not evaluate; the message carries the port's problem text uncut.
  void reportRangeError(const PortRecord& port);
  /// A template wrote the value of a generic that has none: writing nothing would leave a
  /// generic map or constant that does not compile, reported as success.
  void reportValueError(const GenericRecord& generic);
  /// True once an error has been recorded.
  bool failed() const { return m_Status != kStatusOk; }
  /// The template's name as the user gave it; warnings name the template by it.
  void setTemplateName(std::string_view name) { m_TemplateName = name; }
  /// The warnings of the expansion, in the order they arose, each one line without a newline.
  /// A template that stops with an error has none about its end.
  const std::vector<std::string>& warnings() const { return m_Warnings; }

  // --- Main loop and dispatch (dispatch.cpp) ---
  /// Expands the whole template. True when it ran to its end without a stop.
  bool processTemplate();
  /// Handles one token. `list` is present only while an @ITERATE@ body is replayed, `port` only
  /// while that is an iteration over ports (m_CurrentGeneric holds the generic of an iteration
  /// over generics). True means stop.
  bool doToken(std::string_view token, TokList* list, PortRecord* port);
  /// The next template token into `token`; false (after reporting) when it is longer than
  /// TokenReader::kMaxTokenSize.
  bool readToken(std::string_view& token);

  // --- Output writer (output_writer.cpp) ---
  /// Writes `text`; drops newlines and tabs when `suppress`; wraps after the signal delimiter.
  /// True when a write failed.
  bool writeText(std::string_view text, bool suppress);
  /// "%" + word + "%".
  static std::string makeVariableToken(std::string_view word);
  /// The mapped name while map is on and the port has one, else the declared name.
  const std::string& displayName(const PortRecord& port) const;

  // --- Scalar variables and case (scalar_variables.cpp) ---
  /// Writes the header value of keyword `index` (%module%, %date%, ...) in the case mode; an
  /// index that names no header value writes the version. True when a write failed.
  bool writeScalarVariable(int index);
  /// Converts `text` in place by m_Case (ASCII letters only) and returns it.
  std::string& applyCase(std::string& text) const;
  /// Swaps the case of every ASCII letter in place and returns `text`.
  static std::string& invertCase(std::string& text);

  // --- @SET (set_directive.cpp) ---
  /// Handles "@SET key=value@". Outline width values beyond 32 bits are clamped. True (after
  /// reporting) when the token is rejected.
  bool doSet(std::string_view token);

  // --- Conditionals (conditionals.cpp) ---
  bool doIf(std::string_view token, bool isIfHas);
  /// @IFPORT / @IFNPORT: tests the name of `port` (null outside a port iteration) against
  /// alternatives separated by "|", each a pattern in which "*" matches any run and "?" one
  /// character.
  bool doIfPort(std::string_view token, bool isIfPort, const PortRecord* port);
  /// @IFDEFAULT@, @IFNDEFAULT@, @IFTYPED@, @IFNTYPED@ (keyword `index`): tests whether the
  /// current generic has default text, or whether the current generic or `port` (null outside
  /// a port iteration) has declared type text.
  bool doIfDeclared(int index, const PortRecord* port);
  /// @IFKIND kinds@ / @IFNKIND kinds@: tests the declared kind of the current port of an
  /// iteration against a '|'-separated list of kind names (bit, vector, integer, record,
  /// array, enum, interface, other), ignoring case.
  bool doIfKind(std::string_view token, bool isIfKind, const PortRecord* port);
  bool doEndIf();
  /// Opens a block kept (value 2) or dropped (value 1), opened by keyword `index` on the
  /// current line.
  bool addCondition(uint32_t value, int index);
  /// After a template that ran to its end: the warning about a block still open, if any.
  void warnAboutOpenBlock();
  /// Whether `name` matches `pattern`: "*" alone matches any name; any other pattern matches a
  /// name of its length equal to it where each "?" stands for any one character. Letter case
  /// counts unless m_CaseSensitiveIf is off.
  bool signalNameMatches(std::string_view name, std::string_view pattern) const;
  /// Whether a port selected by port-list keyword `kind` has a name matching `pattern` (the
  /// @IFHAS rules); null (after reporting) when deciding needs a range that is unknown.
  std::optional<bool> hasMatchingPort(int kind, std::string_view pattern);
  /// Whether a generic has a name matching `pattern` (the @IFHAS rules).
  bool hasMatchingGeneric(std::string_view pattern);

  // --- Signal mapping (signal_mapping.cpp) ---
  bool doMapSignal(std::string_view token);

  // --- Port lists and iteration (iteration.cpp) ---
  /// The first (restart) or next port of `kind` (a port-list keyword index); null when done.
  PortRecord* selectPort(int kind, bool restart);
  /// Writes the delimited list of the ports of `kind`. `list` is the body being replayed, if
  /// any (a port-list variable is an error there).
  bool writePortList(int kind, TokList* list);
  bool eatIterate();
  bool doIterate(int kind, TokList* list);
  /// True (after reporting) when `selection` would need the width of `port` to decide on it,
  /// and that width is unknown.
  bool widthUnknown(const PortKind& selection, const PortRecord& port);
  /// The name index of the ports, built on first use.
  PortIndex& portIndex();

  // --- Generics and context (generics.cpp) ---
  /// %generic%: the generic names, delimited and in the case mode.
  bool writeGenericList();
  /// Replays `list` once per generic with m_CurrentGeneric set.
  bool doIterateGenerics(TokList* list);
  /// @GENERIC_TYPE@, @GENERIC_DEFAULT@ and @GENERIC_VALUE@ (keyword `index`).
  bool writeGenericField(int index);
  /// %context%, as stored.
  bool writeContext();

  // --- @ITERATOR@ and bus expansion (port_format.cpp) ---
  /// The bits of bus `port`, worked out one at a time as they are walked; they carry the
  /// port's mapped name as it is now.
  std::unique_ptr<ExpansionList> expandBus(const PortRecord& port) const;
  std::string formatPort(const PortRecord& port) const;
  /// True (after reporting) when writing `port` under the current settings needs its range
  /// (showrange or expandbus on) and that range is unknown.
  bool rangeNeeded(const PortRecord& port);

  // --- Port words of an iteration (port_words.cpp) ---
  /// @PORT_TYPE@: the declared type as written.
  bool writePortType(const PortRecord& port);
  /// @PORT_MODE@: the direction word in the design's language; nothing for an interface port
  /// or a node.
  bool writePortMode(const PortRecord& port);

  // --- @VHDL_TYPEDEC@ (vhdl_typedec.cpp) ---
  /// Bit, bit-vector and integer ports (and ports whose declared type is not known) get the
  /// net type or the bus type with its range; any other port gets its declared type.
  bool doVhdlTypeDec(const PortRecord& port);

  /// Writes one trace line when a trace stream exists. The format must be a literal.
  void trace(const char* format, ...) const __attribute__((format(printf, 2, 3)));

  // Fields, in the processor's documented order.
  std::string m_Message = "No errors or warnings";
  uint32_t m_Status = kStatusOk;
  std::FILE* m_Output;
  std::FILE* m_Template;
  std::FILE* m_Debug;
  StbDataList* m_DataList;
  TokenReader m_Reader;
  uint32_t m_ConditionalDepth = 0;
  uint32_t m_Case = SAMECASE;
  int32_t m_OutLineWidth = 32767;
  std::string m_SigDelim = ", ";
  std::string m_EolDelim = "\n";
  std::string m_BusLeft = "_";
  std::string m_BusRight = "_";
  std::string m_VhdlBusType = "std_logic_vector";
  std::string m_VhdlNetType = "std_logic";
  bool m_ExpandBus = false;
  bool m_ShowRange = false;
  uint32_t m_RangePosition = AsPrefix;
  bool m_SuppresNewLine = false;
  bool m_Map = false;
  bool m_CaseSensitiveIf = true;
  uint32_t m_Conditions[11] = {0};
  /// For each open block: the keyword that opened it and the template line it was on.
  int m_ConditionWords[11] = {0};
  int32_t m_ConditionLines[11] = {0};
  /// The bus that selectPort is handing out bit by bit, if any; its record is the current bit.
  std::unique_ptr<ExpansionList> m_Expansion;
  uint32_t m_Column = 0;

  // --- Port selection and iteration state (owned by iteration.cpp) ---
  /// The data-list element that selectPort handed out last (or whose bits it is handing out);
  /// null before the first walk and after a walk ran off the end. Only port-list variables and
  /// iterations move it, so searches inside an iteration body leave the iteration's position
  /// and its current bit alone.
  List_element* m_SelectedPort = nullptr;
  /// True while an @ITERATE@ body is being replayed.
  bool m_Iterating = false;
  /// The generic of the @ITERATE@%GENERIC% pass being replayed; null otherwise.
  const GenericRecord* m_CurrentGeneric = nullptr;
  /// Searches by name see every port of the list, never bus bits, so the mapping of
  /// @MAPSIGNAL lands on the bus itself and the searches leave every walk alone.
  std::unique_ptr<PortIndex> m_PortIndex;
  /// Results of @IFHAS tests by kind, case rule and pattern: the ports and generics do not
  /// change during an expansion, so a test repeated in an iteration body is answered once.
  std::unordered_map<std::string, bool> m_MatchResults;
  std::string m_TemplateName;
  std::vector<std::string> m_Warnings;
};
