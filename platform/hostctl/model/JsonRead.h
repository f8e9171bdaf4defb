//===- model/JsonRead.h - Validated reading of the host description -------===//
//
// Import reads the JSON host description through JsonObject, which checks
// every value's type and range and names the offending field in its error
// ("nics[2].speed: expected an integer in [0 - 400000]").
//
//===----------------------------------------------------------------------===//
#pragma once

#include <nlohmann/json.hpp>

#include <cstdint>
#include <cstdio>
#include <functional>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace Model {

/// A host description that cannot be imported; what() names the field.
class ImportError : public std::runtime_error {
public:
  using std::runtime_error::runtime_error;
};

/// Parses the text of a host description. Throws ImportError for text that
/// is not JSON (naming the line and column) and for an object that repeats a
/// key (naming the object: "nics[0]: duplicate key \"name\"").
nlohmann::ordered_json ParseDescription(const std::string& text);

/// Called for each element of an array that is the value of a top-level key,
/// once the element is read; returns whether the element stays in the
/// document (false drops it, so that a large array never is in memory whole).
using ElementHook =
    std::function<bool(const std::string& key, std::size_t index, nlohmann::ordered_json& element)>;

/// Parses a host description from \p file as ParseDescription does, handing
/// the elements of top-level arrays to \p hook as they are read.
nlohmann::ordered_json ParseDescription(std::FILE* file, const ElementHook& hook);

/// One JSON object of the host description, with its path for messages.
class JsonObject {
public:
  /// Throws ImportError when \p value is not an object.
  JsonObject(const nlohmann::ordered_json& value, std::string path);

  const std::string& Path() const { return path_; }
  const nlohmann::ordered_json& Json() const { return *value_; }
  bool Has(const char* key) const;

  /// Required string.
  std::string String(const char* key) const;
  /// Optional string.
  std::string String(const char* key, const std::string& fallback) const;
  /// Required integer within [min, max].
  int64_t Int(const char* key, int64_t min, int64_t max) const;
  /// Optional integer within [min, max].
  int64_t Int(const char* key, int64_t min, int64_t max, int64_t fallback) const;
  /// Optional unsigned 64-bit counter.
  uint64_t Counter(const char* key, uint64_t fallback = 0) const;
  bool Bool(const char* key) const;
  bool Bool(const char* key, bool fallback) const;
  /// Optional array of strings (empty when absent).
  std::vector<std::string> Strings(const char* key) const;
  /// Optional array of integers within [min, max] (empty when absent).
  std::vector<int64_t> Ints(const char* key, int64_t min, int64_t max) const;
  /// Optional array of objects (empty when absent).
  std::vector<JsonObject> Objects(const char* key) const;
  /// Optional nested object.
  std::optional<JsonObject> Object(const char* key) const;

  /// Throws ImportError for \p key with \p problem.
  [[noreturn]] void Fail(const char* key, const std::string& problem) const;

private:
  const nlohmann::ordered_json* Find(const char* key) const;
  const nlohmann::ordered_json* value_; ///< The object.
  std::string path_;                    ///< Its path, such as "nics[2]".
};

} // namespace Model
