// Turns the process's command line, or the words of one response file named by an "@" first
// argument, into the argument vector the command-line parser reads.
#pragma once

#include <cstdio>
#include <string>
#include <vector>

/// The program name and its arguments, owned for the whole run.
class ArgumentVector {
 public:
  /// Slot 0 (the program name) plus at most this many arguments fit; a vector that reaches
  /// this count is refused.
  static constexpr size_t kSlotLimit = 999;

  void append(std::string word) { m_Words.push_back(std::move(word)); }
  size_t count() const { return m_Words.size(); }
  const std::string& operator[](size_t index) const { return m_Words[index]; }
  /// A C-style vector over the words (null-terminated), valid while this object is unchanged.
  std::vector<char*> pointers();

 private:
  std::vector<std::string> m_Words;
};

/// Fills `expanded` with "pinforge" followed by argv[1..] or, when argv[1] begins with "@", by
/// the blank-, tab- and newline-separated words of the file it names (later command-line
/// arguments are then ignored). Lines of any length are read whole; a "\r\n" line end counts
/// as "\n". Returns true on FAILURE, after writing its "FATAL ERROR: ..." line to
/// `messageStream`: the response file cannot be opened, or 998 or more arguments were given.
bool expandResponseFile(std::FILE* messageStream, int argc, char** argv, ArgumentVector& expanded);
