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
#include <utility>
#include <vector>

#include "support/process.h"
#include "support/scratch_dir.h"

namespace {

namespace fs = std::filesystem;
using namespace pinforge_test;

const std::string kMissing = "<missing>";
// Holds the designs several cases run on; it is not a case itself.
const std::string kSharedDesigns = "designs";

std::string goldenRoot() { return sourceDir() + "/tests/golden"; }

std::vector<std::string> goldenCases() {
  std::vector<std::string> cases;
  std::error_code error;
  for (const fs::directory_entry& entry : fs::directory_iterator(goldenRoot(), error))
    if (entry.is_directory(error) && entry.path().filename() != kSharedDesigns)
      cases.push_back(entry.path().filename().string());
  std::sort(cases.begin(), cases.end());
  return cases;
}

std::vector<std::string> words(const std::string& text) {
  std::istringstream stream(text == kMissing ? "" : text);
  std::vector<std::string> result;
  for (std::string word; stream >> word;) result.push_back(word);
  return result;
}

class GoldenTest : public testing::TestWithParam<std::string> {};

TEST_P(GoldenTest, MatchesExpectations) {
  ASSERT_FALSE(binaryPath().empty()) << "PINFORGE_BIN is not set";
  const fs::path caseDir = fs::path(goldenRoot()) / GetParam();
  const auto caseFile = [&](const char* name) { return readFile((caseDir / name).string()); };
  const std::string argsText = caseFile("args");
  ASSERT_NE(argsText, kMissing) << "case " << GetParam() << " has no args file";
  for (const std::string& tool : words(caseFile("requires")))
    if (findOnPath(tool).empty()) GTEST_SKIP() << tool << " is not installed";

  // The shared designs the case names come first, so that its own files can replace them;
  // everything but the files that describe the case takes part in the run.
  const std::set<std::string> control = {"args",          "requires",      "designs",
                                         "expect",        "expect.stdout", "expect.stderr",
                                         "expect.status", "expect.absent"};
  ScratchDir work;
  std::error_code error;
  std::vector<fs::path> sources;
  for (const std::string& design : words(caseFile("designs")))
    sources.push_back(fs::path(goldenRoot()) / kSharedDesigns / design);
  sources.push_back(caseDir);
  for (const fs::path& source : sources) {
    ASSERT_TRUE(fs::is_directory(source, error)) << source << " does not exist";
    for (const fs::directory_entry& entry : fs::directory_iterator(source, error)) {
      if (control.count(entry.path().filename().string()) != 0) continue;
      fs::copy(entry.path(), fs::path(work.path()) / entry.path().filename(),
               fs::copy_options::recursive | fs::copy_options::overwrite_existing, error);
      ASSERT_FALSE(error) << entry.path();
    }
  }
  const RunResult run = runPinforge(words(argsText), work.path());
  ASSERT_TRUE(run.started);

  const std::string status = caseFile("expect.status");
  EXPECT_EQ(run.status, status == kMissing ? 0 : std::atoi(status.c_str()))
      << "stdout:\n"
      << run.out << "stderr:\n"
      << run.err;
  for (const auto& [name, actual] :
       {std::pair{"expect.stdout", &run.out}, std::pair{"expect.stderr", &run.err}}) {
    const std::string expected = caseFile(name);
    EXPECT_EQ(*actual, expected == kMissing ? *actual : expected) << name;
  }
  const fs::path expectDir = caseDir / "expect";
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(expectDir, error)) {
    if (!entry.is_regular_file(error)) continue;
    const fs::path relative = fs::relative(entry.path(), expectDir, error);
    EXPECT_EQ(work.read(relative.string()), readFile(entry.path().string())) << relative;
  }
  for (const std::string& name : words(caseFile("expect.absent")))
    EXPECT_FALSE(work.exists(name)) << name << " was left behind";
}

}  // namespace

GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(GoldenTest);
INSTANTIATE_TEST_SUITE_P(Cases, GoldenTest, testing::ValuesIn(goldenCases()),
                         [](const testing::TestParamInfo<std::string>& row) {
                           std::string name = row.param;
                           for (char& c : name)
                             if (!std::isalnum(static_cast<unsigned char>(c))) c = '_';
                           return name;
                         });
