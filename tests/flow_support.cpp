// Process and file helpers shared by the black-box tests of the design flow and the golden
// case runner.
#include "flow_support.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <sstream>

extern char** environ;

namespace flowtest {

namespace fs = std::filesystem;

namespace {

std::string tempRoot() {
  const char* dir = std::getenv("TMPDIR");
  return dir != nullptr && *dir != '\0' ? dir : "/tmp";
}

std::vector<std::string> mergedEnvironment(const EnvChanges& changes) {
  std::vector<std::string> result;
  for (char** entry = environ; *entry != nullptr; ++entry) {
    const std::string_view text = *entry;
    bool replaced = false;
    for (const auto& [name, value] : changes)
      replaced = replaced || (text.starts_with(name) && text.size() > name.size() &&
                              text[name.size()] == '=');
    if (!replaced) result.emplace_back(text);
  }
  for (const auto& [name, value] : changes) result.push_back(name + "=" + value);
  return result;
}

std::vector<char*> pointers(std::vector<std::string>& texts) {
  std::vector<char*> result;
  for (std::string& text : texts) result.push_back(text.data());
  result.push_back(nullptr);
  return result;
}

std::string lineAt(std::string_view text, size_t index) {
  size_t start = 0;
  for (size_t i = 0; i < index; ++i) {
    const size_t newline = text.find('\n', start);
    if (newline == std::string_view::npos) return "<no such line>";
    start = newline + 1;
  }
  if (start >= text.size()) return "<end of text>";
  const size_t end = text.find('\n', start);
  return std::string(text.substr(start, end == std::string_view::npos ? end : end - start + 1));
}

std::string visible(std::string_view text) {
  std::string result;
  for (char c : text) {
    if (c == '\n')
      result += "\\n";
    else if (c == '\t')
      result += "\\t";
    else if (c == '\0')
      result += "\\0";
    else
      result += c;
  }
  return result;
}

}  // namespace

TempDir::TempDir() {
  std::string pattern = tempRoot() + "/pinforge-test-XXXXXX";
  if (mkdtemp(pattern.data()) != nullptr) m_Path = pattern;
}

TempDir::~TempDir() {
  if (m_Path.empty()) return;
  std::error_code error;
  fs::remove_all(m_Path, error);
}

std::string TempDir::file(std::string_view name) const { return m_Path + "/" + std::string(name); }

RunResult runProgram(const std::string& program, const std::vector<std::string>& args,
                     const std::string& cwd, const EnvChanges& env) {
  RunResult result;
  TempDir capture;
  if (capture.path().empty()) return result;
  const std::string outPath = capture.file("stdout");
  const std::string errPath = capture.file("stderr");

  std::vector<std::string> argvTexts{program};
  argvTexts.insert(argvTexts.end(), args.begin(), args.end());
  std::vector<std::string> envTexts = mergedEnvironment(env);
  std::vector<char*> argv = pointers(argvTexts);
  std::vector<char*> envp = pointers(envTexts);

  const pid_t child = fork();
  if (child < 0) return result;
  if (child == 0) {
    const int out = open(outPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    const int err = open(errPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    const int in = open("/dev/null", O_RDONLY);
    if (out < 0 || err < 0 || in < 0 || dup2(out, 1) < 0 || dup2(err, 2) < 0 || dup2(in, 0) < 0 ||
        chdir(cwd.c_str()) != 0)
      _exit(127);
    execve(program.c_str(), argv.data(), envp.data());
    _exit(127);
  }
  int status = 0;
  if (waitpid(child, &status, 0) != child) return result;
  result.started = true;
  result.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  result.out = readFile(outPath);
  result.err = readFile(errPath);
  return result;
}

std::string readFile(const std::string& path, bool* ok) {
  std::string text;
  std::FILE* file = std::fopen(path.c_str(), "rb");
  if (ok != nullptr) *ok = file != nullptr;
  if (file == nullptr) return text;
  char buffer[8192];
  size_t got;
  while ((got = std::fread(buffer, 1, sizeof buffer, file)) > 0) text.append(buffer, got);
  std::fclose(file);
  return text;
}

bool writeFile(const std::string& path, std::string_view text, bool executable) {
  std::FILE* file = std::fopen(path.c_str(), "wb");
  if (file == nullptr) return false;
  const bool written = std::fwrite(text.data(), 1, text.size(), file) == text.size();
  const bool closed = std::fclose(file) == 0;
  return written && closed && (!executable || chmod(path.c_str(), 0755) == 0);
}

bool makeDirectory(const std::string& path) { return mkdir(path.c_str(), 0755) == 0; }

bool exists(const std::string& path) {
  struct stat info;
  return stat(path.c_str(), &info) == 0;
}

std::string pinforgeBinary() {
  const char* value = std::getenv("PINFORGE_BIN");
  return value != nullptr ? value : "";
}

std::string sourceDir() {
  const char* value = std::getenv("PINFORGE_SOURCE_DIR");
  return value != nullptr ? value : "";
}

std::string directoryOnPath(std::string_view program) {
  const char* path = std::getenv("PATH");
  if (path == nullptr) return "";
  std::stringstream dirs{std::string(path)};
  std::string dir;
  while (std::getline(dirs, dir, ':'))
    if (!dir.empty() && access((dir + "/" + std::string(program)).c_str(), X_OK) == 0) return dir;
  return "";
}

bool onPath(std::string_view program) { return !directoryOnPath(program).empty(); }

std::string describeDifference(std::string_view what, std::string_view expected,
                               std::string_view actual) {
  if (expected == actual) return "";
  size_t line = 0;
  const size_t common = std::min(expected.size(), actual.size());
  size_t at = 0;
  while (at < common && expected[at] == actual[at]) {
    if (expected[at] == '\n') ++line;
    ++at;
  }
  std::ostringstream message;
  message << what << " differs at line " << line + 1 << " (byte " << at << ")\n"
          << "  expected: " << visible(lineAt(expected, line)) << "\n"
          << "  actual:   " << visible(lineAt(actual, line)) << "\n";
  if (expected.size() + actual.size() < 4000)
    message << "--- expected ---\n" << expected << "\n--- actual ---\n" << actual << "\n";
  return message.str();
}

void expectSameText(std::string_view what, std::string_view expected, std::string_view actual) {
  const std::string difference = describeDifference(what, expected, actual);
  if (!difference.empty()) ADD_FAILURE() << difference;
}

}  // namespace flowtest
