//===- model/Part.h - One part of the host model ---------------------------===//
//
// The host model is split into parts, one per area (NICs, switches, IP, ...).
// A part owns some tables of the store and some keys of the JSON host
// description; it creates its tables, imports its keys and exports them.
// Parts are listed explicitly in Parts.cpp (no static registration).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "model/Store.h"

#include <nlohmann/json.hpp>

#include <functional>

#include <string>
#include <utility>
#include <vector>

namespace Model {

class JsonObject;

/// Keys a part accepts in the objects of one collection of the host
/// description. Collection "" is the top level of the document; any other
/// name is a top-level array of objects (such as "nics"), or a nested array
/// written as "parent.child" (such as "vswitches.portgroups").
struct PartKeys {
  std::string collection;        ///< Where the keys are accepted.
  std::vector<std::string> keys; ///< The keys this part reads there.
};

/// Collections that export writes element by element as it reads them,
/// instead of holding them in memory: the ones that grow to millions of rows.
/// A part puts a placeholder where such an array goes; the writer of the
/// description replaces it by the elements its rows function emits, in the
/// same read transaction.
class ExportStreams {
public:
  /// Hands one element of the array to the writer.
  using Emit = std::function<void(const nlohmann::ordered_json&)>;
  /// Emits every element of one array, in order.
  using Rows = std::function<void(Store&, const Emit&)>;

  /// Sets \p object[\p key] to the placeholder of an array that \p rows
  /// fills.
  void Put(nlohmann::ordered_json& object, const char* key, Rows rows);
  /// The rows function of a placeholder, or null when \p value is none.
  const Rows* Find(const nlohmann::ordered_json& value) const;

private:
  std::vector<Rows> rows_; ///< Indexed by the placeholder's number.
};

/// A top-level array of the host description whose elements a part imports
/// one at a time, so that a description can be read as it streams by.
struct StreamedKey {
  const char* key; ///< Top-level key of the array.
  /// Imports one element (inside the import's write transaction). Streamed
  /// arrays are imported after every part's importFn, in list order.
  void (*importElement)(const JsonObject& element, Store& store);
};

/// One part of the host model.
struct Part {
  /// Short name, such as "nic".
  const char* name;
  /// SQL that creates the part's tables.
  const char* schema;
  /// The keys the part reads from the host description.
  std::vector<PartKeys> keys;
  /// Reads the part's keys from \p host into the store (inside the import's
  /// write transaction). Parts import in list order; a part may rely on the
  /// rows of the parts before it. Throws ImportError on a bad value.
  void (*importFn)(const nlohmann::ordered_json& host, Store& store);
  /// Adds the part's keys to \p host (inside a read transaction). Parts
  /// export in list order and may add keys to objects made by earlier parts;
  /// large arrays go to \p streams.
  void (*exportFn)(nlohmann::ordered_json& host, Store& store, ExportStreams& streams);
  /// The part's arrays that are imported element by element (importFn leaves
  /// them alone).
  std::vector<StreamedKey> streamed = {};
};

/// All parts, in import order.
const std::vector<const Part*>& AllParts();

} // namespace Model
