//===- DescriptionStreamTest.cpp - Host descriptions read and written as streams ===//
//
// Export writes the large arrays element by element and import reads them
// in a second pass: the text and the host must be exactly those of the whole
// document, and every check of the whole document must still hold.
//
//===----------------------------------------------------------------------===//
#include "model/HostDescription.h"
#include "model/JsonRead.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>

namespace {

using nlohmann::ordered_json;

class DescriptionStreamTest : public ::testing::Test {
protected:
  void SetUp() override {
    char pattern[] = "/tmp/ostra-stream-XXXXXX";
    dir_ = ::mkdtemp(pattern);
  }
  void TearDown() override { std::system(("rm -rf " + dir_).c_str()); }

  std::unique_ptr<Model::Store> Generated() {
    auto store = Model::Store::Create(dir_ + "/generated.db");
    Model::HostSizes sizes;
    sizes.routes = 2000;
    sizes.portgroups = 20;
    sizes.vms = 4;
    sizes.portsPerVm = 2;
    sizes.neighbours = 700;
    sizes.hostsEntries = 500;
    Model::GenerateHost(*store, sizes);
    return store;
  }

  /// The description as WriteHostDescription writes it, and its pieces.
  static std::string Written(Model::Store& store, int* pieces = nullptr) {
    std::string text;
    int count = 0;
    Model::WriteHostDescription(store, [&](std::string_view piece) {
      text += piece;
      ++count;
    });
    if (pieces)
      *pieces = count;
    return text;
  }

  /// A file holding \p text, read from its start.
  std::FILE* File(const std::string& text) {
    std::FILE* file = std::tmpfile();
    std::fwrite(text.data(), 1, text.size(), file);
    std::rewind(file);
    return file;
  }

  /// Imports \p text into \p store as ostrahost import does; "" or the error.
  std::string Import(Model::Store& store, const std::string& text) {
    std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(File(text), std::fclose);
    try {
      ordered_json host = Model::ReadDescription(file.get());
      Model::ImportHost(store, host, file.get());
    } catch (const Model::ImportError& e) {
      return e.what();
    }
    return "";
  }

  std::string dir_;
};

// The streamed text is the whole document's dump, large arrays included, and
// it is handed on in pieces rather than at once.
TEST_F(DescriptionStreamTest, ExportWritesTheWholeDocumentsText) {
  auto store = Generated();
  int pieces = 0;
  std::string text = Written(*store, &pieces);
  ordered_json whole = Model::ExportHost(*store);
  EXPECT_EQ(text, whole.dump(2) + "\n");
  // The demo host's own and the generated ones.
  EXPECT_EQ(whole["routes"].size(), 2006u);
  EXPECT_EQ(whole["neighbors"].size(), 707u);
  EXPECT_EQ(whole["hostsEntries"].size(), 504u);
  EXPECT_GT(pieces, 3);

  auto empty = Model::Store::Create(dir_ + "/empty.db");
  Model::ImportHost(*empty, ordered_json::object());
  EXPECT_EQ(Written(*empty), Model::ExportHost(*empty).dump(2) + "\n");
}

// A streamed import gives the host the whole document gives, and its first
// pass keeps none of the large arrays' elements.
TEST_F(DescriptionStreamTest, ImportReadsTheLargeArraysAsTheyStreamBy) {
  auto source = Generated();
  std::string text = Written(*source);

  std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(File(text), std::fclose);
  ordered_json checked = Model::ReadDescription(file.get());
  EXPECT_TRUE(checked["routes"].empty());
  EXPECT_TRUE(checked["neighbors"].empty());
  EXPECT_EQ(checked["nics"].size(), Model::ExportHost(*source)["nics"].size());

  auto copy = Model::Store::Create(dir_ + "/copy.db");
  EXPECT_EQ(Import(*copy, text), "");
  EXPECT_EQ(Written(*copy), text);
}

// Every check of the whole document holds inside the streamed arrays, and a
// refused description changes nothing.
TEST_F(DescriptionStreamTest, ImportChecksStreamedElementsAndKeepsTheOldHost) {
  auto store = Model::Store::Create(dir_ + "/host.db");
  Model::ImportHost(*store, Model::Profile("demo"));
  std::string before = Written(*store);
  ordered_json demo = Model::Profile("demo");
  for (const char* key : {"routes", "neighbors", "hostsEntries"})
    demo.erase(key);
  auto with = [&](const char* key, const std::string& elements) {
    std::string text = demo.dump();
    text.pop_back();
    return text + ", \"" + key + "\": [" + elements + "]}";
  };
  const std::string good = R"({"network": "10.99.0.0/16", "gateway": "10.20.0.254"})";
  const struct {
    std::string text;
    std::string error;
  } cases[] = {
      {with("routes", good + R"(, {"network": "10.98.0.0/16", "gateway": "10.20.0.254",)"
                             R"( "gateway": "10.20.0.253"})"),
       "routes[1]: duplicate key \"gateway\""},
      {with("routes", good + R"(, {"network": "10.98.0.0/16", "colour": "red"})"),
       "routes[1].colour: unknown field"},
      {with("neighbors", "7"), "neighbors[0]: expected an object"},
      {with("hostsEntries", R"({"address": "10.1.1.1", "hostname": "a"}, )"
                            R"({"address": "no address", "hostname": "b"})"),
       "hostsEntries[1].address:"},
      {with("routes", good + ", " + good), "routes[1].network: A route to 10.99.0.0/16 already"},
      {"{\"routes\": [" + good + "], \"nics\": [{\"name\": 1}]}",
       "nics[0].name: expected a string"},
      {"{\"routes\": [" + good + "", "not JSON:"},
  };
  for (const auto& c : cases) {
    std::string error = Import(*store, c.text);
    EXPECT_EQ(error.compare(0, c.error.size(), c.error), 0) << error << "; expected " << c.error;
    EXPECT_EQ(Written(*store), before) << c.error;
  }
}

} // namespace
