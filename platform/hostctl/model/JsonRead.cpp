//===- model/JsonRead.cpp - Validated reading of the host description -----===//
#include "model/JsonRead.h"

#include <set>

namespace Model {

using nlohmann::ordered_json;

namespace {

/// Parses \p input (a text or a file) with the checks of ParseDescription.
template <typename Input> ordered_json Parse(Input&& input, const ElementHook* hook) {
  // The parser keeps the last of repeated keys without a word; a description
  // that says two things about one field is refused instead.
  struct Frame {
    bool object;                ///< An object, else an array.
    std::set<std::string> keys; ///< Keys seen so far (objects).
    std::string key;            ///< The latest key (objects).
    std::size_t count = 0;      ///< Elements begun so far (arrays).
  };
  std::vector<Frame> frames;
  auto path = [&frames] {
    std::string where;
    for (const Frame& frame : frames) {
      if (frame.object && !frame.key.empty())
        where += (where.empty() ? "" : ".") + frame.key;
      else if (!frame.object && frame.count > 0)
        where += "[" + std::to_string(frame.count - 1) + "]";
    }
    return where;
  };
  // An element of a top-level array is complete: the hook decides whether it
  // stays. \p depth is the number of frames open around the element.
  auto element = [&](std::size_t depth, ordered_json& value) {
    if (!hook || frames.size() != depth || depth < 2 || !frames[0].object || frames[1].object)
      return true;
    return (*hook)(frames[0].key, frames[1].count - 1, value);
  };
  using Event = nlohmann::ordered_json::parse_event_t;
  auto callback = [&](int, Event event, ordered_json& parsed) {
    switch (event) {
    case Event::object_start:
    case Event::array_start:
      if (!frames.empty() && !frames.back().object)
        ++frames.back().count;
      frames.push_back({event == Event::object_start, {}, {}, 0});
      break;
    case Event::object_end:
    case Event::array_end: {
      bool keep = element(3, parsed);
      if (!frames.empty())
        frames.pop_back();
      return keep;
    }
    case Event::key: {
      Frame& frame = frames.back();
      std::string key = parsed.get<std::string>();
      frame.key.clear();
      if (!frame.keys.insert(key).second) {
        std::string where = path();
        throw ImportError((where.empty() ? "" : where + ": ") + "duplicate key \"" + key + "\"");
      }
      frame.key = std::move(key);
      break;
    }
    case Event::value:
      if (!frames.empty() && !frames.back().object)
        ++frames.back().count;
      return element(2, parsed);
    }
    return true;
  };
  try {
    return ordered_json::parse(std::forward<Input>(input), callback);
  } catch (const nlohmann::json::parse_error& e) {
    // "[json.exception.parse_error.101] parse error at line 1, ...": the
    // reader wants the part after the library's own tag.
    std::string message = e.what();
    if (std::size_t tag = message.find("] "); tag != std::string::npos)
      message.erase(0, tag + 2);
    throw ImportError("not JSON: " + message);
  }
}

} // namespace

ordered_json ParseDescription(const std::string& text) {
  return Parse(text, nullptr);
}

ordered_json ParseDescription(std::FILE* file, const ElementHook& hook) {
  return Parse(file, &hook);
}

JsonObject::JsonObject(const ordered_json& value, std::string path)
    : value_(&value), path_(std::move(path)) {
  if (!value.is_object())
    throw ImportError(path_ + ": expected an object");
}

const ordered_json* JsonObject::Find(const char* key) const {
  auto it = value_->find(key);
  return it == value_->end() ? nullptr : &*it;
}

bool JsonObject::Has(const char* key) const {
  return Find(key) != nullptr;
}

void JsonObject::Fail(const char* key, const std::string& problem) const {
  throw ImportError((path_.empty() ? std::string(key) : path_ + "." + key) + ": " + problem);
}

std::string JsonObject::String(const char* key) const {
  const ordered_json* v = Find(key);
  if (!v)
    Fail(key, "missing");
  if (!v->is_string())
    Fail(key, "expected a string");
  return v->get<std::string>();
}

std::string JsonObject::String(const char* key, const std::string& fallback) const {
  return Has(key) ? String(key) : fallback;
}

int64_t JsonObject::Int(const char* key, int64_t min, int64_t max) const {
  const ordered_json* v = Find(key);
  if (!v)
    Fail(key, "missing");
  bool ok = v->is_number_integer();
  int64_t n = 0;
  if (ok && v->is_number_unsigned()) {
    uint64_t u = v->get<uint64_t>();
    ok = u <= static_cast<uint64_t>(INT64_MAX);
    n = static_cast<int64_t>(u);
  } else if (ok) {
    n = v->get<int64_t>();
  }
  if (!ok || n < min || n > max)
    Fail(key, "expected an integer in [" + std::to_string(min) + " - " + std::to_string(max) + "]");
  return n;
}

int64_t JsonObject::Int(const char* key, int64_t min, int64_t max, int64_t fallback) const {
  return Has(key) ? Int(key, min, max) : fallback;
}

uint64_t JsonObject::Counter(const char* key, uint64_t fallback) const {
  const ordered_json* v = Find(key);
  if (!v)
    return fallback;
  if (!v->is_number_unsigned() && !(v->is_number_integer() && v->get<int64_t>() >= 0))
    Fail(key, "expected an unsigned integer");
  return v->get<uint64_t>();
}

bool JsonObject::Bool(const char* key) const {
  const ordered_json* v = Find(key);
  if (!v)
    Fail(key, "missing");
  if (!v->is_boolean())
    Fail(key, "expected true or false");
  return v->get<bool>();
}

bool JsonObject::Bool(const char* key, bool fallback) const {
  return Has(key) ? Bool(key) : fallback;
}

std::vector<std::string> JsonObject::Strings(const char* key) const {
  std::vector<std::string> out;
  const ordered_json* v = Find(key);
  if (!v)
    return out;
  if (!v->is_array())
    Fail(key, "expected an array of strings");
  for (const auto& item : *v) {
    if (!item.is_string())
      Fail(key, "expected an array of strings");
    out.push_back(item.get<std::string>());
  }
  return out;
}

std::vector<int64_t> JsonObject::Ints(const char* key, int64_t min, int64_t max) const {
  std::vector<int64_t> out;
  const ordered_json* v = Find(key);
  if (!v)
    return out;
  if (!v->is_array())
    Fail(key, "expected an array of integers");
  for (std::size_t i = 0; i < v->size(); ++i) {
    const ordered_json& item = (*v)[i];
    if (!item.is_number_integer() ||
        (item.is_number_unsigned() && item.get<uint64_t>() > INT64_MAX))
      Fail(key, "expected an array of integers");
    int64_t n = item.get<int64_t>();
    if (n < min || n > max)
      Fail(key, "[" + std::to_string(i) + "] expected an integer in [" + std::to_string(min) +
                    " - " + std::to_string(max) + "]");
    out.push_back(n);
  }
  return out;
}

std::vector<JsonObject> JsonObject::Objects(const char* key) const {
  std::vector<JsonObject> out;
  const ordered_json* v = Find(key);
  if (!v)
    return out;
  if (!v->is_array())
    Fail(key, "expected an array of objects");
  std::string base = path_.empty() ? std::string(key) : path_ + "." + key;
  for (std::size_t i = 0; i < v->size(); ++i)
    out.emplace_back((*v)[i], base + "[" + std::to_string(i) + "]");
  return out;
}

std::optional<JsonObject> JsonObject::Object(const char* key) const {
  const ordered_json* v = Find(key);
  if (!v)
    return std::nullopt;
  return JsonObject(*v, path_.empty() ? std::string(key) : path_ + "." + key);
}

} // namespace Model
