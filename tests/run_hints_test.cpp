// The advice a failed run gives: which names come closest to a unit that was not found, and
// which -lang a design file seems to need. What a -g could have meant is told by the cli_generic_*
// and cli_parameter_* golden cases.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "run_hints.h"
#include "support/scratch_dir.h"

namespace {

using pinforge_test::ScratchDir;

TEST(RunHints, ClosestNamesByEditDistanceIgnoringCase) {
  const std::vector<std::string> names = {"fifo_sync", "FIFO", "top", "fifo",
                                          "uart_tx",   "Top2", "fif", "alu"};
  const struct {
    const char* wanted;
    size_t most;
    std::vector<std::string> closest;
  } cases[] = {
      // Ties keep the listing order; a name listed twice counts once.
      {"fifo", 3, {"FIFO", "fifo", "fif"}},
      {"TOP", 2, {"top", "Top2"}},
      {"x", 0, {}},
      {"uart_rx", 1, {"uart_tx"}},
      {"", 20, {"top", "fif", "alu", "FIFO", "fifo", "Top2", "uart_tx", "fifo_sync"}},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.wanted);
    EXPECT_EQ(closestNames(c.wanted, names, c.most), c.closest);
  }
  EXPECT_EQ(closestNames("a", {"b", "b", "c"}, 5), (std::vector<std::string>{"b", "c"}));
}

TEST(RunHints, NotFoundHintCountsUnitsAndOffersOnlyUnitsWithPorts) {
  auto unit = [](const char* kind, const char* name) {
    return ScanUnitInfo{"work", kind, name, "d.vhd", 1};
  };
  const struct {
    const char* what;
    std::vector<ScanUnitInfo> units;
    const char* hint;
  } cases[] = {
      {"nothing read", {}, ""},
      {"no entity among them",
       {unit("package", "top_pkg"), unit("package body", "top_pkg")},
       "2 design units were read, none of them an entity or a module."},
      {"five of seven, architectures and packages left out",
       {unit("entity", "a1"), unit("architecture", "top"), unit("module", "tap"),
        unit("interface", "tip"), unit("program", "t"), unit("entity", "xyzzy"),
        unit("entity", "top_tb"), unit("package", "top")},
       "8 design units were read; the closest names are: tap, tip, t, a1, top_tb."},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    EXPECT_EQ(unitNotFoundHint("top", c.units), c.hint);
  }
}

TEST(RunHints, LanguageHintFromExtensionsAndEntityDeclarations) {
  ScratchDir dir;
  ASSERT_TRUE(dir.write("ent.txt", "-- a comment\n\n  ENTITY Top IS\n  end;\n"));
  ASSERT_TRUE(dir.write("words.txt", "entity is\nthe entity x isn't\n"));
  ASSERT_TRUE(dir.write("m.v", "module m; endmodule\n"));
  auto files = [&dir](std::vector<std::string> names) {
    std::vector<ScanExtractor::RegisteredFile> registered;
    for (const std::string& name : names) registered.push_back({"work", dir.file(name)});
    return registered;
  };
  const std::string at = dir.path() + "/";
  const struct {
    const char* what;
    std::vector<std::string> names;
    bool verilog;
    std::string hint;
  } cases[] = {
      {"VHDL files read as VHDL", {"a.vhd", "ent.txt"}, false, ""},
      {"a .V file read as VHDL",
       {"a.vhd", "b.V"},
       false,
       at + "b.V looks like Verilog; read it with -lang verilog."},
      {"a header read as VHDL",
       {"x.svh", "b.v"},
       false,
       at + "x.svh looks like SystemVerilog; read it with -lang sv."},
      {"a .vhdl file read as Verilog",
       {"m.v", "c.vhdl"},
       true,
       at + "c.vhdl looks like VHDL; read it with -lang vhdl."},
      {"an entity read as Verilog",
       {"m.v", "ent.txt"},
       true,
       at + "ent.txt looks like VHDL (it declares entity Top); read it with -lang vhdl."},
      {"words that are no entity declaration", {"words.txt", "m.v", "gone.txt"}, true, ""},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    EXPECT_EQ(languageHint(files(c.names), c.verilog), c.hint);
  }
}

}  // namespace
