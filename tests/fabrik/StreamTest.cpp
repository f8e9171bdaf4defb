//===- StreamTest.cpp - Values held in place and listings that stream -----===//
#include "FormatTestSupport.h"

#include <cstdlib>
#include <dirent.h>
#include <filesystem>

using namespace FormatTest;
using Fabrik::MetaObj::MetaValue;

namespace {

/// Formats \p list's rows through a streamed list made from its element
/// template, as the command host does during a command.
std::string RenderStreamed(const std::string& formatter, const MetaList& list,
                           std::initializer_list<std::pair<std::string, std::string>> params = {}) {
  Parameters parameters;
  for (const auto& [key, value] : params)
    parameters.Set(key, value);
  const auto& element = static_cast<const MetaStruct&>(*list.GetElementTemplate());
  auto writer = Fabrik::Format::MakeFormatter(formatter)->StreamList(element, parameters);
  Fabrik::MetaObj::StreamRows(&element, writer.get());
  auto streamed = MetaList::New(Struct, element.Clone());
  Fabrik::MetaObj::StreamRows(nullptr, nullptr);
  EXPECT_TRUE(streamed->IsStreamed());
  for (const MetaValue& item : list.GetItems())
    streamed->Add(item.GetObject());
  streamed->Flush();
  EXPECT_EQ(streamed->GetCount(), list.GetItems().size());
  EXPECT_TRUE(streamed->GetItems().empty());
  std::ostringstream out;
  writer->Finish(out);
  return out.str();
}

/// \p count switches whose names are \p nameLength characters long.
std::shared_ptr<MetaList> ManySwitches(std::size_t count, std::size_t nameLength) {
  auto list = MetaList::New(Struct, SwitchTemplate());
  for (std::size_t i = 0; i < count; ++i) {
    std::string name = "vSwitch" + std::to_string(i);
    name.resize(std::max(name.size(), nameLength), 'x');
    list->Add(
        Switch(name, static_cast<long>(1500 + i % 7000), {"vmnic" + std::to_string(i % 4)}, {}));
  }
  return list;
}

std::size_t FilesIn(const std::string& directory) {
  std::size_t count = 0;
  for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator(directory))
    ++count;
  return count;
}

} // namespace

TEST(MetaValueTest, ScalarsInPlaceAndSharedLayouts) {
  auto a = MetaStruct::New("Row");
  a->SetField("Name", MetaString::New());
  a->SetField("MTU", MetaInt::New());
  a->SetField("Up", true);
  auto b = MetaStruct::New("Row");
  b->SetField("Name", "vmnic1");
  b->SetField("MTU", 9000L);
  b->SetField("Up", false);
  // Structures of one kind share their layout; another order is another kind.
  EXPECT_EQ(&a->GetLayout(), &b->GetLayout());
  auto c = MetaStruct::New("Row");
  c->SetField("MTU", 1L);
  c->SetField("Name", "x");
  EXPECT_NE(&c->GetLayout(), &a->GetLayout());
  EXPECT_EQ(c->GetLayout().GetFieldNames(), (std::vector<std::string>{"MTU", "Name"}));

  // A template field is unset until given a value; the value replaces it in place.
  EXPECT_FALSE(a->GetField("Name")->IsShown());
  a->SetField("Name", std::string(100, 'n'));
  EXPECT_EQ(a->GetFieldCount(), 3u);
  EXPECT_EQ(a->GetField("Name")->GetString(), std::string(100, 'n'));
  EXPECT_EQ(b->GetField("MTU")->GetInt(), 9000);
  EXPECT_FALSE(b->GetField("Up")->GetBool());
  EXPECT_EQ(b->GetField("Up")->GetType(), Boolean);

  // A null field is kept but never shown; an object field round-trips.
  b->SetField("Extra", MetaObjectPtr());
  EXPECT_TRUE(b->GetField("Extra")->IsNull());
  EXPECT_FALSE(b->GetField("Extra")->IsShown());
  auto nested = MetaStruct::New("Inner");
  b->SetField("Inner", nested);
  EXPECT_EQ(b->GetField("Inner")->GetObject(), nested);
  EXPECT_EQ(b->GetField("MTU")->ToObject()->GetType(), Integer);

  // Unset templates are one shared value each.
  EXPECT_EQ(MetaString::New(), MetaString::New());
  EXPECT_NE(MetaString::New("a"), MetaString::New("a"));
}

TEST(StreamTest, EveryFormatterStreamsTheSameTextAsItWrites) {
  const std::vector<std::pair<std::string, std::shared_ptr<MetaList>>> lists = {
      {"two switches", TwoSwitches()},
      {"no switch", MetaList::New(Struct, SwitchTemplate())},
      {"nested structures", std::static_pointer_cast<MetaList>(Nics())},
  };
  for (const std::string& formatter : Fabrik::Format::FormatterNames()) {
    for (const auto& [name, list] : lists) {
      const std::string what = formatter + ", " + name;
      EXPECT_EQ(RenderStreamed(formatter, *list), Render(formatter, list)) << what;
      EXPECT_EQ(RenderStreamed(formatter, *list, {{"fields", "MTU, Name"}}),
                Render(formatter, list, {{"fields", "MTU, Name"}}))
          << what;
      const std::initializer_list<std::pair<std::string, std::string>> display = {
          {"show-header", "false"},
          {"wrap-last", "true"},
          {"units:VirtualSwitch.MTU", "bytes"},
          {"header:VirtualSwitch", "Switch %Name%"}};
      EXPECT_EQ(RenderStreamed(formatter, *list, display), Render(formatter, list, display))
          << what;
    }
  }
}

TEST(StreamTest, LongListingsSpillToAnUnlinkedFile) {
  // Over 4 MiB of text in every format: the spool moves to a file, which is
  // read back whole and leaves nothing behind.
  const std::string directory =
      (std::filesystem::temp_directory_path() / ("fabrik-spool-" + std::to_string(::getpid())))
          .string();
  std::filesystem::create_directories(directory);
  const char* before = std::getenv("TMPDIR");
  const std::string saved = before ? before : "";
  ::setenv("TMPDIR", directory.c_str(), 1);
  auto list = ManySwitches(40000, 90);
  for (const char* formatter : {"json", "table", "csv"}) {
    const std::string streamed = RenderStreamed(formatter, *list);
    EXPECT_GT(streamed.size(), 4u << 20) << formatter;
    EXPECT_EQ(streamed, Render(formatter, list)) << formatter;
  }
  EXPECT_EQ(FilesIn(directory), 0u);
  // Where no file can be made, the listing fails as a whole.
  ::setenv("TMPDIR", (directory + "/missing").c_str(), 1);
  EXPECT_THROW(RenderStreamed("json", *list), std::runtime_error);
  if (before)
    ::setenv("TMPDIR", saved.c_str(), 1);
  else
    ::unsetenv("TMPDIR");
  std::filesystem::remove_all(directory);
}

TEST(StreamTest, OnlyTheFirstListOfTheResultKindStreams) {
  auto element = SwitchTemplate();
  auto writer = Fabrik::Format::MakeFormatter("json")->StreamList(*element, Parameters());
  Fabrik::MetaObj::StreamRows(element.get(), writer.get());
  auto other = MetaList::New(Struct, MetaStruct::New("Port"));
  auto strings = MetaList::New(String);
  auto first = MetaList::New(Struct, SwitchTemplate());
  auto second = MetaList::New(Struct, SwitchTemplate());
  Fabrik::MetaObj::StreamRows(nullptr, nullptr);
  EXPECT_FALSE(other->IsStreamed());
  EXPECT_FALSE(strings->IsStreamed());
  EXPECT_TRUE(first->IsStreamed());
  EXPECT_FALSE(second->IsStreamed());

  // A row may still change until the next one is added.
  auto row = Switch("vSwitch0", 1500, {}, {});
  first->Add(row);
  row->SetField("MTU", 9000L);
  first->Add(Switch("vSwitch1", 1500, {}, {}));
  first->Flush();
  EXPECT_EQ(first->GetCount(), 2u);
  // Anything but a structure has no place in a streamed list.
  EXPECT_THROW(first->Add("text"), std::logic_error);
  EXPECT_THROW(first->Add(MetaObjectPtr()), std::logic_error);
  std::ostringstream out;
  writer->Finish(out);
  const auto parsed = nlohmann::json::parse(out.str());
  ASSERT_EQ(parsed.size(), 2u);
  EXPECT_EQ(parsed[0]["MTU"], 9000);
  EXPECT_EQ(parsed[1]["Name"], "vSwitch1");
}
