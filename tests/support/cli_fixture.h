// Shared ground for the tests that run the pinforge binary: a scratch working directory with a
// small design and template, the texts the program prints, and the comparison of a whole run.
#pragma once

#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <vector>

#include "support/run_binary.h"
#include "support/scratch_dir.h"

namespace pinforge_test {

inline const std::string kUsageLine =
    "Usage: pinforge {-lib <libname> {<vhdfile>}} \t[-lang vhdl|verilog] \t[-module "
    "<module_name>] [-prj <project>] [-template <template_file>] \t[-o <stbfile>] [-err "
    "<errfile>] [-deleteonerror] [--nodelist] [--a] [--inc]\n";

inline std::string notFoundLine(const std::string& module) {
  return "pinforge:Declaration (Module " + module + ") not found.\n";
}
inline std::string completedWithErrors(const std::string& language = "vhdl") {
  return "forge(" + language + ") completed with errors.\n";
}

/// What one run is expected to show.
struct Expected {
  std::string out;
  std::string err;
  int status;
};

inline std::ostream& operator<<(std::ostream& stream, const RunResult& result) {
  return stream << "status " << result.status << "\n--- stdout ---\n"
                << result.out << "--- stderr ---\n"
                << result.err;
}

class CliTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
    ASSERT_FALSE(m_Dir.path().empty());
    // The design holds a unit named "other" only, so a run asking for "top" ends at the lookup.
    ASSERT_TRUE(m_Dir.write("other.vhd", "entity other is\nend entity other;\n"));
    ASSERT_TRUE(m_Dir.write("other.v", "module other;\nendmodule\n"));
    ASSERT_TRUE(m_Dir.write("tpl.txt", "%module%\n"));
  }

  RunResult run(const std::vector<std::string>& args) const {
    return runPinforge(args, m_Dir.path());
  }

  /// A complete command line whose only problem is that the design has no unit "top".
  static std::vector<std::string> completeArgs() {
    return {"-lib", "work",      "other.vhd", "-module", "top",    "-prj",
            "demo", "-template", "tpl.txt",   "-o",      "out.txt"};
  }

  static void expectRun(const RunResult& result, const Expected& expected) {
    ASSERT_TRUE(result.started);
    EXPECT_EQ(result.out, expected.out) << result;
    EXPECT_EQ(result.err, expected.err) << result;
    EXPECT_EQ(result.status, expected.status) << result;
  }

  ScratchDir m_Dir;
};

/// `base` with `extra` appended.
inline std::vector<std::string> plus(std::vector<std::string> base,
                                     const std::vector<std::string>& extra) {
  base.insert(base.end(), extra.begin(), extra.end());
  return base;
}

/// `base` without the switch `name` and its `arity` arguments.
inline std::vector<std::string> without(std::vector<std::string> base, const std::string& name,
                                        size_t arity) {
  for (size_t i = 0; i < base.size(); ++i) {
    if (base[i] == name) {
      base.erase(base.begin() + static_cast<long>(i),
                 base.begin() + static_cast<long>(i + 1 + arity));
      break;
    }
  }
  return base;
}

}  // namespace pinforge_test
