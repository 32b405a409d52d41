// Builds the run's argument vector from the command line or from a response file.
#include "response_file.h"

#include <filesystem>
#include <memory>
#include <string_view>
#include <system_error>

namespace {

constexpr std::string_view kWordDelimiters = " \t\n";

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};

/// Stores the words of `line` while free slots remain; words past the limit are dropped.
void storeWords(std::string_view line, ArgumentVector& expanded) {
  size_t position = 0;
  while (true) {
    const size_t start = line.find_first_not_of(kWordDelimiters, position);
    if (start == std::string_view::npos) return;
    size_t end = line.find_first_of(kWordDelimiters, start);
    if (end == std::string_view::npos) end = line.size();
    if (expanded.count() < ArgumentVector::kSlotLimit)
      expanded.append(std::string(line.substr(start, end - start)));
    position = end;
  }
}

/// Reads one line (without its "\n"; a "\r" just before it is dropped too). False at the end
/// of the file when nothing was read.
bool readLine(std::FILE* file, std::string& line) {
  line.clear();
  int c;
  while ((c = std::getc(file)) != EOF) {
    if (c == '\n') {
      if (!line.empty() && line.back() == '\r') line.pop_back();
      return true;
    }
    line.push_back(static_cast<char>(c));
  }
  return !line.empty();
}

bool readResponseFile(std::FILE* messageStream, const char* name, ArgumentVector& expanded) {
  // Some systems open a directory for reading; it is no more a response file there than where
  // the open fails.
  std::error_code error;
  std::unique_ptr<std::FILE, FileCloser> file(
      std::filesystem::is_directory(name, error) ? nullptr : std::fopen(name, "r"));
  if (!file) {
    std::fprintf(messageStream, "FATAL ERROR: Unable to open response file %s...\n", name);
    return false;
  }
  // The file is read to its end even once the vector is full, so the limit is still noticed.
  std::string line;
  while (readLine(file.get(), line)) storeWords(line, expanded);
  return true;
}

}  // namespace

std::vector<char*> ArgumentVector::pointers() {
  std::vector<char*> result;
  result.reserve(m_Words.size() + 1);
  for (std::string& word : m_Words) result.push_back(word.data());
  result.push_back(nullptr);
  return result;
}

bool expandResponseFile(std::FILE* messageStream, int argc, char** argv, ArgumentVector& expanded) {
  expanded.append("pinforge");
  if (argc > 1 && argv[1][0] == '@') {
    if (!readResponseFile(messageStream, argv[1] + 1, expanded)) return true;
  } else {
    for (int index = 1; index < argc && expanded.count() < ArgumentVector::kSlotLimit; ++index)
      expanded.append(argv[index]);
  }
  if (expanded.count() == ArgumentVector::kSlotLimit) {
    std::fprintf(messageStream,
                 "FATAL ERROR: The number of command line arguments exceeds the max allowed "
                 "(%d).\n",
                 static_cast<int>(ArgumentVector::kSlotLimit));
    return true;
  }
  return false;
}
