// The shipped demo must keep working: run examples/demo.sh into a scratch directory and
// compare every output with the reviewed copy in examples/expected/.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "flow_support.h"

namespace {

namespace fs = std::filesystem;

TEST(FlowDemo, ProducesTheReviewedOutputs) {
  const std::string source = flowtest::sourceDir();
  ASSERT_FALSE(source.empty()) << "PINFORGE_SOURCE_DIR is not set";
  flowtest::TempDir out;
  ASSERT_FALSE(out.path().empty());

  const flowtest::RunResult run = flowtest::runProgram(
      "/bin/sh", {source + "/examples/demo.sh", flowtest::pinforgeBinary(), out.path()}, source);
  ASSERT_TRUE(run.started);
  EXPECT_EQ(run.status, 0) << run.out << run.err;
  EXPECT_NE(run.out.find("Outputs are in "), std::string::npos) << run.out;

  // The port tables come from the Tcl template, which needs tclsh.
  const bool haveTcl = flowtest::onPath("tclsh");
  std::error_code error;
  int compared = 0;
  for (const fs::directory_entry& entry :
       fs::directory_iterator(source + "/examples/expected", error)) {
    const std::string name = entry.path().filename().string();
    if (!haveTcl && name.ends_with("_ports.txt")) continue;
    bool produced = false;
    const std::string actual = flowtest::readFile(out.file(name), &produced);
    EXPECT_TRUE(produced) << name;
    flowtest::expectSameText(name, flowtest::readFile(entry.path()), actual);
    ++compared;
  }
  EXPECT_GE(compared, 6);
}

}  // namespace
