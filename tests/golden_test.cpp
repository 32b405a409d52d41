// Runs every case directory under tests/golden/ through the built binary and compares exit
// status, standard output, standard error and the produced files with the case's expectations.
// The case format is described in tests/golden/README.md.
#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "flow_support.h"

namespace {

namespace fs = std::filesystem;
using flowtest::readFile;

/// Files of a case directory that describe the case rather than take part in the run.
const std::set<std::string> kCaseControlFiles = {"args",          "requires", "expect",
                                                 "expect.stdout", "expect.stderr",
                                                 "expect.status"};

std::string goldenRoot() { return flowtest::sourceDir() + "/tests/golden"; }

std::vector<std::string> goldenCases() {
  std::vector<std::string> cases;
  std::error_code error;
  const std::string root = flowtest::sourceDir().empty() ? "" : goldenRoot();
  if (root.empty() || !fs::is_directory(root, error)) return cases;
  for (const fs::directory_entry& entry : fs::directory_iterator(root, error))
    if (entry.is_directory(error)) cases.push_back(entry.path().filename().string());
  std::sort(cases.begin(), cases.end());
  return cases;
}

std::vector<std::string> words(const std::string& text) {
  std::istringstream stream(text);
  std::vector<std::string> result;
  std::string word;
  while (stream >> word) result.push_back(word);
  return result;
}

bool copyCase(const fs::path& from, const fs::path& to) {
  std::error_code error;
  for (const fs::directory_entry& entry : fs::directory_iterator(from, error)) {
    if (kCaseControlFiles.count(entry.path().filename().string()) != 0) continue;
    fs::copy(entry.path(), to / entry.path().filename(), fs::copy_options::recursive, error);
    if (error) return false;
  }
  return !error;
}

class GoldenTest : public testing::TestWithParam<std::string> {};

TEST_P(GoldenTest, MatchesExpectations) {
  const std::string binary = flowtest::pinforgeBinary();
  ASSERT_FALSE(binary.empty()) << "PINFORGE_BIN is not set";
  const fs::path caseDir = fs::path(goldenRoot()) / GetParam();

  bool hasArgs = false;
  const std::vector<std::string> args = words(readFile(caseDir / "args", &hasArgs));
  ASSERT_TRUE(hasArgs) << "case " << GetParam() << " has no args file";
  for (const std::string& tool : words(readFile(caseDir / "requires")))
    if (!flowtest::onPath(tool)) GTEST_SKIP() << tool << " is not installed";

  flowtest::TempDir work;
  ASSERT_FALSE(work.path().empty());
  ASSERT_TRUE(copyCase(caseDir, work.path()));
  const flowtest::RunResult run = flowtest::runProgram(binary, args, work.path());
  ASSERT_TRUE(run.started);

  bool hasStatus = false;
  const std::string statusText = readFile(caseDir / "expect.status", &hasStatus);
  const int expectedStatus = hasStatus ? std::atoi(statusText.c_str()) : 0;
  EXPECT_EQ(run.status, expectedStatus) << "stdout:\n" << run.out << "stderr:\n" << run.err;

  for (const auto& [name, actual] : {std::pair{"expect.stdout", &run.out},
                                     std::pair{"expect.stderr", &run.err}}) {
    bool present = false;
    const std::string expected = readFile(caseDir / name, &present);
    if (present) flowtest::expectSameText(name, expected, *actual);
  }

  std::error_code error;
  const fs::path expectDir = caseDir / "expect";
  if (!fs::is_directory(expectDir, error)) return;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(expectDir, error)) {
    if (!entry.is_regular_file(error)) continue;
    const fs::path relative = fs::relative(entry.path(), expectDir, error);
    bool produced = false;
    const std::string actual = readFile(fs::path(work.path()) / relative, &produced);
    EXPECT_TRUE(produced) << relative << " was not produced";
    if (produced) flowtest::expectSameText(relative.string(), readFile(entry.path()), actual);
  }
}

std::string caseTestName(const testing::TestParamInfo<std::string>& info) {
  std::string name = info.param;
  for (char& c : name)
    if (!std::isalnum(static_cast<unsigned char>(c))) c = '_';
  return name;
}

}  // namespace

GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(GoldenTest);
INSTANTIATE_TEST_SUITE_P(Cases, GoldenTest, testing::ValuesIn(goldenCases()), caseTestName);
