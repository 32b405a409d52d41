// The command-line parser: reads the switch declarations out of the usage text, then matches
// the argument vector against them, explaining the first mismatch before the usage line.
#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "platform/hostkit.h"

struct UT_CMDARGS::Switch {
  std::string key;       // the name without its leading dashes
  std::string declared;  // the name as the usage text spells it
  std::vector<std::string> requiredNames;
  size_t optional = 0;
  bool variadic = false;
  bool mandatory = false;
  std::vector<UT_CMDSWINFO> occurrences;
};

namespace {

bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r'; }
bool isBracket(char c) { return c == '{' || c == '}' || c == '[' || c == ']'; }

// Brackets are tokens of their own; everything else splits at white space.
std::vector<std::string_view> tokenizeUsage(std::string_view usage) {
  std::vector<std::string_view> tokens;
  size_t i = 0;
  while (i < usage.size()) {
    if (isSpace(usage[i])) {
      ++i;
    } else if (isBracket(usage[i])) {
      tokens.push_back(usage.substr(i, 1));
      ++i;
    } else {
      size_t end = i;
      while (end < usage.size() && !isSpace(usage[end]) && !isBracket(usage[end])) ++end;
      tokens.push_back(usage.substr(i, end - i));
      i = end;
    }
  }
  return tokens;
}

// "-x" and "--x" are one switch: compare without the dashes.
std::string_view switchKey(std::string_view word) {
  for (int dashes = 0; dashes < 2 && !word.empty() && word.front() == '-'; ++dashes)
    word.remove_prefix(1);
  return word;
}

bool beginsWithDash(const char* word) { return word[0] == '-'; }

bool isHelpKey(std::string_view key) { return key == "h" || key == "help" || key == "?"; }

void writeText(std::FILE* stream, std::string_view text) {
  std::fwrite(text.data(), 1, text.size(), stream);
}

}  // namespace

const char* UT_CMDSWINFO::getargtxt(uint16_t index) const {
  return index < m_Arguments.size() ? m_Arguments[index].c_str() : nullptr;
}

UT_CMDARGS::UT_CMDARGS(int argc, char** argv, const char* usage, void* /*callback*/, int /*option*/)
    : m_Usage(usage != nullptr ? usage : "") {
  declare(m_Usage);
  match(argv != nullptr ? argc : 0, argv);
}

UT_CMDARGS::~UT_CMDARGS() = default;

void UT_CMDARGS::declare(std::string_view usage) {
  std::vector<char> groups;  // the brackets open at this point of the usage text
  size_t current = 0;        // index of the switch whose arguments follow, or size() for none
  size_t currentDepth = 0;   // how many groups were open when that switch was declared
  bool sawProgram = false;
  for (std::string_view token : tokenizeUsage(usage)) {
    if (token == "{" || token == "[") {
      groups.push_back(token[0]);
    } else if (token == "}" || token == "]") {
      if (!groups.empty()) groups.pop_back();
      if (groups.size() < currentDepth) current = m_Switches.size();
    } else if (!sawProgram) {
      m_Program = token;
      sawProgram = true;
    } else if (token.front() == '-') {
      Switch declared;
      declared.key = switchKey(token);
      declared.declared = token;
      declared.mandatory = groups.empty();
      m_Switches.push_back(std::move(declared));
      current = m_Switches.size() - 1;
      currentDepth = groups.size();
    } else if (current < m_Switches.size()) {
      // How the argument is enclosed below its switch's own group says how often it may come.
      Switch& owner = m_Switches[current];
      bool repeats = false;
      bool optional = false;
      for (size_t g = currentDepth; g < groups.size(); ++g) {
        repeats = repeats || groups[g] == '{';
        optional = optional || groups[g] == '[';
      }
      if (repeats)
        owner.variadic = true;
      else if (optional)
        ++owner.optional;
      else
        owner.requiredNames.emplace_back(token);
    }
  }
}

void UT_CMDARGS::match(int argc, char** argv) {
  int i = 1;
  while (i < argc && argv[i] != nullptr) {
    std::string_view word = argv[i];
    if (!beginsWithDash(argv[i])) {
      fail("argument " + std::string(word) + " does not belong to any switch");
      return;
    }
    Switch* given = find(word);
    if (given == nullptr) {
      if (isHelpKey(switchKey(word))) {
        writeText(stdout, "Usage: " + m_Usage + "\n");
        std::fflush(stdout);
        m_GaveUsage = true;
      } else {
        fail("unknown switch " + std::string(word));
      }
      return;
    }
    ++i;
    UT_CMDSWINFO occurrence;
    const size_t most = given->requiredNames.size() + given->optional;
    while (i < argc && argv[i] != nullptr && !beginsWithDash(argv[i]) &&
           (given->variadic || occurrence.m_Arguments.size() < most)) {
      occurrence.m_Arguments.emplace_back(argv[i]);
      ++i;
    }
    const size_t count = occurrence.m_Arguments.size();
    if (count < given->requiredNames.size()) {
      fail("switch " + std::string(word) + " needs an argument " + given->requiredNames[count]);
      return;
    }
    given->occurrences.push_back(std::move(occurrence));
  }
  for (const Switch& declared : m_Switches) {
    if (declared.mandatory && declared.occurrences.empty()) {
      fail("missing switch " + declared.declared);
      return;
    }
  }
}

const UT_CMDARGS::Switch* UT_CMDARGS::find(std::string_view name) const {
  const std::string_view key = switchKey(name);
  for (const Switch& declared : m_Switches)
    if (declared.key == key) return &declared;
  return nullptr;
}

UT_CMDARGS::Switch* UT_CMDARGS::find(std::string_view name) {
  return const_cast<Switch*>(static_cast<const UT_CMDARGS*>(this)->find(name));
}

void UT_CMDARGS::fail(std::string_view reason) {
  m_Error = true;
  std::string text = m_Program;
  text += ": ";
  text += reason;
  text += "\nUsage: ";
  text += m_Usage;
  text += '\n';
  writeText(stderr, text);
  std::fflush(stderr);
}

bool UT_CMDARGS::findsw(const char* name) const {
  const Switch* declared = name != nullptr ? find(name) : nullptr;
  return declared != nullptr && !declared->occurrences.empty();
}

const UT_CMDSWINFO* UT_CMDARGS::getsw(const char* name, uint16_t occurrence) const {
  const Switch* declared = name != nullptr ? find(name) : nullptr;
  if (declared == nullptr || occurrence >= declared->occurrences.size()) return nullptr;
  return &declared->occurrences[occurrence];
}
