//===- FormatCsvTest.cpp - The "csv" formatter ------------------------------===//
#include "FormatTestSupport.h"

using namespace FormatTest;
using nlohmann::ordered_json;

namespace {

/// Checks that a cell holds \p expected (null for an unset field): a scalar as
/// its text, a structure or list as JSON, an unset value as an empty cell.
void ExpectCell(const std::string& cell, const ordered_json& expected, const std::string& where) {
  if (expected.is_null())
    EXPECT_EQ(cell, "") << where;
  else if (expected.is_string())
    EXPECT_EQ(cell, expected.get<std::string>()) << where;
  else if (expected.is_primitive())
    EXPECT_EQ(cell, expected.dump()) << where;
  else
    EXPECT_EQ(ordered_json::parse(cell), expected) << where;
}

/// Checks the records read from the csv of \p root against the result.
void ExpectRecords(const ordered_json& records, const MetaObjectPtr& root,
                   const std::string& name) {
  ASSERT_TRUE(records.is_array()) << name;
  const ordered_json expected = Expected(root);
  if (root->GetType() != List && root->GetType() != Struct) {
    ASSERT_EQ(records.size(), 1u) << name;
    ASSERT_EQ(records[0].size(), 1u) << name;
    ExpectCell(records[0][0], expected, name);
    return;
  }
  const auto& list = static_cast<const MetaList&>(*root);
  if (root->GetType() == List && list.GetElementType() == String) {
    ASSERT_EQ(records.size(), expected.size() + 1) << name;
    EXPECT_EQ(records[0], ordered_json::array({"Value"})) << name;
    for (std::size_t i = 0; i < expected.size(); ++i)
      EXPECT_EQ(records[i + 1], ordered_json::array({expected[i]})) << name;
    return;
  }
  // A structure is one row; a list of structures one row per element. The
  // header names every field of the structure, set or not.
  const ordered_json rows = root->GetType() == Struct ? ordered_json::array({expected}) : expected;
  const auto& shape = static_cast<const MetaStruct&>(
      root->GetType() == Struct ? *root : *list.GetElementTemplate());
  auto header = ordered_json::array();
  for (const std::string& field : shape.GetLayout().GetFieldNames())
    header.push_back(field);
  ASSERT_EQ(records.size(), rows.size() + 1) << name;
  EXPECT_EQ(records[0], header) << name;
  for (std::size_t r = 0; r < rows.size(); ++r) {
    ASSERT_EQ(records[r + 1].size(), header.size()) << name;
    for (std::size_t c = 0; c < header.size(); ++c) {
      const std::string column = header[c];
      ExpectCell(records[r + 1][c], rows[r].contains(column) ? rows[r][column] : nullptr,
                 name + " row " + std::to_string(r) + " " + column);
    }
  }
}

} // namespace

TEST(CsvFormatTest, ScalarsAndStringLists) {
  EXPECT_EQ(Render("csv", MetaBool::New(true)), "true\n");
  EXPECT_EQ(Render("csv", MetaInt::New(-7)), "-7\n");
  EXPECT_EQ(Render("csv", MetaString::New("a, \"b\"")), "\"a, \"\"b\"\"\"\n");
  // A record of one empty field is quoted, or it would read as a blank line.
  EXPECT_EQ(Render("csv", MetaString::New("")), "\"\"\n");
  EXPECT_EQ(Render("csv", MetaString::New()), "");
  EXPECT_EQ(Render("csv", nullptr), "");

  auto strings = MetaList::New(String);
  EXPECT_EQ(Render("csv", strings), "Value\n");
  strings->AddAll(std::vector<std::string>{"vmnic0", "", "x\ny"});
  EXPECT_EQ(Render("csv", strings), "Value\nvmnic0\n\"\"\n\"x\ny\"\n");
  EXPECT_EQ(Render("csv", strings, {{"show-header", "false"}}), "vmnic0\n\"\"\n\"x\ny\"\n");
}

TEST(CsvFormatTest, StructuresWithNestedCells) {
  EXPECT_EQ(Render("csv", Nics()),
            "Name,Speed,Link Up,Uplinks,Driver,Queues,Description\n"
            "vmnic0,25000,true,\"[\"\"vmnic0\"\",\"\"vmnic1\"\"]\","
            "\"{\"\"Name\"\":\"\"nfx\"\",\"\"Firmware\"\":{\"\"Version\"\":\"\"2.1\"\","
            "\"\"Features\"\":[\"\"tso\"\",\"\"rss\"\"]}}\","
            "\"[{\"\"Queue ID\"\":0,\"\"Filters\"\":[{\"\"Class\"\":\"\"mac\"\","
            "\"\"MACs\"\":[\"\"00:50:56:00:00:01\"\"]}]}]\","
            "\"Dual port, \"\"25G\"\"\"\n"
            "vmnic1,-1,false,[],\"{\"\"Firmware\"\":{\"\"Features\"\":[]}}\",[],\n");
  // A single structure is a header and one row; unset fields are empty cells.
  EXPECT_EQ(Render("csv", Switch("vSwitch1", 9000, {}, {})),
            "Name,MTU,Uplinks,Policy,Ports,Notes\n"
            "vSwitch1,9000,[],\"{\"\"Enabled\"\":true,\"\"Peak\"\":100}\",[],\n");
  // An empty list still names its columns.
  EXPECT_EQ(Render("csv", MetaList::New(Struct, SwitchTemplate())),
            "Name,MTU,Uplinks,Policy,Ports,Notes\n");
}

TEST(CsvFormatTest, SelectsFieldsAndHonoursShowHeader) {
  const std::initializer_list<std::pair<std::string, std::string>> params = {
      {"fields", "Ports,Name"},
      {"fields:Port", "Port ID"},
      {"header:VirtualSwitch", "%Name%"},
      {"table-columns", "MTU"},
      {"units:VirtualSwitch.Name", "x"}};
  EXPECT_EQ(Render("csv", TwoSwitches(), params), "Ports,Name\n"
                                                  "\"[{\"\"Port ID\"\":1},{\"\"Port ID\"\":2}]\","
                                                  "vSwitch0\n"
                                                  "[],vSwitch1\n");
  EXPECT_EQ(Render("csv", TwoSwitches(), {{"fields", "Name"}, {"show-header", "false"}}),
            "vSwitch0\nvSwitch1\n");
  EXPECT_EQ(Render("csv", TwoSwitches(), {{"fields", "Bogus"}}), "");
}

TEST(CsvFormatTest, RowsWithoutTemplateKeepEveryField) {
  // Structures that differ: the columns are all their fields, in the order
  // they first appear, and nothing is lost.
  auto list = MetaList::New(Struct);
  auto first = MetaStruct::New("Entry");
  first->SetField("A", 1L);
  auto second = MetaStruct::New("Entry");
  second->SetField("B", "b");
  second->SetField("A", 2L);
  list->Add(first);
  list->Add(second);
  EXPECT_EQ(Render("csv", list), "A,B\n1,\n2,b\n");
}

TEST(CsvFormatTest, RepairsInvalidUtf8) {
  auto value = MetaStruct::New("Text");
  value->SetField("Bad\xFF", "a\xC0\xAF"
                             "b");
  EXPECT_EQ(Render("csv", value), "Bad\xEF\xBF\xBD\na\xEF\xBF\xBD\xEF\xBF\xBD"
                                  "b\n");
}

TEST(CsvFormatTest, ReadsBackWithAnRfc4180Reader) {
  if (!HavePython())
    GTEST_SKIP() << "python3 is not installed";
  const auto samples = Samples();
  std::vector<std::string> documents;
  for (const auto& sample : samples)
    documents.push_back(Render("csv", sample.second));
  std::string message;
  std::optional<ordered_json> read = ReadWithPython("csv", documents, message);
  ASSERT_TRUE(read) << message;
  ASSERT_EQ(read->size(), samples.size());
  for (std::size_t i = 0; i < samples.size(); ++i)
    ExpectRecords((*read)[i], samples[i].second, samples[i].first);

  // The reader is strict: text after a closing quote is refused.
  EXPECT_FALSE(ReadWithPython("csv", {"\"a\"b\r\n"}, message));
}
