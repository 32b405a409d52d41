// What the tests that hold the extractor against external HDL tools share: running a tool
// with its two output streams interleaved, and the fixture files a suite runs over.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "support/process.h"
#include "support/scratch_dir.h"

namespace difftest {

using pinforge_test::readFile;
using pinforge_test::ScratchDir;
using pinforge_test::sourceDir;
using pinforge_test::writeFile;

/// The full path of `name` found on PATH, or empty when it is not installed.
inline std::string findTool(const std::string& name) { return pinforge_test::findOnPath(name); }

/// Whether the suite runs in CI, where every reference tool is installed on purpose.
inline bool inCi() {
  const char* ci = std::getenv("CI");
  return ci != nullptr && std::string_view(ci) == "true";
}

// A missing reference tool skips the test on a laptop but fails it under CI=true, so that a
// broken install step cannot turn the suite green. Use in the body of a TEST.
#define DIFFTEST_REQUIRE_TOOL(path, name)                                      \
  do {                                                                         \
    if ((path).empty()) {                                                      \
      if (difftest::inCi()) FAIL() << (name) << " is not installed (CI=true)"; \
      GTEST_SKIP() << (name) << " is not installed";                           \
    }                                                                          \
  } while (false)

struct ToolRun {
  int status = -1;     ///< exit code; -1 when the tool could not start or was killed
  std::string output;  ///< standard output and standard error, interleaved
};

/// Runs `argv` (argv[0] a full path) in `workDir` when one is given.
inline ToolRun runTool(const std::vector<std::string>& argv, const std::string& workDir = "",
                       unsigned timeoutSeconds = 120) {
  pinforge_test::RunResult run = pinforge_test::runProgram(argv, workDir, {}, true, timeoutSeconds);
  return {run.status, std::move(run.out)};
}

/// `text` in lower case (ASCII only: identifiers are compared, not prose).
inline std::string lowerCase(std::string_view text) {
  std::string lower(text);
  for (char& c : lower)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return lower;
}

/// The first line of a tool's output that mentions an error, else its first line: enough to
/// say why a fixture was skipped without flooding the log.
inline std::string firstErrorLine(const std::string& output) {
  size_t pos = lowerCase(output).find("error");
  pos = pos == std::string::npos ? 0 : output.rfind('\n', pos);
  pos = pos == std::string::npos ? 0 : pos + (output[pos] == '\n' ? 1 : 0);
  return output.substr(pos, output.find('\n', pos) - pos);
}

/// The files directly inside tests/fixtures/<language> whose extension is one of
/// `extensions`, sorted so test names and order are stable.
inline std::vector<std::string> fixtureFiles(const std::string& language,
                                             const std::vector<std::string>& extensions) {
  std::vector<std::string> files;
  std::error_code error;
  const std::string dir = sourceDir() + "/tests/fixtures/" + language;
  for (const auto& entry : std::filesystem::directory_iterator(dir, error))
    if (entry.is_regular_file(error) &&
        std::count(extensions.begin(), extensions.end(), entry.path().extension().string()) != 0)
      files.push_back(std::filesystem::absolute(entry.path(), error).lexically_normal().string());
  std::sort(files.begin(), files.end());
  return files;
}

/// A GoogleTest parameter name for a path: its file name with every character that is not a
/// letter or digit turned into '_'.
inline std::string fixtureTestName(const std::string& path) {
  std::string name = std::filesystem::path(path).filename().string();
  for (char& c : name)
    if (!((c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9'))) c = '_';
  return name;
}

}  // namespace difftest
