// The extractor's library search order: the named library first, then every registered
// library in registration order; search mode 0 stays in the named library.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "platform/scan.h"

namespace {

std::string fixture(const std::string& name) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  std::string here = __FILE__;
  std::string base =
      root ? std::string(root) + "/tests" : here.substr(0, here.rfind("/tests/") + 6);
  return base + "/fixtures/vhdl/" + name;
}

struct SearchCase {
  const char* label;
  std::vector<std::pair<const char*, const char*>> files;  ///< library, fixture
  const char* library;
  ScanExtractor::DesignUnitSearch search;
  const char* firstPort;  ///< null: not found
};

const SearchCase kCases[] = {
    {"named_library_wins",
     {{"alib", "order_a.vhd"}, {"work", "order_b.vhd"}},
     "work",
     ScanExtractor::SearchAllLibraries,
     "from_b"},
    {"registration_order_after_the_named_library",
     {{"blib", "order_b.vhd"}, {"alib", "order_a.vhd"}},
     "work",
     ScanExtractor::SearchAllLibraries,
     "from_b"},
    {"named_library_only",
     {{"alib", "order_a.vhd"}},
     "work",
     ScanExtractor::SearchNamedLibraryOnly,
     nullptr},
    {"named_library_other_than_work",
     {{"alib", "order_a.vhd"}, {"blib", "order_b.vhd"}},
     "blib",
     ScanExtractor::SearchNamedLibraryOnly,
     "from_b"},
    {"library_names_ignore_case",
     {{"WORK", "order_a.vhd"}},
     "work",
     ScanExtractor::SearchNamedLibraryOnly,
     "from_a"},
};

class LibrarySearch : public testing::TestWithParam<SearchCase> {};

TEST_P(LibrarySearch, FindsTheRightUnit) {
  const SearchCase& c = GetParam();
  ScanExtractor extractor;
  for (const auto& [library, file] : c.files)
    extractor.addDesignFile(library, fixture(file).c_str(), ScanExtractor::Vhdl);
  extractor.Parse(ScanExtractor::Vhdl);
  const bool found = extractor.selectDesignUnit(c.library, "TWIN", c.search);
  ScanPortList* ports = extractor.getPorts();
  ASSERT_NE(ports, nullptr);
  if (c.firstPort == nullptr) {
    EXPECT_FALSE(found);
    EXPECT_EQ(ports->firstPort(), nullptr);
    return;
  }
  ASSERT_TRUE(found);
  ASSERT_NE(ports->firstPort(), nullptr);
  EXPECT_STREQ(ports->firstPort()->name(), c.firstPort);
  EXPECT_EQ(ports->nextPort(ports->firstPort()), nullptr);
}

INSTANTIATE_TEST_SUITE_P(Scan, LibrarySearch, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<SearchCase>& info) {
                           return std::string(info.param.label);
                         });

TEST(Extractor, RegistersLibrariesInFirstUseOrder) {
  ScanExtractor extractor;
  extractor.addDesignFile("b", "x.vhd", ScanExtractor::Vhdl);
  extractor.addDesignFile("a", "y.vhd", ScanExtractor::Vhdl);
  extractor.addDesignFile("b", "z.vhd", ScanExtractor::Vhdl);
  EXPECT_EQ(extractor.libraries(), (std::vector<std::string>{"b", "a"}));
  ASSERT_EQ(extractor.files().size(), 3u);
  EXPECT_EQ(extractor.files()[2].path, "z.vhd");
}

TEST(Extractor, GetPortsBeforeAnyLookupIsEmpty) {
  ScanExtractor extractor;
  EXPECT_EQ(extractor.getPorts()->size(), 0u);
  EXPECT_FALSE(extractor.selectDesignUnit("work", "x", ScanExtractor::SearchAllLibraries));
}

}  // namespace
