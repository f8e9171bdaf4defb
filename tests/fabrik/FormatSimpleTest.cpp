//===- FormatSimpleTest.cpp - The "simple" formatter and the formatter table ===//
#include "FormatTestSupport.h"

using namespace FormatTest;

TEST(FormatterTableTest, KnowsItsNamesOnly) {
  EXPECT_EQ(Fabrik::Format::FormatterNames(),
            (std::vector<std::string>{"simple", "table", "json", "xml", "csv", "keyvalue"}));
  for (const std::string& name : Fabrik::Format::FormatterNames())
    EXPECT_NE(Fabrik::Format::MakeFormatter(name), nullptr) << name;
  EXPECT_EQ(Fabrik::Format::MakeFormatter("Simple"), nullptr);
  EXPECT_EQ(Fabrik::Format::MakeFormatter("xml-ish"), nullptr);
  for (const char* name : {"json", "xml", "csv", "keyvalue"})
    EXPECT_TRUE(Fabrik::Format::MakeFormatter(name)->IsMachineFormat()) << name;
  EXPECT_FALSE(Fabrik::Format::MakeFormatter("simple")->IsMachineFormat());
  EXPECT_FALSE(Fabrik::Format::MakeFormatter("table")->IsMachineFormat());
}

TEST(FormatParametersTest, LaterSetReplacesInPlace) {
  Parameters params;
  params.Set("fields:Nic", "Name");
  params.Set("wrap-last", "true");
  params.Set("fields:Nic", "MTU");
  using Pairs = std::vector<std::pair<std::string, std::string>>;
  EXPECT_EQ(params.All(), (Pairs{{"fields:Nic", "MTU"}, {"wrap-last", "true"}}));
  ASSERT_NE(params.Find("wrap-last"), nullptr);
  EXPECT_EQ(*params.Find("wrap-last"), "true");
  EXPECT_EQ(params.Find("fields"), nullptr);
}

TEST(SimpleFormatTest, ScalarsAndStringLists) {
  EXPECT_EQ(Render("simple", MetaBool::New(true)), "true\n");
  EXPECT_EQ(Render("simple", MetaBool::New(false)), "false\n");
  EXPECT_EQ(Render("simple", MetaInt::New(-42)), "-42\n");
  EXPECT_EQ(Render("simple", MetaString::New("up")), "up\n");
  EXPECT_EQ(Render("simple", MetaString::New()), "");
  EXPECT_EQ(Render("simple", nullptr), "");

  auto list = MetaList::New(String);
  EXPECT_EQ(Render("simple", list), "");
  list->AddAll(std::vector<std::string>{"search.example", "lab.example"});
  EXPECT_EQ(Render("simple", list), "search.example\nlab.example\n");
}

TEST(SimpleFormatTest, StoredTextCannotForgeLinesOrReachTheTerminal) {
  auto value = MetaStruct::New("PortGroup");
  value->SetField("Name", "pg\n   Uplinks: vmnic9");
  value->SetField("Comment", "\x1b]0;owned\x07 tab\there \xC2\x9B"
                             "2J caf\xC3\xA9");
  EXPECT_EQ(Render("simple", value),
            "Name: pg\\n   Uplinks: vmnic9\n"
            "Comment: \\x1b]0;owned\\x07 tab\\there \\u009b2J caf\xC3\xA9\n");
}

TEST(SimpleFormatTest, StructureWithNestedValuesUnitsAndUnsetFields) {
  auto value = Switch("vSwitch0", 1500, {"vmnic0", "vmnic1"}, {});
  value->SetField("Notes", "");
  EXPECT_EQ(Render("simple", value,
                   {{"units:VirtualSwitch.MTU", "bytes"},
                    {"units:Policy.Peak", "Kbps"},
                    {"units:Unused.MTU", "ignored"}}),
            "Name: vSwitch0\n"
            "MTU: 1500 bytes\n"
            "Uplinks: vmnic0, vmnic1\n"
            "Policy:\n"
            "   Enabled: true\n"
            "   Peak: 100 Kbps\n"
            "Ports:\n"
            "Notes:\n");
}

TEST(SimpleFormatTest, ListOfStructuresWithHeaders) {
  EXPECT_EQ(Render("simple", TwoSwitches(),
                   {{"header:VirtualSwitch", "Switch %Name% (MTU %MTU%, 100% %Missing%)"},
                    {"fields:VirtualSwitch", "Name, Ports"},
                    {"header:Port", "<NONE>"}}),
            "Switch vSwitch0 (MTU 1500, 100% %Missing%)\n"
            "   Name: vSwitch0\n"
            "   Ports:\n"
            "      Port ID: 1\n"
            "      In Use: true\n"
            "\n"
            "      Port ID: 2\n"
            "      In Use: false\n"
            "\n"
            "Switch vSwitch1 (MTU 9000, 100% %Missing%)\n"
            "   Name: vSwitch1\n"
            "   Ports:\n");

  // Without a header the blocks stay at the left margin.
  EXPECT_EQ(Render("simple", TwoSwitches(), {{"fields:VirtualSwitch", "Name"}}),
            "Name: vSwitch0\n\nName: vSwitch1\n");
}

TEST(SimpleFormatTest, FieldSelectionAndOrder) {
  // The user's "fields" wins over "fields:S" at the root, in its own order.
  EXPECT_EQ(Render("simple", TwoSwitches(),
                   {{"fields:VirtualSwitch", "Name"}, {"fields", " MTU ,Bogus,Name"}}),
            "MTU: 1500\nName: vSwitch0\n\nMTU: 9000\nName: vSwitch1\n");

  // Below the root, "fields:S" applies, then "table-columns:S".
  auto one = Switch("vSwitch0", 1500, {}, {1, 2});
  EXPECT_EQ(Render("simple", one, {{"fields", "Ports"}, {"fields:Port", "In Use,Port ID"}}),
            "Ports:\n"
            "   In Use: true\n"
            "   Port ID: 1\n"
            "\n"
            "   In Use: false\n"
            "   Port ID: 2\n");
  EXPECT_EQ(Render("simple", one, {{"fields", "Ports"}, {"table-columns:Port", "Port ID"}}),
            "Ports:\n   Port ID: 1\n\n   Port ID: 2\n");
}
