//===- Format.cpp - Formatter table and shared formatting rules ------------===//
//
// The table of formatter names, the parameter container, and the rules that
// several formatters share: which fields are shown, how a value reads as one
// line of text, header lines and units.
//
//===----------------------------------------------------------------------===//
#include "FormatInternal.h"

#include <algorithm>
#include <cctype>

namespace Fabrik::Format {

using MetaObj::MetaBool;
using MetaObj::MetaInt;
using MetaObj::MetaList;
using MetaObj::MetaObject;
using MetaObj::MetaObjectPtr;
using MetaObj::MetaString;
using MetaObj::MetaStruct;

namespace {

/// One formatter: the name users give and the function that makes it.
struct FormatterEntry {
  const char* name;                     ///< Name as given to --formatter.
  std::unique_ptr<Formatter> (*make)(); ///< Factory.
};

/// Every formatter, in the order FormatterNames lists them.
constexpr FormatterEntry Formatters[] = {
    {"simple", Detail::MakeSimpleFormatter},
    {"table", Detail::MakeTableFormatter},
    {"json", Detail::MakeJsonFormatter},
};

std::string Trim(const std::string& text) {
  std::size_t begin = text.find_first_not_of(" \t");
  if (begin == std::string::npos)
    return "";
  std::size_t end = text.find_last_not_of(" \t");
  return text.substr(begin, end - begin + 1);
}

std::string Lower(std::string text) {
  for (char& c : text)
    c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return text;
}

/// The value of the first key of \p keys that is set, or null.
const std::string* FindFirst(const Parameters& params, std::initializer_list<std::string> keys) {
  for (const std::string& key : keys) {
    if (const std::string* value = params.Find(key))
      return value;
  }
  return nullptr;
}

} // namespace

void Parameters::Set(const std::string& key, const std::string& value) {
  for (auto& pair : pairs_) {
    if (pair.first == key) {
      pair.second = value;
      return;
    }
  }
  pairs_.emplace_back(key, value);
}

const std::string* Parameters::Find(const std::string& key) const {
  for (const auto& pair : pairs_) {
    if (pair.first == key)
      return &pair.second;
  }
  return nullptr;
}

Formatter::~Formatter() = default;

std::unique_ptr<Formatter> MakeFormatter(const std::string& name) {
  for (const FormatterEntry& entry : Formatters) {
    if (name == entry.name)
      return entry.make();
  }
  return nullptr;
}

std::vector<std::string> FormatterNames() {
  std::vector<std::string> names;
  for (const FormatterEntry& entry : Formatters)
    names.emplace_back(entry.name);
  return names;
}

namespace Detail {

std::vector<std::string> SplitNames(const std::string& value) {
  std::vector<std::string> names;
  std::size_t begin = 0;
  while (begin <= value.size()) {
    std::size_t end = value.find(',', begin);
    if (end == std::string::npos)
      end = value.size();
    std::string name = Trim(value.substr(begin, end - begin));
    if (!name.empty())
      names.push_back(std::move(name));
    begin = end + 1;
  }
  return names;
}

std::vector<const MetaStruct::Field*>
SelectFields(const MetaStruct& value, const Parameters& params, bool atRoot, Style style) {
  const std::string& name = value.GetName();
  const std::string fieldsKey = "fields:" + name;
  const std::string columnsKey = "table-columns:" + name;
  const std::string* list = atRoot ? params.Find("fields") : nullptr;
  if (!list) {
    switch (style) {
    case Style::Simple:
      list = FindFirst(params, {fieldsKey, columnsKey});
      if (!list && atRoot)
        list = params.Find("table-columns");
      break;
    case Style::Table:
      list = params.Find(columnsKey);
      if (!list && atRoot)
        list = params.Find("table-columns");
      if (!list)
        list = params.Find(fieldsKey);
      break;
    case Style::Json:
      list = params.Find(fieldsKey);
      break;
    }
  }

  std::vector<const MetaStruct::Field*> fields;
  if (!list) {
    for (const MetaStruct::Field& field : value.GetFields())
      fields.push_back(&field);
    return fields;
  }
  for (const std::string& wanted : SplitNames(*list)) {
    for (const MetaStruct::Field& field : value.GetFields()) {
      if (field.name == wanted) {
        if (std::find(fields.begin(), fields.end(), &field) == fields.end())
          fields.push_back(&field);
        break;
      }
    }
  }
  return fields;
}

bool IsShown(const MetaObjectPtr& value) {
  return value && value->IsSet();
}

bool IsPlainList(const MetaList& list) {
  if (list.GetElementType() == MetaObj::Struct)
    return false;
  return std::all_of(list.GetItems().begin(), list.GetItems().end(), [](const MetaObjectPtr& item) {
    return !item || (item->GetType() != MetaObj::Struct && item->GetType() != MetaObj::List);
  });
}

std::string ScalarText(const MetaObject& value) {
  switch (value.GetType()) {
  case MetaObj::Boolean:
    return static_cast<const MetaBool&>(value).GetValue() ? "true" : "false";
  case MetaObj::Integer:
    return std::to_string(static_cast<const MetaInt&>(value).GetValue());
  case MetaObj::String:
    return static_cast<const MetaString&>(value).GetValue();
  case MetaObj::Struct:
  case MetaObj::List:
    break;
  }
  return "";
}

namespace {

std::string CompactTextAt(const MetaObjectPtr& value, const Parameters& params, bool nested) {
  if (!IsShown(value))
    return "";
  switch (value->GetType()) {
  case MetaObj::Struct: {
    const auto& structure = static_cast<const MetaStruct&>(*value);
    std::string text = "{";
    bool first = true;
    for (const MetaStruct::Field* field :
         SelectFields(structure, params, /*atRoot=*/false, Style::Table)) {
      if (!IsShown(field->value))
        continue;
      if (!first)
        text += ", ";
      first = false;
      text += field->name + ": " + CompactTextAt(field->value, params, true);
    }
    return text + "}";
  }
  case MetaObj::List: {
    const auto& list = static_cast<const MetaList&>(*value);
    std::string text;
    bool first = true;
    for (const MetaObjectPtr& item : list.GetItems()) {
      if (!IsShown(item))
        continue;
      if (!first)
        text += ", ";
      first = false;
      text += CompactTextAt(item, params, true);
    }
    // A list of strings reads "a, b" in a cell of its own; anywhere else the
    // brackets keep its items apart from the neighbouring fields.
    if (nested || !IsPlainList(list))
      return "[" + text + "]";
    return text;
  }
  case MetaObj::Boolean:
  case MetaObj::Integer:
  case MetaObj::String:
    break;
  }
  return ScalarText(*value);
}

} // namespace

std::string CompactText(const MetaObjectPtr& value, const Parameters& params) {
  return CompactTextAt(value, params, false);
}

std::optional<std::string> HeaderLine(const MetaStruct& value, const Parameters& params) {
  const std::string* header = params.Find("header:" + value.GetName());
  if (!header || header->empty() || *header == "<NONE>")
    return std::nullopt;
  std::string line;
  std::size_t pos = 0;
  while (pos < header->size()) {
    std::size_t open = header->find('%', pos);
    if (open == std::string::npos)
      break;
    std::size_t close = header->find('%', open + 1);
    if (close == std::string::npos)
      break;
    line.append(*header, pos, open - pos);
    const MetaObjectPtr* field = value.GetField(header->substr(open + 1, close - open - 1));
    if (field) {
      line += CompactText(*field, params);
      pos = close + 1;
    } else {
      // Not a field name: keep the "%" and look for a reference after it.
      line += '%';
      pos = open + 1;
    }
  }
  line.append(*header, pos, std::string::npos);
  return line;
}

std::string WithUnit(std::string text, const MetaStruct& value, const std::string& field,
                     const Parameters& params) {
  if (text.empty())
    return text;
  const std::string* unit = params.Find("units:" + value.GetName() + "." + field);
  if (unit && !unit->empty())
    text += " " + *unit;
  return text;
}

bool BoolParameter(const Parameters& params, const std::string& key, bool fallback) {
  const std::string* value = params.Find(key);
  if (!value)
    return fallback;
  const std::string text = Lower(Trim(*value));
  if (text == "true" || text == "1" || text == "yes" || text == "on")
    return true;
  if (text == "false" || text == "0" || text == "no" || text == "off")
    return false;
  return fallback;
}

std::size_t DisplayWidth(const std::string& text) {
  return static_cast<std::size_t>(std::count_if(text.begin(), text.end(), [](char c) {
    return (static_cast<unsigned char>(c) & 0xC0) != 0x80;
  }));
}

} // namespace Detail

} // namespace Fabrik::Format
