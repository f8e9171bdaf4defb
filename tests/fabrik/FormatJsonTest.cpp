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
