// Holds the VHDL reader against GHDL. For every fixture file GHDL analyses, GHDL's own parse
// tree gives each entity's port names, modes, type marks and lines, and a generated
// architecture of the entity, elaborated with the generic defaults, reports each port's
// bounds; the extractor must agree on all of it.
#include <gtest/gtest.h>

#include <cctype>
#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "platform/scan.h"
#include "support/diff_tools.h"
#include "support/ghdl_xml.h"

namespace {

using namespace difftest;

// How a probe line asks GHDL about a port. GHDL's analyser decides: a line that does not
// analyse is retried with the next kind, so no guess about the port's type is needed.
enum class ProbeKind {
  Array,       // integer-indexed array: 'left, 'right and 'ascending of the object
  Scalar,      // scalar subtype: its bounds through 'image, whatever the type
  Positional,  // array with an enumeration index: only 'length and 'ascending are integers
  Opaque,      // records: nothing to compare but "no range"
};

struct GhdlBounds {
  bool reported = false;
  ProbeKind kind = ProbeKind::Opaque;
  std::string left;
  std::string right;
  bool ascending = false;
  long long length = 0;  ///< Positional only
};

struct ProbedEntity {
  const GhdlEntity* entity;
  std::vector<ProbeKind> kinds;
  bool analysable = true;
};

const char* const kStd = "--std=08";
const char* const kRelaxed = "-frelaxed";
const char* const kProbeArchitecture = "pinforge_probe";

bool isDigit(char c) { return c >= '0' && c <= '9'; }

bool isInteger(const std::string& image) {
  size_t at = !image.empty() && image[0] == '-' ? 1 : 0;
  if (at == image.size()) return false;
  for (; at < image.size(); ++at)
    if (!isDigit(image[at])) return false;
  return true;
}

int modeCode(const std::string& mode) {
  if (mode == "in") return ScanPort::Input;
  if (mode == "out") return ScanPort::Output;
  if (mode == "inout") return ScanPort::Inout;
  if (mode == "buffer") return ScanPort::Buffer;
  if (mode == "linkage") return ScanPort::Linkage;
  return 0;
}

std::string withoutComments(const std::string& text) {
  std::string code;
  size_t at = 0;
  for (size_t dashes; (dashes = text.find("--", at)) != std::string::npos;) {
    code.append(text, at, dashes - at);
    at = text.find('\n', dashes);
    if (at == std::string::npos) return code;
  }
  code.append(text, at);
  return code;
}

bool isWordChar(char c) { return std::isalnum(static_cast<unsigned char>(c)) || c == '_'; }

// A word of VHDL text: an identifier (lower case), an extended identifier or one other
// character, and what directly precedes it.
struct Word {
  std::string text;
  bool afterDot = false;    ///< a selected name's suffix, such as `work.entity`
  bool afterBlank = false;  ///< white space separates it from what comes before
  bool isName() const {
    return isIdentifier() || (text.size() > 2 && text[0] == '\\' && text.back() == '\\');
  }
  bool isIdentifier() const { return !text.empty() && isWordChar(text[0]); }
};

// The words of comment-free text. Enough to spot unit headers and library clauses; strings
// and character literals are not told apart, as the fixtures do not need it.
std::vector<Word> wordsOf(const std::string& code) {
  std::vector<Word> words;
  size_t at = 0;
  while (at < code.size()) {
    const size_t start = at;
    while (at < code.size() && std::isspace(static_cast<unsigned char>(code[at]))) ++at;
    if (at == code.size()) break;
    Word word;
    word.afterBlank = at > start;
    word.afterDot = at > 0 && code[at - 1] == '.';
    size_t end = at + 1;
    if (isWordChar(code[at])) {
      while (end < code.size() && isWordChar(code[end])) ++end;
    } else if (code[at] == '\\') {
      const size_t close = code.find('\\', at + 1);
      if (close != std::string::npos && close > at + 1) end = close + 1;
    }
    word.text = code.substr(at, end - at);
    if (word.isIdentifier()) word.text = lowerCase(word.text);
    words.push_back(std::move(word));
    at = end;
  }
  return words;
}

// Whether words[at] is `keyword` as a word of its own, not a selected name's suffix.
bool isKeyword(const std::vector<Word>& words, size_t at, std::string_view keyword) {
  return at < words.size() && words[at].text == keyword && !words[at].afterDot;
}

// Whether words[at] is a name (identifier, or extended identifier when allowed) set off by
// white space from the word before it.
bool isSpacedName(const std::vector<Word>& words, size_t at, bool extended = false) {
  return at < words.size() && words[at].afterBlank &&
         (extended ? words[at].isName() : words[at].isIdentifier());
}

bool isSpaced(const std::vector<Word>& words, size_t at, std::string_view text) {
  return at < words.size() && words[at].afterBlank && words[at].text == text;
}

// Declares a package of its own (not a package body or instantiation): such files are
// analysed ahead of every fixture so fixtures can use packages from other files.
bool declaresPackage(const std::string& text) {
  const std::vector<Word> words = wordsOf(withoutComments(text));
  for (size_t i = 0; i < words.size(); ++i)
    if (isKeyword(words, i, "package") && isSpacedName(words, i + 1) &&
        isSpaced(words, i + 2, "is") &&
        (i + 3 == words.size() || (words[i + 3].afterBlank && words[i + 3].text != "new")))
      return true;
  return false;
}

// Library names from library clauses other than the predefined ones.
std::set<std::string> namedLibraries(const std::string& text) {
  std::set<std::string> libraries;
  const std::vector<Word> words = wordsOf(withoutComments(text));
  for (size_t i = 0; i < words.size(); ++i) {
    if (!isKeyword(words, i, "library") || i + 1 == words.size() || !words[i + 1].afterBlank)
      continue;
    std::vector<std::string> names;
    size_t at = i + 1;
    for (; at < words.size() && (words[at].isIdentifier() || words[at].text == ","); ++at)
      if (words[at].isIdentifier()) names.push_back(words[at].text);
    if (at == i + 1 || at == words.size() || words[at].text != ";") continue;
    for (const std::string& library : names)
      if (library != "ieee" && library != "std" && library != "work") libraries.insert(library);
  }
  return libraries;
}

std::string probeLine(size_t index, const std::string& port, ProbeKind kind) {
  const std::string head = "    report \"P|" + std::to_string(index) + "|";
  switch (kind) {
    case ProbeKind::Array:
      return head + "A|\" & integer'image(" + port + "'left) & \"|\" & integer'image(" + port +
             "'right) & \"|\" & boolean'image(" + port + "'ascending);\n";
    case ProbeKind::Scalar: {
      // No 'ascending here: GHDL 2.0 crashes on it for a subtype that depends on generics.
      const std::string type = port + "'subtype";
      return head + "S|\" & " + type + "'image(" + type + "'left) & \"|\" & " + type + "'image(" +
             type + "'right);\n";
    }
    case ProbeKind::Positional:
      return head + "E|\" & integer'image(" + port + "'length) & \"|\" & boolean'image(" + port +
             "'ascending);\n";
    case ProbeKind::Opaque:
      break;
  }
  return head + "N\";\n";
}

ProbeKind nextKind(ProbeKind kind) {
  switch (kind) {
    case ProbeKind::Array:
      return ProbeKind::Scalar;
    case ProbeKind::Scalar:
      return ProbeKind::Positional;
    case ProbeKind::Positional:
    case ProbeKind::Opaque:
      break;
  }
  return ProbeKind::Opaque;
}

// Reads the "P|index|kind|fields..." lines of a probe run.
std::vector<GhdlBounds> parseReports(const std::string& output, size_t portCount) {
  std::vector<GhdlBounds> bounds(portCount);
  const std::string marker = "(report note): P|";
  for (size_t at = 0; (at = output.find(marker, at)) != std::string::npos;) {
    at += marker.size();
    size_t digits = at;
    while (digits < output.size() && isDigit(output[digits])) ++digits;
    if (digits == at || digits + 1 >= output.size() || output[digits] != '|' ||
        std::string_view("ASEN").find(output[digits + 1]) == std::string_view::npos)
      continue;
    const size_t index = std::strtoul(output.c_str() + at, nullptr, 10);
    const char kind = output[digits + 1];
    const size_t lineEnd = std::min(output.find('\n', digits), output.size());
    const std::string rest = output.substr(digits + 2, lineEnd - digits - 2);
    at = lineEnd;
    if (index >= portCount) continue;
    // Each field runs from a '|' to the next one.
    std::vector<std::string> fields;
    for (size_t bar = rest.find('|'); bar != std::string::npos;) {
      const size_t next = rest.find('|', bar + 1);
      fields.push_back(rest.substr(bar + 1, next == std::string::npos ? next : next - bar - 1));
      bar = next;
    }
    fields.resize(3);
    GhdlBounds& b = bounds[index];
    b.reported = true;
    switch (kind) {
      case 'A':
        b.kind = ProbeKind::Array;
        b.left = fields[0];
        b.right = fields[1];
        b.ascending = fields[2] == "true";
        break;
      case 'S':
        b.kind = ProbeKind::Scalar;
        b.left = fields[0];
        b.right = fields[1];
        if (isInteger(b.left) && isInteger(b.right))
          b.ascending = std::atoll(b.left.c_str()) <= std::atoll(b.right.c_str());
        break;
      case 'E':
        b.kind = ProbeKind::Positional;
        b.length = std::atoll(fields[0].c_str());
        b.ascending = fields[1] == "true";
        break;
      default:
        b.kind = ProbeKind::Opaque;
        break;
    }
  }
  return bounds;
}

// The probe file's line of each GHDL message "...pinforge_probe.vhd:LINE:COL:...", one per
// message line, in order.
std::vector<int> probeErrorLines(const std::string& output) {
  const std::string file = "pinforge_probe.vhd:";
  std::vector<int> lines;
  for (size_t start = 0; start < output.size();) {
    const size_t end = std::min(output.find('\n', start), output.size());
    // The last mention in the line wins, as a message may quote another location first.
    for (size_t at = output.rfind(file, end); at != std::string::npos && at >= start;
         at = at == 0 ? std::string::npos : output.rfind(file, at - 1)) {
      size_t line = at + file.size(), column = line;
      while (column < end && isDigit(output[column])) ++column;
      if (column == line || column >= end || output[column] != ':') continue;
      size_t after = column + 1;
      while (after < end && isDigit(output[after])) ++after;
      if (after == column + 1 || after >= end || output[after] != ':') continue;
      lines.push_back(std::atoi(output.c_str() + line));
      break;
    }
    start = end + 1;
  }
  return lines;
}

// The design units a file declares, as keys that clash exactly when GHDL would see one unit
// defined twice.
std::set<std::string> unitKeys(const std::string& text) {
  std::set<std::string> keys;
  const std::vector<Word> words = wordsOf(withoutComments(text));
  auto isOrOf = [&](size_t at) { return isSpaced(words, at, "is") || isSpaced(words, at, "of"); };
  for (size_t i = 0; i < words.size(); ++i) {
    if (isKeyword(words, i, "architecture") && isSpacedName(words, i + 1) &&
        isSpaced(words, i + 2, "of") && isSpacedName(words, i + 3) && isSpaced(words, i + 4, "is"))
      keys.insert("architecture " + words[i + 1].text + " of " + words[i + 3].text);
    if (isKeyword(words, i, "package") && isSpaced(words, i + 1, "body") &&
        isSpacedName(words, i + 2, true) && isOrOf(i + 3)) {
      keys.insert("package body " + lowerCase(words[i + 2].text));
      continue;
    }
    for (const char* kind : {"entity", "package", "configuration", "context"})
      if (isKeyword(words, i, kind) && isSpacedName(words, i + 1, true) && isOrOf(i + 2))
        keys.insert(std::string(kind) + " " + lowerCase(words[i + 1].text));
  }
  return keys;
}

struct FixtureState {
  std::string workdir;    ///< private copy of the shared libraries with the fixture analysed
  std::string rejection;  ///< why GHDL does not analyse the fixture; empty when it does
  bool isPackageFile = false;
  bool declaresEntity = false;
  bool dumped = false;  ///< `entities` came from a batched dump
  std::vector<GhdlEntity> entities;
};

class GhdlDifferential : public ::testing::TestWithParam<std::string> {
 public:
  // All the per-directory work happens once: the shared package libraries, the analysis of
  // each fixture in its own library copy, and GHDL's parse-tree dumps. A dump repeats the
  // IEEE packages it depends on, so fixtures are dumped in as few batches as possible.
  static void SetUpTestSuite() {
    s_Ghdl = findTool("ghdl");
    if (s_Ghdl.empty()) return;
    s_Root = std::make_unique<ScratchDir>();
    if (s_Root->path().empty()) return;
    s_Shared = s_Root->path() + "/shared";
    std::error_code error;
    std::filesystem::create_directories(s_Shared, error);
    std::map<std::string, std::set<std::string>> keysOfFile;
    std::set<std::string> libraries{"work"};
    for (const std::string& file : fixtureFiles("vhdl", {".vhd", ".vhdl"})) {
      std::string text;
      if (!readFile(file, text)) continue;
      FixtureState& state = s_Fixtures[file];
      state.isPackageFile = declaresPackage(text);
      keysOfFile[file] = unitKeys(text);
      for (const std::string& key : keysOfFile[file])
        if (key.rfind("entity ", 0) == 0) state.declaresEntity = true;
      const std::set<std::string> named = namedLibraries(text);
      libraries.insert(named.begin(), named.end());
    }
    analysePackageFiles(libraries);
    std::vector<std::vector<std::string>> batches;
    std::vector<std::set<std::string>> batchKeys;
    for (auto& [file, state] : s_Fixtures) {
      state.workdir = copyOfShared(fixtureTestName(file));
      const ToolRun analysis = ghdl({"-a", file}, state.workdir);
      if (analysis.status != 0) state.rejection = firstErrorLine(analysis.output);
      if (!state.rejection.empty() || !state.declaresEntity) continue;
      size_t batch = 0;
      while (batch < batches.size() && !disjoint(batchKeys[batch], keysOfFile[file])) ++batch;
      if (batch == batches.size()) {
        batches.emplace_back();
        batchKeys.emplace_back();
      }
      batches[batch].push_back(file);
      batchKeys[batch].insert(keysOfFile[file].begin(), keysOfFile[file].end());
    }
    for (size_t b = 0; b < batches.size(); ++b) {
      std::vector<std::string> args{"--file-to-xml"};
      args.insert(args.end(), batches[b].begin(), batches[b].end());
      const ToolRun dump = ghdl(args, copyOfShared("dump" + std::to_string(b)));
      if (dump.status != 0) continue;  // each file is then dumped on its own
      for (const std::string& file : batches[b]) {
        FixtureState& state = s_Fixtures[file];
        state.dumped = readGhdlEntities(dump.output, file, state.entities);
        if (!state.dumped) state.entities.clear();
      }
    }
  }

  static void TearDownTestSuite() {
    s_Root.reset();
    s_PackageFiles.clear();
    s_Fixtures.clear();
  }

 protected:
  static ToolRun ghdl(std::vector<std::string> args, const std::string& workdir) {
    args.insert(args.begin() + 1, {kStd, kRelaxed, "--workdir=" + workdir, "-P" + workdir});
    args.insert(args.begin(), s_Ghdl);
    // Inside the work directory: GHDL's code-generating back ends write executables there.
    return runTool(args, workdir);
  }

  static bool disjoint(const std::set<std::string>& a, const std::set<std::string>& b) {
    for (const std::string& key : b)
      if (a.count(key) != 0) return false;
    return true;
  }

  // Analyses every fixture that declares a package into the shared directory, once into
  // "work" and once into each library some fixture names. Files are retried while any
  // succeeds, so packages that use each other need no particular file order.
  static void analysePackageFiles(const std::set<std::string>& libraries) {
    std::vector<std::string> candidates;
    for (const auto& [file, state] : s_Fixtures)
      if (state.isPackageFile) candidates.push_back(file);
    for (const std::string& library : libraries) {
      std::vector<std::string> pending = candidates;
      bool progress = true;
      while (progress && !pending.empty()) {
        progress = false;
        for (auto it = pending.begin(); it != pending.end();) {
          const ToolRun run = runTool(
              {s_Ghdl, "-a", kStd, kRelaxed, "--workdir=" + s_Shared, "--work=" + library, *it},
              s_Shared);
          if (run.status != 0) {
            ++it;
            continue;
          }
          if (library == "work") s_PackageFiles.push_back(*it);
          it = pending.erase(it);
          progress = true;
        }
      }
    }
  }

  // A copy of the shared libraries, so units of the same name in different fixtures never
  // meet.
  static std::string copyOfShared(const std::string& name) {
    const std::string dir = s_Root->path() + "/" + name;
    std::error_code error;
    std::filesystem::create_directories(dir, error);
    for (const auto& entry : std::filesystem::directory_iterator(s_Shared, error))
      std::filesystem::copy_file(entry.path(), dir + "/" + entry.path().filename().string(),
                                 std::filesystem::copy_options::overwrite_existing, error);
    return dir;
  }

  // Builds a probe architecture for each entity and analyses them together, downgrading the
  // probe kind of every line GHDL rejects until the file analyses. An entity whose probe
  // still fails outside its port lines is left out.
  bool analyseProbes(const std::string& workdir, std::vector<ProbedEntity>& probes) {
    const std::string path = workdir + "/pinforge_probe.vhd";
    // Every round changes something, so this ends; the bound only guards against surprises.
    for (int round = 0; round < 64; ++round) {
      std::string text;
      int line = 1;
      std::map<int, std::pair<size_t, size_t>> portOfLine;
      std::vector<std::pair<int, int>> linesOfEntity(probes.size(), {0, -1});
      for (size_t e = 0; e < probes.size(); ++e) {
        ProbedEntity& probe = probes[e];
        if (!probe.analysable) continue;
        linesOfEntity[e].first = line;
        text += std::string("architecture ") + kProbeArchitecture + " of " + probe.entity->name +
                " is\nbegin\n  process\n  begin\n";
        line += 4;
        for (size_t p = 0; p < probe.kinds.size(); ++p) {
          text += probeLine(p, probe.entity->ports[p].name, probe.kinds[p]);
          portOfLine[line++] = {e, p};
        }
        text += "    wait;\n  end process;\nend architecture;\n";
        line += 3;
        linesOfEntity[e].second = line - 1;
      }
      if (!writeFile(path, text)) return false;
      const ToolRun run = ghdl({"-a", path}, workdir);
      if (run.status == 0) return true;

      bool changed = false;
      std::set<int> handled;
      for (const int errorLine : probeErrorLines(run.output)) {
        if (!handled.insert(errorLine).second) continue;  // one step per line and round
        const auto port = portOfLine.find(errorLine);
        if (port != portOfLine.end()) {
          ProbeKind& kind = probes[port->second.first].kinds[port->second.second];
          if (kind == ProbeKind::Opaque) continue;
          kind = nextKind(kind);
          changed = true;
          continue;
        }
        for (size_t e = 0; e < probes.size(); ++e) {
          if (probes[e].analysable && errorLine >= linesOfEntity[e].first &&
              errorLine <= linesOfEntity[e].second) {
            std::cout << "  note: GHDL cannot analyse a probe of entity " << probes[e].entity->name
                      << ", left out: " << firstErrorLine(run.output) << "\n";
            probes[e].analysable = false;
            changed = true;
          }
        }
      }
      if (!changed) {
        ADD_FAILURE() << "the probe architectures do not analyse:\n" << run.output;
        return false;
      }
    }
    return false;
  }

  void comparePorts(const std::string& file, const GhdlEntity& entity,
                    const std::vector<GhdlBounds>& bounds, const ScanPortList& ours) {
    std::map<std::string, const ScanPort*> oursByName;
    std::string oursOrder;
    for (const ScanPort* port = ours.firstPort(); port != nullptr; port = ours.nextPort(port)) {
      oursByName.emplace(lowerCase(port->name()), port);
      oursOrder += lowerCase(port->name()) + " ";
    }
    std::string ghdlOrder;
    const std::string where = file + ": entity " + entity.name + ": port ";
    for (size_t i = 0; i < entity.ports.size(); ++i) {
      const GhdlPort& theirs = entity.ports[i];
      ghdlOrder += lowerCase(theirs.name) + " ";
      const auto found = oursByName.find(lowerCase(theirs.name));
      if (found == oursByName.end()) {
        ADD_FAILURE() << where << theirs.name << ": missing in ours (GHDL line " << theirs.line
                      << ")";
        continue;
      }
      comparePort(where + theirs.name, theirs, bounds[i], *found->second);
      oursByName.erase(found);
    }
    for (const auto& [name, port] : oursByName)
      ADD_FAILURE() << where << port->name() << ": ours only (line " << port->sourceLine()
                    << "), GHDL has no such port";
    if (oursByName.empty() && ours.size() == entity.ports.size() && oursOrder != ghdlOrder)
      ADD_FAILURE() << file << ": entity " << entity.name << ": port order: ours " << oursOrder
                    << "; GHDL " << ghdlOrder;
  }

  void comparePort(const std::string& where, const GhdlPort& theirs, const GhdlBounds& bounds,
                   const ScanPort& ours) {
    if (ours.direction() != modeCode(theirs.mode))
      ADD_FAILURE() << where << ": direction: ours " << ours.direction() << ", GHDL " << theirs.mode
                    << " (" << modeCode(theirs.mode) << ")";
    if (!theirs.typeMark.empty() && lowerCase(ours.typeName()) != lowerCase(theirs.typeMark))
      ADD_FAILURE() << where << ": type: ours \"" << ours.typeName() << "\", GHDL \""
                    << theirs.typeMark << "\"";
    // A declaration that lists several names may be reported at any of their lines.
    if (ours.sourceLine() < theirs.firstLineOfList || ours.sourceLine() > theirs.line)
      ADD_FAILURE() << where << ": line: ours " << ours.sourceLine() << ", GHDL "
                    << theirs.firstLineOfList
                    << (theirs.firstLineOfList != theirs.line ? ".." + std::to_string(theirs.line)
                                                              : std::string());
    compareRange(where, theirs, bounds, ours);
  }

  void compareRange(const std::string& where, const GhdlPort& theirs, const GhdlBounds& bounds,
                    const ScanPort& ours) {
    if (!bounds.reported) {
      ADD_FAILURE() << where << ": GHDL's probe reported nothing for this port";
      return;
    }
    const std::string oursRange = describeRange(ours);
    const bool integerBounds =
        (bounds.kind == ProbeKind::Array || bounds.kind == ProbeKind::Scalar) &&
        isInteger(bounds.left) && isInteger(bounds.right);
    std::string theirRange = "no range";
    if (integerBounds)
      theirRange = bounds.left + (bounds.ascending ? " to " : " downto ") + bounds.right;
    if (oursRange == theirRange) return;
    // An enumeration index has no integer bounds: no range, or positions of the right
    // length and direction.
    if (bounds.kind == ProbeKind::Positional && ours.hasRange() &&
        rangeLength(ours) == bounds.length && (ours.isAscending() != 0) == bounds.ascending)
      return;
    // A scalar type mark without a constraint of its own (integer, natural, a named integer
    // subtype) need not be reported as a range; one that is must have GHDL's bounds.
    if (bounds.kind == ProbeKind::Scalar && !theirs.constrained && !ours.hasRange()) return;
    // A scalar probe cannot tell "5 to 5" from "5 downto 5".
    if (bounds.kind == ProbeKind::Scalar && integerBounds && bounds.left == bounds.right &&
        oursRange == bounds.left + " downto " + bounds.right)
      return;
    ADD_FAILURE() << where << ": range: ours " << oursRange << ", GHDL " << theirRange
                  << (bounds.kind == ProbeKind::Array    ? " (array)"
                      : bounds.kind == ProbeKind::Scalar ? " (scalar)"
                      : bounds.kind == ProbeKind::Positional
                          ? " (enumeration-indexed array of " + std::to_string(bounds.length) + ")"
                          : " (record)");
  }

  static long long rangeLength(const ScanPort& port) {
    int32_t left = 0;
    int32_t right = 0;
    port.getBounds(left, right);
    const long long span = port.isAscending() ? 1LL + right - left : 1LL + left - right;
    return span > 0 ? span : 0;
  }

  static std::string describeRange(const ScanPort& port) {
    if (!port.hasRange()) return "no range";
    int32_t left = 0;
    int32_t right = 0;
    port.getBounds(left, right);
    return std::to_string(left) + (port.isAscending() ? " to " : " downto ") +
           std::to_string(right);
  }

  static std::string s_Ghdl;
  static std::unique_ptr<ScratchDir> s_Root;
  static std::string s_Shared;
  static std::vector<std::string> s_PackageFiles;
  static std::map<std::string, FixtureState> s_Fixtures;
};

std::string GhdlDifferential::s_Ghdl;
std::unique_ptr<ScratchDir> GhdlDifferential::s_Root;
std::string GhdlDifferential::s_Shared;
std::vector<std::string> GhdlDifferential::s_PackageFiles;
std::map<std::string, FixtureState> GhdlDifferential::s_Fixtures;

TEST_P(GhdlDifferential, PortsMatchGhdl) {
  DIFFTEST_REQUIRE_TOOL(s_Ghdl, "ghdl");
  ASSERT_TRUE(s_Root && !s_Root->path().empty()) << "no scratch directory";
  const std::string& file = GetParam();
  FixtureState& state = s_Fixtures[file];
  if (!state.rejection.empty()) GTEST_SKIP() << "GHDL rejects " << file << ": " << state.rejection;
  if (!state.declaresEntity) GTEST_SKIP() << file << " declares no entity";
  if (!state.dumped) {
    const ToolRun dump = ghdl({"--file-to-xml", file}, state.workdir);
    ASSERT_EQ(dump.status, 0) << "ghdl --file-to-xml failed: " << firstErrorLine(dump.output);
    ASSERT_TRUE(readGhdlEntities(dump.output, file, state.entities)) << "unreadable GHDL dump";
  }
  const std::vector<GhdlEntity>& entities = state.entities;
  const std::string& workdir = state.workdir;
  if (entities.empty()) GTEST_SKIP() << file << " declares no entity GHDL sees";

  std::vector<ProbedEntity> probes;
  for (const GhdlEntity& entity : entities) {
    if (!entity.genericsWithoutDefault.empty()) {
      std::cout << "  note: " << file << ": entity " << entity.name << " left out: generic "
                << entity.genericsWithoutDefault.front() << " has no default\n";
      continue;
    }
    probes.push_back({&entity, std::vector<ProbeKind>(entity.ports.size(), ProbeKind::Array)});
  }
  if (probes.empty()) GTEST_SKIP() << "every entity of " << file << " needs generic values";
  if (!analyseProbes(workdir, probes)) return;

  ScanExtractor extractor;
  extractor.addDesignFile("work", file.c_str(), ScanExtractor::Vhdl);
  for (const std::string& package : s_PackageFiles)
    if (package != file) extractor.addDesignFile("work", package.c_str(), ScanExtractor::Vhdl);
  extractor.Parse(ScanExtractor::Vhdl);

  int compared = 0;
  for (const ProbedEntity& probe : probes) {
    if (!probe.analysable) continue;
    const GhdlEntity& entity = *probe.entity;
    const ToolRun run = ghdl({"--elab-run", entity.name, kProbeArchitecture}, workdir);
    if (run.status != 0) {
      std::cout << "  note: " << file << ": entity " << entity.name
                << " left out, GHDL cannot elaborate it as top: " << firstErrorLine(run.output)
                << "\n";
      continue;
    }
    ++compared;
    if (!extractor.selectDesignUnit("work", entity.name.c_str(),
                                    ScanExtractor::SearchAllLibraries)) {
      ADD_FAILURE() << file << ": entity " << entity.name << " (line " << entity.line
                    << "): not found by ours";
      continue;
    }
    comparePorts(file, entity, parseReports(run.output, entity.ports.size()),
                 *extractor.getPorts());
  }
  if (compared == 0) GTEST_SKIP() << "GHDL elaborates no entity of " << file;
}

// The harness itself: a wrong reading of GHDL's answers would hide real mismatches.
TEST(GhdlDumpReader, ReadsEntityHeadersOfTheNamedFileOnly) {
  const std::string xml = R"(<?xml version="1.0"?>
<root>
 <library_unit kind="entity_declaration" file="/x/a.vhd" line="2" identifier="top">
  <generic_chain>
   <el kind="interface_constant_declaration" identifier="w"><default_value kind="lit"/></el>
   <el kind="interface_constant_declaration" identifier="n"></el>
  </generic_chain>
  <port_chain>
   <el line="4" identifier="a" mode="in" has_identifier_list="true">
    <subtype_indication kind="array_subtype_definition">
     <subtype_type_mark kind="simple_name" identifier="std_logic_vector"/>
    </subtype_indication>
   </el>
   <el line="5" identifier="b" mode="in" has_identifier_list="false">
    <subtype_indication ref="7"/>
   </el>
   <el line="6" identifier="\x&#x26;y\" mode="buffer" has_identifier_list="false">
    <subtype_indication kind="selected_name" identifier="word_t">
     <prefix kind="simple_name" identifier="pkg"/>
    </subtype_indication>
   </el>
  </port_chain>
 </library_unit>
 <library_unit kind="entity_declaration" file="/x/other.vhd" identifier="elsewhere"/>
</root>
)";
  std::vector<GhdlEntity> entities;
  ASSERT_TRUE(readGhdlEntities(xml, "/x/a.vhd", entities));
  ASSERT_EQ(entities.size(), 1u);
  EXPECT_EQ(entities[0].name, "top");
  EXPECT_EQ(entities[0].genericsWithoutDefault, std::vector<std::string>{"n"});
  struct Expected {
    const char* name;
    const char* mode;
    int line;
    int firstLine;
    const char* typeMark;
    bool constrained;
  };
  const Expected expected[] = {
      {"a", "in", 4, 4, "std_logic_vector", true},
      {"b", "in", 5, 4, "std_logic_vector", true},
      {"\\x&y\\", "buffer", 6, 6, "word_t", false},
  };
  ASSERT_EQ(entities[0].ports.size(), std::size(expected));
  for (size_t i = 0; i < std::size(expected); ++i) {
    const GhdlPort& port = entities[0].ports[i];
    EXPECT_EQ(port.name, expected[i].name);
    EXPECT_EQ(port.mode, expected[i].mode) << port.name;
    EXPECT_EQ(port.line, expected[i].line) << port.name;
    EXPECT_EQ(port.firstLineOfList, expected[i].firstLine) << port.name;
    EXPECT_EQ(port.typeMark, expected[i].typeMark) << port.name;
    EXPECT_EQ(port.constrained, expected[i].constrained) << port.name;
  }
}

TEST(GhdlProbeReports, ReadsEveryKindOfLine) {
  const std::string output =
      "p.vhd:5:5:@0ms:(report note): P|0|A|15|8|false\n"
      "p.vhd:6:5:@0ms:(report note): P|1|S|100|-4\n"
      "p.vhd:7:5:@0ms:(report note): P|2|S|'U'|'-'\n"
      "p.vhd:8:5:@0ms:(report note): P|3|E|2|true\n"
      "p.vhd:9:5:@0ms:(report note): P|4|N\n"
      "p.vhd:9:5:@0ms:(report note): P|9|A|1|2|true\n";
  const std::vector<GhdlBounds> bounds = parseReports(output, 6);
  EXPECT_TRUE(bounds[0].kind == ProbeKind::Array && bounds[0].left == "15" &&
              bounds[0].right == "8" && !bounds[0].ascending);
  EXPECT_TRUE(bounds[1].kind == ProbeKind::Scalar && bounds[1].left == "100" &&
              bounds[1].right == "-4" && !bounds[1].ascending);
  EXPECT_TRUE(bounds[2].kind == ProbeKind::Scalar && bounds[2].left == "'U'");
  EXPECT_TRUE(bounds[3].kind == ProbeKind::Positional && bounds[3].length == 2 &&
              bounds[3].ascending);
  EXPECT_TRUE(bounds[4].reported && bounds[4].kind == ProbeKind::Opaque);
  EXPECT_FALSE(bounds[5].reported);  // index 9 is beyond the entity's ports
}

std::string testName(const ::testing::TestParamInfo<std::string>& info) {
  return fixtureTestName(info.param);
}

INSTANTIATE_TEST_SUITE_P(Fixtures, GhdlDifferential,
                         ::testing::ValuesIn(fixtureFiles("vhdl", {".vhd", ".vhdl"})), testName);
GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(GhdlDifferential);

}  // namespace
