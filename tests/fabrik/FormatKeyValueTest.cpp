//===- FormatKeyValueTest.cpp - The "keyvalue" formatter --------------------===//
#include "FormatTestSupport.h"

#include <variant>

using namespace FormatTest;
using nlohmann::ordered_json;

namespace {

/// A keyvalue output read back.
struct KeyValues {
  std::string root;   ///< The name every path starts with ("" when none).
  ordered_json value; ///< The values, rebuilt from the paths.
};

/// One step of a path: a field (or root) name, or a list index.
using Step = std::variant<std::string, std::size_t>;

/// Reads the "path.type=value" lines of \p text back into values; adds a
/// test failure and returns null at the first line that does not parse.
std::optional<KeyValues> ReadKeyValues(const std::string& text) {
  KeyValues result;
  std::optional<std::string> rootName;
  std::istringstream lines(text);
  std::string line;
  while (std::getline(lines, line)) {
    std::vector<Step> path;
    std::optional<std::string> name = std::string(); // The name being read.
    std::size_t pos = 0;
    for (; pos < line.size() && line[pos] != '='; ++pos) {
      const char c = line[pos];
      if (c == '\\' && pos + 1 < line.size()) {
        const char next = line[++pos];
        if (!name)
          name = std::string();
        *name += next == 'n' ? '\n' : next == 'r' ? '\r' : next;
      } else if (c == '.' || c == '[') {
        if (name && !(c == '[' && name->empty() && path.empty()))
          path.emplace_back(*name);
        name = c == '.' ? std::optional<std::string>("") : std::nullopt;
        if (c == '[') {
          const std::size_t close = line.find(']', pos);
          if (close == std::string::npos)
            break;
          path.emplace_back(std::stoul(line.substr(pos + 1, close - pos - 1)));
          pos = close;
        }
      } else if (name) {
        *name += c;
      } else {
        break;
      }
    }
    if (pos >= line.size() || !name) {
      ADD_FAILURE() << "malformed line: " << line;
      return std::nullopt;
    }
    const std::string type = *name;
    std::string value;
    for (std::size_t i = pos + 1; i < line.size(); ++i) {
      if (line[i] == '\\' && i + 1 < line.size()) {
        const char next = line[++i];
        if (next == 'x' || next == 'u') { // \xHH, \uHHHH: one code point.
          const std::size_t digits = next == 'x' ? 2 : 4;
          const unsigned long code = std::stoul(line.substr(i + 1, digits), nullptr, 16);
          i += digits;
          if (code < 0x80)
            value += static_cast<char>(code);
          else if (code < 0x800)
            value +=
                {static_cast<char>(0xC0 | (code >> 6)), static_cast<char>(0x80 | (code & 0x3F))};
          else
            value += {static_cast<char>(0xE0 | (code >> 12)),
                      static_cast<char>(0x80 | ((code >> 6) & 0x3F)),
                      static_cast<char>(0x80 | (code & 0x3F))};
          continue;
        }
        value += next == 'n'   ? '\n'
                 : next == 'r' ? '\r'
                 : next == 'v' ? '\v'
                 : next == 'f' ? '\f'
                               : next;
      } else {
        value += line[i];
      }
    }

    std::string root;
    if (!path.empty() && std::holds_alternative<std::string>(path.front())) {
      root = std::get<std::string>(path.front());
      path.erase(path.begin());
    }
    if (rootName && *rootName != root) {
      ADD_FAILURE() << "root name changes at: " << line;
      return std::nullopt;
    }
    rootName = root;

    ordered_json* node = &result.value;
    for (const Step& step : path) {
      if (const auto* field = std::get_if<std::string>(&step))
        node = &(*node)[*field];
      else
        node = &(*node)[std::get<std::size_t>(step)];
    }
    if (type == "boolean" && (value == "true" || value == "false")) {
      *node = value == "true";
    } else if (type == "integer") {
      std::size_t used = 0;
      *node = std::stol(value, &used);
      if (used != value.size())
        ADD_FAILURE() << "bad integer: " << line;
    } else if (type == "string") {
      *node = value;
    } else if (type == "list" && value.empty()) {
      *node = ordered_json::array();
    } else if (type == "structure" && value.empty()) {
      *node = ordered_json::object();
    } else {
      ADD_FAILURE() << "bad type or value: " << line;
      return std::nullopt;
    }
  }
  result.root = rootName.value_or("");
  return result;
}

} // namespace

TEST(KeyValueFormatTest, ScalarsAndEmptyValues) {
  EXPECT_EQ(Render("keyvalue", MetaBool::New(true)), "boolean=true\n");
  EXPECT_EQ(Render("keyvalue", MetaInt::New(-7)), "integer=-7\n");
  EXPECT_EQ(Render("keyvalue", MetaString::New("")), "string=\n");
  EXPECT_EQ(Render("keyvalue", MetaString::New()), "");
  EXPECT_EQ(Render("keyvalue", nullptr), "");
  auto strings = MetaList::New(String);
  EXPECT_EQ(Render("keyvalue", strings), "list=\n");
  strings->AddAll(std::vector<std::string>{"a", "b c"});
  EXPECT_EQ(Render("keyvalue", strings), "[0].string=a\n[1].string=b c\n");
  EXPECT_EQ(Render("keyvalue", MetaList::New(Struct, SwitchTemplate())), "VirtualSwitch.list=\n");
  EXPECT_EQ(Render("keyvalue", MetaStruct::New("Empty")), "Empty.structure=\n");
}

TEST(KeyValueFormatTest, NestedStructuresAndLists) {
  EXPECT_EQ(Render("keyvalue", Nics()),
            "Nic[0].Name.string=vmnic0\n"
            "Nic[0].Speed.integer=25000\n"
            "Nic[0].Link Up.boolean=true\n"
            "Nic[0].Uplinks[0].string=vmnic0\n"
            "Nic[0].Uplinks[1].string=vmnic1\n"
            "Nic[0].Driver.Name.string=nfx\n"
            "Nic[0].Driver.Firmware.Version.string=2.1\n"
            "Nic[0].Driver.Firmware.Features[0].string=tso\n"
            "Nic[0].Driver.Firmware.Features[1].string=rss\n"
            "Nic[0].Queues[0].Queue ID.integer=0\n"
            "Nic[0].Queues[0].Filters[0].Class.string=mac\n"
            "Nic[0].Queues[0].Filters[0].MACs[0].string=00:50:56:00:00:01\n"
            "Nic[0].Description.string=Dual port, \"25G\"\n"
            "Nic[1].Name.string=vmnic1\n"
            "Nic[1].Speed.integer=-1\n"
            "Nic[1].Link Up.boolean=false\n"
            "Nic[1].Uplinks.list=\n"
            "Nic[1].Driver.Firmware.Features.list=\n"
            "Nic[1].Queues.list=\n");
  EXPECT_EQ(Render("keyvalue", Switch("vSwitch0", 1500, {}, {})),
            "VirtualSwitch.Name.string=vSwitch0\n"
            "VirtualSwitch.MTU.integer=1500\n"
            "VirtualSwitch.Uplinks.list=\n"
            "VirtualSwitch.Policy.Enabled.boolean=true\n"
            "VirtualSwitch.Policy.Peak.integer=100\n"
            "VirtualSwitch.Ports.list=\n");
}

TEST(KeyValueFormatTest, SelectsFieldsAndIgnoresDisplayParameters) {
  EXPECT_EQ(Render("keyvalue", TwoSwitches(),
                   {{"fields", "Ports,MTU"},
                    {"fields:Port", "In Use"},
                    {"header:VirtualSwitch", "%Name%"},
                    {"units:VirtualSwitch.MTU", "bytes"}}),
            "VirtualSwitch[0].Ports[0].In Use.boolean=true\n"
            "VirtualSwitch[0].Ports[1].In Use.boolean=false\n"
            "VirtualSwitch[0].MTU.integer=1500\n"
            "VirtualSwitch[1].Ports.list=\n"
            "VirtualSwitch[1].MTU.integer=9000\n");
  // A structure left with no field to show still says it is there.
  EXPECT_EQ(Render("keyvalue", Switch("vSwitch0", 1500, {}, {}), {{"fields", "Notes"}}),
            "VirtualSwitch.structure=\n");
}

TEST(KeyValueFormatTest, EscapesPathCharactersAndLineBreaks) {
  auto value = MetaStruct::New("Odd.Name");
  value->SetField("a.b[1]=c\\", "x=y\\z\r\nw\xC0");
  EXPECT_EQ(Render("keyvalue", value),
            "Odd\\.Name.a\\.b\\[1\\]\\=c\\\\.string=x=y\\\\z\\r\\nw\xEF\xBF\xBD\n");
}

TEST(KeyValueFormatTest, ReadsBackAsTheResult) {
  for (const auto& [name, root] : Samples()) {
    std::optional<KeyValues> read = ReadKeyValues(Render("keyvalue", root));
    ASSERT_TRUE(read) << name;
    std::string rootName;
    if (root->GetType() == Struct)
      rootName = static_cast<const MetaStruct&>(*root).GetName();
    else if (const auto* list = dynamic_cast<const MetaList*>(root.get());
             list && list->GetElementTemplate())
      rootName = static_cast<const MetaStruct&>(*list->GetElementTemplate()).GetName();
    EXPECT_EQ(read->root, rootName) << name;
    EXPECT_EQ(read->value, Expected(root)) << name;
  }

  // Every character that some line-splitting reader takes as a line end.
  auto odd = MetaStruct::New("Odd.Name");
  odd->SetField("a.b[1]=c\\", "x=y\\z\r\nw\v\f\x1c\x1d\x1e|\xC2\x85|\xE2\x80\xA8|\xE2\x80\xA9|\t");
  const std::string text = Render("keyvalue", odd);
  for (const char* end :
       {"\r", "\v", "\f", "\x1c", "\x1d", "\x1e", "\xC2\x85", "\xE2\x80\xA8", "\xE2\x80\xA9"})
    EXPECT_EQ(text.find(end), std::string::npos) << text;
  EXPECT_EQ(text.find('\n'), text.size() - 1);
  std::optional<KeyValues> read = ReadKeyValues(text);
  ASSERT_TRUE(read);
  EXPECT_EQ(read->root, "Odd.Name");
  EXPECT_EQ(read->value, Expected(odd));
}
