//===- FormatJsonTest.cpp - The "json" formatter ----------------------------===//
#include "FormatTestSupport.h"

#include <nlohmann/json.hpp>

using namespace FormatTest;

TEST(JsonFormatTest, Scalars) {
  EXPECT_EQ(Render("json", MetaBool::New(true)), "true\n");
  EXPECT_EQ(Render("json", MetaInt::New(-7)), "-7\n");
  EXPECT_EQ(Render("json", MetaString::New("up")), "\"up\"\n");
  EXPECT_EQ(Render("json", MetaInt::New()), "null\n");
  EXPECT_EQ(Render("json", MetaList::New(String)), "[]\n");
  EXPECT_EQ(Render("json", MetaStruct::New("Empty")), "{}\n");
  EXPECT_EQ(Render("json", nullptr), "");
}

TEST(JsonFormatTest, StructureInFieldOrderWithoutUnsetFields) {
  const std::string text = Render("json", Switch("vSwitch0", 1500, {"vmnic0"}, {1}),
                                  {{"header:VirtualSwitch", "%Name%"}, {"units:Policy.Peak", "x"}});
  EXPECT_EQ(text, "{\n"
                  "  \"Name\": \"vSwitch0\",\n"
                  "  \"MTU\": 1500,\n"
                  "  \"Uplinks\": [\n"
                  "    \"vmnic0\"\n"
                  "  ],\n"
                  "  \"Policy\": {\n"
                  "    \"Enabled\": true,\n"
                  "    \"Peak\": 100\n"
                  "  },\n"
                  "  \"Ports\": [\n"
                  "    {\n"
                  "      \"Port ID\": 1,\n"
                  "      \"In Use\": true\n"
                  "    }\n"
                  "  ]\n"
                  "}\n");
  const auto parsed = nlohmann::json::parse(text);
  EXPECT_EQ(parsed["Ports"][0]["Port ID"], 1);
  EXPECT_FALSE(parsed.contains("Notes"));
}

TEST(JsonFormatTest, HonoursFieldSelection) {
  EXPECT_EQ(
      Render("json", TwoSwitches(), {{"fields", "MTU, Name"}, {"fields:VirtualSwitch", "Uplinks"}}),
      "[\n"
      "  {\n"
      "    \"MTU\": 1500,\n"
      "    \"Name\": \"vSwitch0\"\n"
      "  },\n"
      "  {\n"
      "    \"MTU\": 9000,\n"
      "    \"Name\": \"vSwitch1\"\n"
      "  }\n"
      "]\n");
  EXPECT_EQ(Render("json", Switch("vSwitch1", 9000, {}, {}), {{"fields:VirtualSwitch", "Uplinks"}}),
            "{\n  \"Uplinks\": []\n}\n");
}

TEST(JsonFormatTest, EscapesAndRepairsStrings) {
  auto value = MetaStruct::New("Text");
  value->SetField("Key \"1\"", std::string("q\"b\\c\n\t\x01\x7f/"));
  value->SetField("Valid", "\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80");
  // A lone continuation byte, an overlong form, a surrogate, a byte that
  // never starts a sequence, a code point above U+10FFFF and a truncated end.
  value->SetField("Invalid", "a\x80"
                             "b\xC0\xAF"
                             "c\xED\xA0\x80"
                             "d\xF5"
                             "e\xF4\x90\x80\x80"
                             "f\xE2\x82");
  const std::string text = Render("json", value);
  EXPECT_EQ(text, "{\n"
                  "  \"Key \\\"1\\\"\": \"q\\\"b\\\\c\\u000a\\u0009\\u0001\x7f/\",\n"
                  "  \"Valid\": \"\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80\",\n"
                  "  \"Invalid\": \"a\\ufffdb\\ufffd\\ufffdc\\ufffd\\ufffd\\ufffdd\\ufffd"
                  "e\\ufffd\\ufffd\\ufffd\\ufffdf\\ufffd\\ufffd\"\n"
                  "}\n");
  const auto parsed = nlohmann::json::parse(text);
  EXPECT_EQ(parsed["Key \"1\""], "q\"b\\c\n\t\x01\x7f/");
  EXPECT_EQ(parsed["Valid"], "\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80");
}

// Every control character, the edges 0x01 and 0x1f included, is escaped:
// JSON forbids them raw inside a string.
TEST(JsonFormatTest, EscapesEveryControlCharacter) {
  std::string controls;
  for (char c = 1; c < 0x20; ++c)
    controls += c;
  const std::string text = Render("json", MetaString::New(controls));
  ASSERT_FALSE(text.empty());
  for (char c : text.substr(0, text.size() - 1))
    EXPECT_GE(static_cast<unsigned char>(c), 0x20) << "raw control character " << int(c);
  EXPECT_EQ(nlohmann::json::parse(text), controls);
}

TEST(JsonFormatTest, ReadsBackAsTheResult) {
  for (const auto& [name, root] : Samples())
    EXPECT_EQ(nlohmann::ordered_json::parse(Render("json", root)), Expected(root)) << name;
}

// The writer chooses the fields of a structure kind once and reuses the
// choice; rows of one name whose fields differ, and one kind at two depths,
// must still be written as if each were chosen alone.
TEST(JsonFormatTest, RowsOfOneKindWithDifferentFieldsOrDepths) {
  auto row = [](const char* name, bool withMtu) {
    auto value = MetaStruct::New("Row");
    value->SetField("Name", name);
    if (withMtu)
      value->SetField("MTU", 9000);
    return value;
  };
  auto list = MetaList::New(Struct);
  list->Add(row("a", false));
  list->Add(row("b", true));
  auto nested = row("c", false);
  nested->SetField("Inner", row("d", true));
  list->Add(nested);
  EXPECT_EQ(Render("json", list, {{"fields:Row", "MTU,Name"}}), "[\n"
                                                                "  {\n"
                                                                "    \"Name\": \"a\"\n"
                                                                "  },\n"
                                                                "  {\n"
                                                                "    \"MTU\": 9000,\n"
                                                                "    \"Name\": \"b\"\n"
                                                                "  },\n"
                                                                "  {\n"
                                                                "    \"Name\": \"c\"\n"
                                                                "  }\n"
                                                                "]\n");
  EXPECT_EQ(Render("json", list), "[\n"
                                  "  {\n"
                                  "    \"Name\": \"a\"\n"
                                  "  },\n"
                                  "  {\n"
                                  "    \"Name\": \"b\",\n"
                                  "    \"MTU\": 9000\n"
                                  "  },\n"
                                  "  {\n"
                                  "    \"Name\": \"c\",\n"
                                  "    \"Inner\": {\n"
                                  "      \"Name\": \"d\",\n"
                                  "      \"MTU\": 9000\n"
                                  "    }\n"
                                  "  }\n"
                                  "]\n");
}

// A listing longer than the writer's buffer is passed on in pieces, whole.
TEST(JsonFormatTest, LongListingsArriveWhole) {
  auto list = MetaList::New(String);
  std::string expected = "[";
  for (int i = 0; i < 20000; ++i) {
    std::string item = "item-" + std::to_string(i);
    list->Add(item);
    expected += std::string(i ? "," : "") + "\n  \"" + item + "\"";
  }
  expected += "\n]\n";
  EXPECT_EQ(Render("json", list), expected);
}
