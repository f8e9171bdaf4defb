//===- FormatXmlTest.cpp - The "xml" formatter ------------------------------===//
#include "FormatTestSupport.h"

using namespace FormatTest;
using namespace std::string_literals;

namespace {

const std::string Declaration = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

} // namespace

TEST(XmlFormatTest, ScalarsAndEmptyValues) {
  EXPECT_EQ(Render("xml", MetaBool::New(true)),
            Declaration + "<output>\n  <boolean>true</boolean>\n</output>\n");
  EXPECT_EQ(Render("xml", MetaInt::New(-7)),
            Declaration + "<output>\n  <integer>-7</integer>\n</output>\n");
  EXPECT_EQ(Render("xml", MetaString::New("")),
            Declaration + "<output>\n  <string></string>\n</output>\n");
  EXPECT_EQ(Render("xml", MetaString::New()), Declaration + "<output/>\n");
  EXPECT_EQ(Render("xml", MetaList::New(Struct, SwitchTemplate())),
            Declaration + "<output>\n  <list type=\"structure\"/>\n</output>\n");
  EXPECT_EQ(Render("xml", MetaStruct::New("Empty")),
            Declaration + "<output>\n  <structure typeName=\"Empty\"/>\n</output>\n");
  EXPECT_EQ(Render("xml", nullptr), "");
}

TEST(XmlFormatTest, NestedStructuresAndLists) {
  EXPECT_EQ(Render("xml", Nics()),
            Declaration + "<output>\n"
                          "  <list type=\"structure\">\n"
                          "    <structure typeName=\"Nic\">\n"
                          "      <field name=\"Name\"><string>vmnic0</string></field>\n"
                          "      <field name=\"Speed\"><integer>25000</integer></field>\n"
                          "      <field name=\"Link Up\"><boolean>true</boolean></field>\n"
                          "      <field name=\"Uplinks\">\n"
                          "        <list type=\"string\">\n"
                          "          <string>vmnic0</string>\n"
                          "          <string>vmnic1</string>\n"
                          "        </list>\n"
                          "      </field>\n"
                          "      <field name=\"Driver\">\n"
                          "        <structure typeName=\"Driver\">\n"
                          "          <field name=\"Name\"><string>nfx</string></field>\n"
                          "          <field name=\"Firmware\">\n"
                          "            <structure typeName=\"Firmware\">\n"
                          "              <field name=\"Version\"><string>2.1</string></field>\n"
                          "              <field name=\"Features\">\n"
                          "                <list type=\"string\">\n"
                          "                  <string>tso</string>\n"
                          "                  <string>rss</string>\n"
                          "                </list>\n"
                          "              </field>\n"
                          "            </structure>\n"
                          "          </field>\n"
                          "        </structure>\n"
                          "      </field>\n"
                          "      <field name=\"Queues\">\n"
                          "        <list type=\"structure\">\n"
                          "          <structure typeName=\"Queue\">\n"
                          "            <field name=\"Queue ID\"><integer>0</integer></field>\n"
                          "            <field name=\"Filters\">\n"
                          "              <list type=\"structure\">\n"
                          "                <structure typeName=\"Filter\">\n"
                          "                  <field name=\"Class\"><string>mac</string></field>\n"
                          "                  <field name=\"MACs\">\n"
                          "                    <list type=\"string\">\n"
                          "                      <string>00:50:56:00:00:01</string>\n"
                          "                    </list>\n"
                          "                  </field>\n"
                          "                </structure>\n"
                          "              </list>\n"
                          "            </field>\n"
                          "          </structure>\n"
                          "        </list>\n"
                          "      </field>\n"
                          "      <field name=\"Description\">"
                          "<string>Dual port, &quot;25G&quot;</string></field>\n"
                          "    </structure>\n"
                          "    <structure typeName=\"Nic\">\n"
                          "      <field name=\"Name\"><string>vmnic1</string></field>\n"
                          "      <field name=\"Speed\"><integer>-1</integer></field>\n"
                          "      <field name=\"Link Up\"><boolean>false</boolean></field>\n"
                          "      <field name=\"Uplinks\">\n"
                          "        <list type=\"string\"/>\n"
                          "      </field>\n"
                          "      <field name=\"Driver\">\n"
                          "        <structure typeName=\"Driver\">\n"
                          "          <field name=\"Firmware\">\n"
                          "            <structure typeName=\"Firmware\">\n"
                          "              <field name=\"Features\">\n"
                          "                <list type=\"string\"/>\n"
                          "              </field>\n"
                          "            </structure>\n"
                          "          </field>\n"
                          "        </structure>\n"
                          "      </field>\n"
                          "      <field name=\"Queues\">\n"
                          "        <list type=\"structure\"/>\n"
                          "      </field>\n"
                          "    </structure>\n"
                          "  </list>\n"
                          "</output>\n");
}

TEST(XmlFormatTest, SelectsFieldsAndIgnoresDisplayParameters) {
  EXPECT_EQ(Render("xml", TwoSwitches(),
                   {{"fields", "MTU, Ports"},
                    {"fields:Port", "In Use"},
                    {"header:VirtualSwitch", "%Name%"},
                    {"units:VirtualSwitch.MTU", "bytes"},
                    {"table-columns", "Name"},
                    {"wrap-last", "true"}}),
            Declaration + "<output>\n"
                          "  <list type=\"structure\">\n"
                          "    <structure typeName=\"VirtualSwitch\">\n"
                          "      <field name=\"MTU\"><integer>1500</integer></field>\n"
                          "      <field name=\"Ports\">\n"
                          "        <list type=\"structure\">\n"
                          "          <structure typeName=\"Port\">\n"
                          "            <field name=\"In Use\"><boolean>true</boolean></field>\n"
                          "          </structure>\n"
                          "          <structure typeName=\"Port\">\n"
                          "            <field name=\"In Use\"><boolean>false</boolean></field>\n"
                          "          </structure>\n"
                          "        </list>\n"
                          "      </field>\n"
                          "    </structure>\n"
                          "    <structure typeName=\"VirtualSwitch\">\n"
                          "      <field name=\"MTU\"><integer>9000</integer></field>\n"
                          "      <field name=\"Ports\">\n"
                          "        <list type=\"structure\"/>\n"
                          "      </field>\n"
                          "    </structure>\n"
                          "  </list>\n"
                          "</output>\n");
}

TEST(XmlFormatTest, EscapesMarkupAndWhatXmlCannotHoldReversibly) {
  auto value = MetaStruct::New("A&B");
  value->SetField("Say \"<hi>\"", "Tom & Jerry's <tag> ]]>\t\r\n");
  // NUL and other control characters, U+FFFF and bytes that are not UTF-8:
  // written as backslash escapes in a string marked so, backslashes too.
  value->SetField("Raw", "a\0b\x01\x1f\x7f"
                         "c\xEF\xBF\xBF"
                         "d\xC0\xAF"
                         "e\xC3\xA9\\"s);
  value->SetField("Plain", "back\\slash");
  EXPECT_EQ(Render("xml", value),
            Declaration + "<output>\n"
                          "  <structure typeName=\"A&amp;B\">\n"
                          "    <field name=\"Say &quot;&lt;hi&gt;&quot;\"><string>Tom &amp; "
                          "Jerry's &lt;tag&gt; ]]&gt;&#9;&#13;&#10;</string></field>\n"
                          "    <field name=\"Raw\"><string escaped=\"backslash\">a\\x00"
                          "b\\x01\\x1f\x7f"
                          "c\\xef\\xbf\\xbf"
                          "d\\xc0\\xaf"
                          "e\xC3\xA9\\\\</string></field>\n"
                          "    <field name=\"Plain\"><string>back\\slash</string></field>\n"
                          "  </structure>\n"
                          "</output>\n");
}

TEST(XmlFormatTest, EveryShapeIsWellFormed) {
  if (!HaveProgram("/usr/bin/xmllint"))
    GTEST_SKIP() << "xmllint is not installed";
  auto samples = Samples();
  auto raw = MetaStruct::New("Raw");
  raw->SetField("Bytes", "\0\x01\xFF\xEF\xBF\xBE<&>\""s);
  samples.emplace_back("bytes XML cannot hold", raw);
  for (const auto& [name, root] : samples) {
    const std::string text = Render("xml", root);
    ToolResult result = RunTool("/usr/bin/xmllint --noout - 2>&1", text);
    EXPECT_EQ(result.status, 0) << name << ":\n" << text << result.output;
  }
}

TEST(XmlFormatTest, ReadsBackAsTheResult) {
  if (!HavePython())
    GTEST_SKIP() << "python3 is not installed";
  const auto samples = Samples();
  std::vector<std::string> documents;
  for (const auto& sample : samples)
    documents.push_back(Render("xml", sample.second));
  std::string message;
  std::optional<nlohmann::ordered_json> read = ReadWithPython("xml", documents, message);
  ASSERT_TRUE(read) << message;
  ASSERT_EQ(read->size(), samples.size());
  for (std::size_t i = 0; i < samples.size(); ++i)
    EXPECT_EQ((*read)[i], Expected(samples[i].second)) << samples[i].first;

  // The reader is strict: an item of the wrong type is refused.
  EXPECT_FALSE(ReadWithPython(
      "xml", {"<output><list type=\"string\"><integer>1</integer></list></output>"}, message));
}
