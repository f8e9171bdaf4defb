//===- FormatTableTest.cpp - The "table" formatter --------------------------===//
#include "FormatTestSupport.h"

#include <cstdlib>

using namespace FormatTest;

namespace {

/// Sets COLUMNS for one test and restores it afterwards.
class ColumnsTest : public ::testing::Test {
protected:
  void SetUp() override {
    const char* saved = std::getenv("COLUMNS");
    hadColumns_ = saved != nullptr;
    if (saved)
      saved_ = saved;
  }
  void TearDown() override {
    if (hadColumns_)
      setenv("COLUMNS", saved_.c_str(), 1);
    else
      unsetenv("COLUMNS");
  }

private:
  bool hadColumns_ = false; ///< COLUMNS was set before the test.
  std::string saved_;       ///< Its value then.
};

std::shared_ptr<MetaList> Plugins() {
  auto element = MetaStruct::New("Plugin");
  element->SetField("NIC", MetaString::New());
  element->SetField("Description", MetaString::New());
  auto list = MetaList::New(Struct, element);
  auto first = std::static_pointer_cast<MetaStruct>(element->Clone());
  first->SetField("NIC", "vmnic0");
  first->SetField("Description", "Intel Corporation Ethernet Controller  X710 for 10GbE SFP+");
  auto second = std::static_pointer_cast<MetaStruct>(element->Clone());
  second->SetField("NIC", "vmnic10");
  second->SetField("Description", "short");
  list->Add(first);
  list->Add(second);
  return list;
}

} // namespace

TEST(TableFormatTest, AlignsColumnsAndRendersCells) {
  EXPECT_EQ(Render("table", TwoSwitches(),
                   {{"fields:VirtualSwitch", "Name,MTU,Uplinks,Policy,Notes"},
                    {"units:VirtualSwitch.MTU", "B"}}),
            "Name      MTU     Uplinks         Policy                      Notes\n"
            "--------  ------  --------------  --------------------------  -----\n"
            "vSwitch0  1500 B  vmnic0, vmnic1  {Enabled: true, Peak: 100}\n"
            "vSwitch1  9000 B                  {Enabled: true, Peak: 100}\n");
}

TEST(TableFormatTest, NestedListsAndHiddenHeader) {
  EXPECT_EQ(Render("table", TwoSwitches(), {{"fields", "Ports,Name"}, {"show-header", "false"}}),
            "[{Port ID: 1, In Use: true}, {Port ID: 2, In Use: false}]  vSwitch0\n"
            "[]                                                         vSwitch1\n");
}

TEST(TableFormatTest, ColumnSelection) {
  // "table-columns:S" wins over "fields:S"; the user's "fields" wins over both.
  EXPECT_EQ(
      Render("table", TwoSwitches(),
             {{"fields:VirtualSwitch", "Name"}, {"table-columns:VirtualSwitch", "MTU, Name"}}),
      "MTU   Name\n"
      "----  --------\n"
      "1500  vSwitch0\n"
      "9000  vSwitch1\n");
  EXPECT_EQ(Render("table", TwoSwitches(), {{"table-columns", "MTU,Name"}, {"fields", "Name"}}),
            "Name\n--------\nvSwitch0\nvSwitch1\n");
  // Without any selection all fields of the element template are columns,
  // unset ones included.
  auto element = MetaStruct::New("Row");
  element->SetField("A", MetaString::New());
  element->SetField("B", MetaInt::New());
  auto list = MetaList::New(Struct, element);
  auto row = MetaStruct::New("Row");
  row->SetField("B", 7L);
  list->Add(row);
  EXPECT_EQ(Render("table", list), "A  B\n-  -\n   7\n");
}

TEST(TableFormatTest, FallsBackToSimpleForScalarsAndHandlesEdges) {
  EXPECT_EQ(Render("table", MetaInt::New(5)), "5\n");
  auto strings = MetaList::New(String);
  strings->AddAll(std::vector<std::string>{"a", "b"});
  EXPECT_EQ(Render("table", strings), "a\nb\n");
  EXPECT_EQ(Render("table", MetaList::New(Struct, SwitchTemplate())), "");
  // A single structure is no table: it prints as "simple" does.
  EXPECT_EQ(Render("table", Switch("vSwitch0", 1500, {}, {}), {{"fields", "Name,MTU"}}),
            "Name: vSwitch0\nMTU: 1500\n");
}

TEST(TableFormatTest, CountsCharactersNotBytesAndKeepsCellsOnOneLine) {
  auto list = MetaList::New(Struct);
  // A stored line break or terminal escape is shown escaped, never obeyed.
  for (const char* name : {"Z\xC3\xBCrich", "Bern\nNord", "\x1b[2J\xC2\x9B"}) {
    auto row = MetaStruct::New("City");
    row->SetField("Name", name);
    row->SetField("Id", 1L);
    list->Add(row);
  }
  EXPECT_EQ(Render("table", list), "Name           Id\n"
                                   "-------------  --\n"
                                   "Z\xC3\xBCrich         1\n"
                                   "Bern\\nNord     1\n"
                                   "\\x1b[2J\\u009b  1\n");
}

TEST_F(ColumnsTest, WrapsTheLastColumnToTheTerminalWidth) {
  setenv("COLUMNS", "30", 1);
  EXPECT_EQ(Render("table", Plugins(), {{"wrap-last", "true"}}), "NIC      Description\n"
                                                                 "-------  -------------------\n"
                                                                 "vmnic0   Intel Corporation\n"
                                                                 "         Ethernet Controller\n"
                                                                 "         X710 for 10GbE SFP+\n"
                                                                 "vmnic10  short\n");

  // A very narrow terminal still leaves ten characters; long words stay whole.
  setenv("COLUMNS", "12", 1);
  EXPECT_EQ(Render("table", Plugins(), {{"wrap-last", "TRUE"}, {"show-header", "off"}}),
            "vmnic0   Intel\n"
            "         Corporation\n"
            "         Ethernet\n"
            "         Controller\n"
            "         X710 for\n"
            "         10GbE SFP+\n"
            "vmnic10  short\n");
}

TEST_F(ColumnsTest, UnusableColumnsMeansEighty) {
  setenv("COLUMNS", "wide", 1);
  EXPECT_EQ(Render("table", Plugins(), {{"wrap-last", "true"}, {"show-header", "false"}}),
            "vmnic0   Intel Corporation Ethernet Controller X710 for 10GbE SFP+\n"
            "vmnic10  short\n");
}
