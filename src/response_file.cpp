// Builds the run's argument vector from the command line or from a response file.
#include "response_file.h"

#include <string>

#include "message_lines.h"
#include "owned_stream.h"
#include "platform/hostkit.h"

namespace {

/// Opens a response file for reading, or writes why it cannot be one. A FIFO or a device such
/// as /dev/zero is refused instead of read forever.
OwnedStream openResponseFile(std::FILE* messageStream, const char* name) {
  bool notRegular = false;
  OwnedStream file(Host::File::openRegular(name, notRegular));
  if (file) return file;
  if (notRegular)
    writeFatalError(messageStream,
                    "Response file " + std::string(name) + " is not a regular file.");
  else
    writeFatalError(messageStream, "Unable to open response file " + std::string(name) + "...");
  return nullptr;
}

/// Splits a stream into words at blanks, tabs and line ends; a "\r" just before a "\n" belongs
/// to the line end. Words past the argument limit are counted but not kept.
class WordSplitter {
 public:
  explicit WordSplitter(ArgumentVector& expanded) : m_Expanded(expanded) {}

  /// False when a word grew longer than the limit; `line` then holds its line number.
  bool read(std::FILE* file, size_t& line) {
    line = 1;
    bool carriageReturn = false;
    for (int c; (c = std::getc(file)) != EOF;) {
      if (c == '\n') {
        carriageReturn = false;
        endWord();
        ++line;
        continue;
      }
      if (carriageReturn) m_Word.push_back('\r');
      carriageReturn = c == '\r';
      if (c == ' ' || c == '\t')
        endWord();
      else if (!carriageReturn)
        m_Word.push_back(static_cast<char>(c));
      if (m_Word.size() > ArgumentVector::kMaxWordBytes) return false;
    }
    if (carriageReturn) m_Word.push_back('\r');
    endWord();
    return true;
  }
  size_t total() const { return m_Total; }

 private:
  void endWord() {
    if (m_Word.empty()) return;
    ++m_Total;
    if (m_Expanded.count() <= ArgumentVector::kMaxArguments) m_Expanded.append(std::move(m_Word));
    m_Word.clear();
  }

  ArgumentVector& m_Expanded;
  std::string m_Word;
  size_t m_Total = 0;
};

}  // namespace

std::vector<char*> ArgumentVector::pointers() {
  std::vector<char*> result;
  result.reserve(m_Words.size() + 1);
  for (std::string& word : m_Words) result.push_back(word.data());
  result.push_back(nullptr);
  return result;
}

Expansion expandResponseFile(std::FILE* messageStream, int argc, char** argv,
                             ArgumentVector& expanded) {
  expanded.append("pinforge");
  size_t given = 0;
  if (argc > 1 && argv[1][0] == '@') {
    const char* name = argv[1] + 1;
    OwnedStream file = openResponseFile(messageStream, name);
    if (!file) return Expansion::Refused;
    WordSplitter splitter(expanded);
    size_t line = 0;
    if (!splitter.read(file.get(), line)) {
      writeFatalError(messageStream, "Response file " + std::string(name) + ", line " +
                                         std::to_string(line) + ": a word is longer than " +
                                         std::to_string(ArgumentVector::kMaxWordBytes >> 20) +
                                         " MB.");
      return Expansion::Refused;
    }
    given = splitter.total();
  } else {
    given = argc > 1 ? static_cast<size_t>(argc) - 1 : 0;
    for (size_t index = 1; index <= given && index <= ArgumentVector::kMaxArguments; ++index)
      expanded.append(argv[index]);
  }
  if (given > ArgumentVector::kMaxArguments) {
    writeFatalError(messageStream,
                    "The number of command line arguments exceeds the max allowed (" +
                        std::to_string(ArgumentVector::kMaxArguments) + ").");
    return Expansion::Refused;
  }
  return Expansion::Ready;
}
