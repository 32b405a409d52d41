// The extractor's library search order: the named library first, then every registered
// library in registration order; search mode 0 stays in the named library.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "lib/scan/vhdl/vhdl_test_support.h"
#include "platform/scan.h"

namespace {

struct SearchCase {
  const char* label;
  std::vector<std::pair<const char*, const char*>> files;  ///< library, fixture
  const char* library;
  ScanExtractor::DesignUnitSearch search;
  const char* outcome;  ///< "found:" or "none:", then the ports of the unit found
};

const SearchCase kCases[] = {
    {"named_library_wins",
     {{"alib", "order_a.vhd"}, {"work", "order_b.vhd"}},
     "work",
     ScanExtractor::SearchAllLibraries,
     "found: from_b"},
    {"registration_order_after_the_named_library",
     {{"blib", "order_b.vhd"}, {"alib", "order_a.vhd"}},
     "work",
     ScanExtractor::SearchAllLibraries,
     "found: from_b"},
    {"named_library_only",
     {{"alib", "order_a.vhd"}},
     "work",
     ScanExtractor::SearchNamedLibraryOnly,
     "none:"},
    {"named_library_other_than_work",
     {{"alib", "order_a.vhd"}, {"blib", "order_b.vhd"}},
     "blib",
     ScanExtractor::SearchNamedLibraryOnly,
     "found: from_b"},
    {"library_names_ignore_case",
     {{"WORK", "order_a.vhd"}},
     "work",
     ScanExtractor::SearchNamedLibraryOnly,
     "found: from_a"},
};

class LibrarySearch : public testing::TestWithParam<SearchCase> {};

TEST_P(LibrarySearch, FindsTheRightUnit) {
  const SearchCase& c = GetParam();
  ScanExtractor extractor;
  for (const auto& [library, file] : c.files)
    extractor.addDesignFile(library, vhdl_test::fixture(file).c_str(), ScanExtractor::Vhdl);
  extractor.Parse(ScanExtractor::Vhdl);
  std::string outcome =
      extractor.selectDesignUnit(c.library, "TWIN", c.search) ? "found:" : "none:";
  const ScanPortList* ports = extractor.getPorts();
  for (const ScanPort* p = ports->firstPort(); p != nullptr; p = ports->nextPort(p))
    outcome += std::string(" ") + p->name();
  EXPECT_EQ(outcome, c.outcome);
}

INSTANTIATE_TEST_SUITE_P(Scan, LibrarySearch, testing::ValuesIn(kCases), vhdl_test::ByLabel());

TEST(Extractor, GetPortsBeforeAnyLookupIsEmpty) {
  ScanExtractor extractor;
  EXPECT_EQ(extractor.getPorts()->size(), 0u);
  EXPECT_FALSE(extractor.selectDesignUnit("work", "x", ScanExtractor::SearchAllLibraries));
}

}  // namespace
