//===- model/HostDescription.cpp - The JSON form of a whole host -----------===//
#include "model/HostDescription.h"

#include "HostCtl/Lib.h"
#include "model/JsonRead.h"
#include "model/Part.h"
#include "model/Store.h"

#include <cerrno>
#include <cstring>
#include <map>
#include <set>
#include <sys/stat.h>
#include <unistd.h>

namespace Model {

using nlohmann::ordered_json;

namespace {

/// The keys every part accepts, by collection.
std::map<std::string, std::set<std::string>> KnownKeys() {
  std::map<std::string, std::set<std::string>> known;
  for (const Part* part : AllParts())
    for (const PartKeys& keys : part->keys)
      known[keys.collection].insert(keys.keys.begin(), keys.keys.end());
  return known;
}

/// Refuses fields that no part reads, so that a typo in a host description is
/// reported instead of silently ignored.
void CheckKeys(const ordered_json& object, const std::string& collection, const std::string& path,
               const std::map<std::string, std::set<std::string>>& known) {
  if (!object.is_object())
    throw ImportError((path.empty() ? std::string("the host description") : path) +
                      ": expected an object");
  auto allowed = known.find(collection);
  for (const auto& [key, value] : object.items()) {
    std::string where = path.empty() ? key : path + "." + key;
    if (allowed == known.end() || !allowed->second.count(key))
      throw ImportError(where + ": unknown field");
    std::string child = collection.empty() ? key : collection + "." + key;
    if (!known.count(child))
      continue;
    if (!value.is_array())
      throw ImportError(where + ": expected an array of objects");
    for (std::size_t i = 0; i < value.size(); ++i)
      CheckKeys(value[i], child, where + "[" + std::to_string(i) + "]", known);
  }
}

const ordered_json* IdentityOf(const ordered_json& element) {
  if (!element.is_object())
    return nullptr;
  for (const char* key : {"name", "key"}) {
    auto it = element.find(key);
    if (it != element.end())
      return &*it;
  }
  return nullptr;
}

} // namespace

void MergeDescription(ordered_json& into, const ordered_json& fragment) {
  if (into.is_object() && fragment.is_object()) {
    for (const auto& [key, value] : fragment.items()) {
      auto it = into.find(key);
      if (it == into.end())
        into[key] = value;
      else
        MergeDescription(*it, value);
    }
    return;
  }
  if (into.is_array() && fragment.is_array()) {
    for (const ordered_json& element : fragment) {
      const ordered_json* id = IdentityOf(element);
      bool merged = false;
      if (id) {
        for (ordered_json& existing : into) {
          const ordered_json* other = IdentityOf(existing);
          if (other && *other == *id) {
            MergeDescription(existing, element);
            merged = true;
            break;
          }
        }
      }
      if (!merged)
        into.push_back(element);
    }
    return;
  }
  into = fragment;
}

namespace {

/// The part that imports the top-level array \p key element by element.
const StreamedKey* FindStreamed(const std::string& key) {
  for (const Part* part : AllParts())
    for (const StreamedKey& streamed : part->streamed)
      if (key == streamed.key)
        return &streamed;
  return nullptr;
}

std::string ElementPath(const std::string& key, std::size_t index) {
  return key + "[" + std::to_string(index) + "]";
}

/// Empties the store and runs every part's import of \p host; \p streamed
/// then imports the arrays that parts take element by element.
template <typename Streamed>
void ReplaceHost(Store& store, const ordered_json& host, Streamed&& streamed) {
  store.Write([&] {
    store.Exec("PRAGMA defer_foreign_keys=ON");
    std::vector<std::string> tables;
    {
      Statement list = store.Prepare(
          "SELECT name FROM sqlite_master WHERE type='table' AND name NOT LIKE 'sqlite_%'");
      enum { kName };
      while (list.Step())
        tables.push_back(list.Text(kName));
    }
    for (const std::string& table : tables)
      store.Exec(("DELETE FROM \"" + table + "\"").c_str());
    for (const Part* part : AllParts())
      part->importFn(host, store);
    streamed();
  });
}

} // namespace

void ImportHost(Store& store, const ordered_json& host) {
  CheckKeys(host, "", "", KnownKeys());
  ReplaceHost(store, host, [&] {
    JsonObject root(host, "");
    for (const Part* part : AllParts())
      for (const StreamedKey& streamed : part->streamed)
        for (const JsonObject& element : root.Objects(streamed.key))
          streamed.importElement(element, store);
  });
}

ordered_json ReadDescription(std::FILE* file) {
  const auto known = KnownKeys();
  ordered_json host =
      ParseDescription(file, [&](const std::string& key, std::size_t index, ordered_json& element) {
        if (!FindStreamed(key))
          return true;
        CheckKeys(element, key, ElementPath(key, index), known);
        return false;
      });
  CheckKeys(host, "", "", known);
  return host;
}

void ImportHost(Store& store, const ordered_json& host, std::FILE* file) {
  ReplaceHost(store, host, [&] {
    std::rewind(file);
    ParseDescription(file, [&](const std::string& key, std::size_t index, ordered_json& element) {
      if (const StreamedKey* streamed = FindStreamed(key))
        streamed->importElement(JsonObject(element, ElementPath(key, index)), store);
      return false;
    });
  });
}

void ExportStreams::Put(ordered_json& object, const char* key, Rows rows) {
  // A binary value never occurs in a description: it marks the placeholder,
  // its subtype the rows function.
  object[key] = ordered_json::binary({}, rows_.size());
  rows_.push_back(std::move(rows));
}

const ExportStreams::Rows* ExportStreams::Find(const ordered_json& value) const {
  if (!value.is_binary() || !value.get_binary().has_subtype() ||
      value.get_binary().subtype() >= rows_.size())
    return nullptr;
  return &rows_[value.get_binary().subtype()];
}

namespace {

/// The description with placeholders where the large arrays go (call inside
/// a read transaction).
ordered_json ExportParts(Store& store, ExportStreams& streams) {
  ordered_json host = ordered_json::object();
  for (const Part* part : AllParts())
    part->exportFn(host, store, streams);
  return host;
}

/// Writes JSON text as nlohmann's dump(2) does, replacing placeholders by
/// their elements, and hands it on in pieces.
class DescriptionWriter {
public:
  DescriptionWriter(Store& store, const ExportStreams& streams,
                    const std::function<void(std::string_view)>& write)
      : store_(store), streams_(streams), write_(write) {}

  void Value(const ordered_json& value, int indent) {
    if (const ExportStreams::Rows* rows = streams_.Find(value)) {
      bool first = true;
      (*rows)(store_, [&](const ordered_json& element) {
        out_ += first ? "[\n" : ",\n";
        first = false;
        Indent(indent + 2);
        Value(element, indent + 2);
        Flush(false);
      });
      if (first) {
        out_ += "[]";
      } else {
        out_ += '\n';
        Indent(indent);
        out_ += ']';
      }
      return;
    }
    if (value.is_object() && !value.empty()) {
      out_ += "{\n";
      bool first = true;
      for (const auto& [key, member] : value.items()) {
        if (!first)
          out_ += ",\n";
        first = false;
        Indent(indent + 2);
        out_ += ordered_json(key).dump();
        out_ += ": ";
        Value(member, indent + 2);
      }
      out_ += '\n';
      Indent(indent);
      out_ += '}';
      return;
    }
    if (value.is_array() && !value.empty()) {
      out_ += "[\n";
      bool first = true;
      for (const ordered_json& element : value) {
        if (!first)
          out_ += ",\n";
        first = false;
        Indent(indent + 2);
        Value(element, indent + 2);
      }
      out_ += '\n';
      Indent(indent);
      out_ += ']';
      return;
    }
    out_ += value.dump();
  }

  /// Hands the text on once it is large enough, or at once when \p all.
  void Flush(bool all) {
    if (out_.empty() || (!all && out_.size() < kPiece))
      return;
    write_(out_);
    out_.clear();
  }

  std::string& Text() { return out_; }

private:
  static constexpr std::size_t kPiece = 64 << 10;

  void Indent(int indent) { out_.append(static_cast<std::size_t>(indent), ' '); }

  Store& store_;
  const ExportStreams& streams_;
  const std::function<void(std::string_view)>& write_;
  std::string out_; ///< Text not handed on yet.
};

/// Replaces every placeholder in \p value by the array it stands for.
void Materialise(ordered_json& value, Store& store, const ExportStreams& streams) {
  if (const ExportStreams::Rows* rows = streams.Find(value)) {
    ordered_json array = ordered_json::array();
    (*rows)(store, [&](const ordered_json& element) { array.push_back(element); });
    value = std::move(array);
    return;
  }
  if (value.is_object() || value.is_array())
    for (ordered_json& child : value)
      Materialise(child, store, streams);
}

} // namespace

ordered_json ExportHost(Store& store) {
  return store.Read([&] {
    ExportStreams streams;
    ordered_json host = ExportParts(store, streams);
    Materialise(host, store, streams);
    return host;
  });
}

void WriteHostDescription(Store& store, const std::function<void(std::string_view)>& write) {
  store.Read([&] {
    ExportStreams streams;
    ordered_json host = ExportParts(store, streams);
    DescriptionWriter writer(store, streams, write);
    writer.Value(host, 0);
    writer.Text() += '\n';
    writer.Flush(true);
  });
}

std::vector<std::string> ProfileNames() {
  return {"demo", "empty"};
}

ordered_json Profile(const std::string& name) {
  if (name == "empty")
    return ordered_json::object();
  if (name != "demo")
    throw ImportError("unknown profile \"" + name + "\" (known: demo, empty)");
  ordered_json host = ordered_json::object();
  for (std::string_view fragment : DemoProfileFragments())
    MergeDescription(host, ordered_json::parse(fragment));
  return host;
}

void CreateDemoHost(const std::string& path) {
  std::size_t slash = path.find_last_of('/');
  if (slash != std::string::npos && slash > 0) {
    std::string dir = path.substr(0, slash);
    std::string partial;
    for (std::size_t pos = 0; pos != std::string::npos;) {
      std::size_t next = dir.find('/', pos + 1);
      partial = dir.substr(0, next);
      if (!partial.empty())
        ::mkdir(partial.c_str(), 0755);
      pos = next;
    }
  }
  // Build the host beside its final name and link it into place, so that a
  // process that starts at the same moment never sees a half-made host.
  std::string temp = path + ".new." + std::to_string(::getpid());
  try {
    std::unique_ptr<Store> store = Store::Create(temp);
    ImportHost(*store, Profile("demo"));
  } catch (const ImportError& error) {
    for (const char* suffix : {"", "-journal"})
      ::unlink((temp + suffix).c_str());
    throw HostCtl::Lib::HostCtlException(std::string("The demo host cannot be built: ") +
                                         error.what());
  } catch (...) {
    for (const char* suffix : {"", "-journal"})
      ::unlink((temp + suffix).c_str());
    throw;
  }
  if (::link(temp.c_str(), path.c_str()) != 0 && errno != EEXIST) {
    int error = errno;
    for (const char* suffix : {"", "-journal"})
      ::unlink((temp + suffix).c_str());
    throw HostCtl::Lib::HostCtlException("Cannot create the host state at " + path + ": " +
                                         std::strerror(error));
  }
  for (const char* suffix : {"", "-journal"})
    ::unlink((temp + suffix).c_str());
}

} // namespace Model
