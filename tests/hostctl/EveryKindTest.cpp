//===- EveryKindTest.cpp - A host holding every kind of object, round trip -===//
//
// fixtures/every-kind.json holds every kind of object a host description
// knows, each with its rarer fields set. Importing it and exporting the host
// must give the description back, compared with the file itself rather than
// with another export, so that an exporter that drops a kind or a field
// fails here even when the importer drops it too. And every key the
// importer reads must appear in the file, so that a new kind cannot join the
// format without joining this host.
//
//===----------------------------------------------------------------------===//
#include "model/HostDescription.h"
#include "model/Part.h"
#include "model/Store.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

namespace {

using nlohmann::json;
using nlohmann::ordered_json;

ordered_json ReadDescription() {
  std::ifstream in(std::string(HOSTCTL_FIXTURES) + "/every-kind.json");
  std::stringstream text;
  text << in.rdbuf();
  return ordered_json::parse(text.str());
}

/// The objects of collection \p collection ("" the document, "a.b" the
/// objects of array b inside the objects of array a).
std::vector<const ordered_json*> Collection(const ordered_json& host,
                                            const std::string& collection) {
  std::vector<const ordered_json*> objects = {&host};
  std::stringstream names(collection);
  for (std::string name; std::getline(names, name, '.');) {
    std::vector<const ordered_json*> inner;
    for (const ordered_json* object : objects)
      if (auto it = object->find(name); it != object->end() && it->is_array())
        for (const ordered_json& element : *it)
          inner.push_back(&element);
    objects = std::move(inner);
  }
  return objects;
}

TEST(EveryKind, ExportGivesBackTheDescription) {
  const ordered_json original = ReadDescription();
  const std::string path = (std::filesystem::temp_directory_path() /
                            ("every-kind-" + std::to_string(::getpid()) + ".db"))
                               .string();
  std::filesystem::remove(path);
  ordered_json exported;
  {
    auto store = Model::Store::Create(path);
    Model::ImportHost(*store, original);
    exported = Model::ExportHost(*store);
  }
  std::filesystem::remove(path);
  // Object keys compare in any order (json sorts them); arrays keep theirs.
  json want = json::parse(original.dump());
  json got = json::parse(exported.dump());
  EXPECT_EQ(got, want) << "export differs from the description (a JSON patch from it):\n"
                       << json::diff(want, got).dump(1);
}

TEST(EveryKind, HoldsEveryKeyTheImporterReads) {
  const ordered_json host = ReadDescription();
  for (const Model::Part* part : Model::AllParts())
    for (const Model::PartKeys& keys : part->keys) {
      std::vector<const ordered_json*> objects = Collection(host, keys.collection);
      for (const std::string& key : keys.keys) {
        bool found = false;
        for (const ordered_json* object : objects)
          found = found || object->contains(key);
        EXPECT_TRUE(found) << "every-kind.json holds no \"" << key << "\" in "
                           << (keys.collection.empty() ? "the document" : keys.collection)
                           << " (part " << part->name << ")";
      }
    }
}

} // namespace
