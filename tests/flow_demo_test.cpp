// The shipped demo must keep working: run examples/demo.sh into a scratch directory and
// compare every output with the reviewed copy in examples/expected/.
#include <gtest/gtest.h>

#include <string>

#include "flow_support.h"

namespace {

struct DemoOutput {
  const char* file;
  bool needsTcl;
};

constexpr DemoOutput kOutputs[] = {
    {"uart_tx_component.vhd", false},
    {"uart_tx_instance.vhd", false},
    {"uart_tx_pins.txt", false},
    {"uart_tx_ports.txt", true},
};

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

  const bool haveTcl = flowtest::onPath("tclsh");
  for (const DemoOutput& output : kOutputs) {
    if (output.needsTcl && !haveTcl) continue;
    bool produced = false;
    const std::string actual = flowtest::readFile(out.file(output.file), &produced);
    EXPECT_TRUE(produced) << output.file;
    flowtest::expectSameText(output.file,
                             flowtest::readFile(source + "/examples/expected/" + output.file),
                             actual);
  }
}

}  // namespace
