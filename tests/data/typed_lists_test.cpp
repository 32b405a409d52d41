// Typed lists and records: ownership of the carried objects, header values and port records.
#include "data/typed_lists.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

int g_Alive = 0;

struct Counted {
  Counted() { ++g_Alive; }
  ~Counted() { --g_Alive; }
  Counted(const Counted&) = delete;
  Counted& operator=(const Counted&) = delete;
};

TEST(TypedLists, OwningListFreesEveryObjectEvenAfterANullOne) {
  g_Alive = 0;
  {
    OwningObjectList<Counted> list;
    list.appendOwned(new Counted);
    list.appendObject(nullptr);
    for (int i = 0; i < 200000; ++i) list.appendOwned(new Counted);
    EXPECT_EQ(g_Alive, 200001);
    list.first();
    list.next();  // a walk in progress does not change what is freed
  }
  EXPECT_EQ(g_Alive, 0);
}

TEST(TypedLists, HeaderValuesAreCopiedAndPortsComeBackInAppendOrder) {
  std::string project = "proj";
  StbDataList data(project.c_str(), nullptr, "out.vhd", nullptr, "pinforge", nullptr, "out",
                   nullptr);
  project = "changed";
  const std::vector<std::string> values = {data.m_Project, data.m_Module, data.m_FileName,
                                           data.m_Ext,     data.m_Tool,   data.m_Ver,
                                           data.m_Title,   data.m_Date};
  EXPECT_EQ(values,
            (std::vector<std::string>{"proj", "", "out.vhd", "", "pinforge", "", "out", ""}));
  EXPECT_EQ(data.first(), nullptr);

  data.appendOwned(new PortRecord("clk", -1, -1, 'I'));
  data.appendOwned(new PortRecord("q", 7, 0, 'O'));
  data.appendOwned(new PortRecord("io", 0, 1, 'B'));
  std::vector<std::string> names;
  for (PortRecord* port = data.first(); port != nullptr; port = data.next())
    names.push_back(port->m_Name);
  EXPECT_EQ(names, (std::vector<std::string>{"clk", "q", "io"}));

  TokList tokens;
  tokens.appendOwned(new TokEntry(std::string("a\0b", 3)));
  EXPECT_EQ(tokens.first()->m_Text, std::string("a\0b", 3));
}

TEST(PortRecord, UnknownRangeKeepsItsProblemTextEvenWhenEmpty) {
  PortRecord port("d", -1, -1, 'I');
  EXPECT_FALSE(port.isRangeUnknown());
  EXPECT_EQ(port.rangeProblem(), "");
  port.setRangeUnknown(std::string("W\0x", 3));
  EXPECT_TRUE(port.isRangeUnknown());
  EXPECT_EQ(port.rangeProblem(), std::string("W\0x", 3));
  PortRecord silent("e", -1, -1, 'I');
  silent.setRangeUnknown("");
  EXPECT_TRUE(silent.isRangeUnknown()) << "the state does not hang on the text";
}

}  // namespace
