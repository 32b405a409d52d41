// Turns the process's command line, or the words of one response file named by an "@" first
// argument, into the argument vector the command-line parser reads.
#pragma once

#include <cstdio>
#include <string>
#include <vector>

/// The program name and its arguments, owned for the whole run.
class ArgumentVector {
 public:
  /// The most arguments (after the program name) a run accepts.
  static constexpr size_t kMaxArguments = 997;
  /// The longest word a response file may hold; a longer one is refused rather than read on.
  static constexpr size_t kMaxWordBytes = 16u << 20;

  void append(std::string word) { m_Words.push_back(std::move(word)); }
  size_t count() const { return m_Words.size(); }
  const std::string& operator[](size_t index) const { return m_Words[index]; }
  /// A C-style vector over the words (null-terminated), valid while this object is unchanged.
  std::vector<char*> pointers();

 private:
  std::vector<std::string> m_Words;
};

/// How building the argument vector ended.
enum class Expansion {
  Ready,    ///< the vector is complete
  Refused,  ///< a "FATAL ERROR: ..." line was written; the run must end with a failure
};

/// Fills `expanded` with "pinforge" followed by argv[1..] or, when argv[1] begins with "@", by
/// the blank-, tab- and newline-separated words of the file it names (later command-line
/// arguments are then ignored). A "\r\n" line end counts as "\n". Refused, after writing its
/// "FATAL ERROR: ..." line to `messageStream`, when the response file cannot be opened, is not
/// a regular file (a FIFO or a device is never read), or holds a word longer than
/// kMaxWordBytes, or when more than kMaxArguments arguments were given.
Expansion expandResponseFile(std::FILE* messageStream, int argc, char** argv,
                             ArgumentVector& expanded);
