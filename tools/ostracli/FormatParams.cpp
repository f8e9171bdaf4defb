//===- FormatParams.cpp - The user's formatter parameters, checked ---------===//
//
// A formatter ignores what it does not know, so a mistyped key or field name
// would print less, or nothing, and succeed. The command host checks the
// user's parameters against the command's result template first and refuses
// them with the names that would be valid.
//
//===----------------------------------------------------------------------===//
#include "FormatParams.h"

#include "Fabrik/MetaObj.h"
#include "Options.h"

#include <algorithm>
#include <map>

namespace Ostra {

using namespace Fabrik;

namespace {

/// Keys that take a structure name after the colon, and the keys alone.
const char* const kKeys = "fields, fields:S, table-columns, table-columns:S, header:S, units:S.F, "
                          "show-header, wrap-last";

/// Field names of each structure of a result template, by structure name.
using Shapes = std::map<std::string, std::vector<std::string>>;

void Collect(const MetaObj::MetaObjectPtr& value, Shapes& shapes) {
  if (!value)
    return;
  if (value->GetType() == MetaObj::List) {
    Collect(static_cast<const MetaObj::MetaList&>(*value).GetElementTemplate(), shapes);
    return;
  }
  if (value->GetType() != MetaObj::Struct)
    return;
  const auto& structure = static_cast<const MetaObj::MetaStruct&>(*value);
  auto [entry, added] = shapes.try_emplace(structure.GetName());
  if (!added)
    return;
  for (std::size_t i = 0; i < structure.GetFieldCount(); ++i)
    entry->second.push_back(structure.GetFieldName(i));
  for (std::size_t i = 0; i < structure.GetFieldCount(); ++i)
    Collect(structure.GetFieldValue(i).GetObject(), shapes);
}

std::string Join(const std::vector<std::string>& names) {
  std::string text;
  for (const std::string& name : names)
    text += (text.empty() ? "" : ", ") + name;
  return text;
}

/// The names of a field list, as the formatters read it: comma-separated,
/// blanks around each name ignored.
std::vector<std::string> FieldNames(const std::string& list) {
  std::vector<std::string> names;
  for (std::size_t begin = 0; begin <= list.size();) {
    std::size_t end = std::min(list.find(',', begin), list.size());
    std::string name = list.substr(begin, end - begin);
    name.erase(0, name.find_first_not_of(" \t"));
    name.erase(name.find_last_not_of(" \t") + 1);
    if (!name.empty())
      names.push_back(std::move(name));
    begin = end + 1;
  }
  return names;
}

/// Whether a command of the tree below \p node has structure \p shape.
bool TreeHasShape(const AutoCli::NamespaceNodePtr& node, const std::string& shape) {
  if (auto command = std::dynamic_pointer_cast<AutoCli::CommandSpec>(node)) {
    std::shared_ptr<CallSpec::OutputSpec> output = command->GetOutputSpec();
    Shapes shapes;
    Collect(output ? output->GetRootObject() : nullptr, shapes);
    if (shapes.count(shape))
      return true;
  }
  for (const AutoCli::NamespaceNodePtr& child : node->GetNamespaceNodes())
    if (TreeHasShape(child, shape))
      return true;
  return false;
}

} // namespace

std::string CheckFormatParams(AutoCli::CommandSpec& command, const AutoCli::NamespaceNodePtr& tree,
                              const std::vector<std::pair<std::string, std::string>>& params) {
  if (params.empty())
    return "";
  std::shared_ptr<CallSpec::OutputSpec> output = command.GetOutputSpec();
  const MetaObj::MetaObjectPtr root = output ? output->GetRootObject() : nullptr;
  // The structure that "fields" and "table-columns" select from.
  std::string rootShape;
  // A list of structures without a template declares none to check against.
  bool undeclared = false;
  if (root && root->GetType() == MetaObj::Struct) {
    rootShape = static_cast<const MetaObj::MetaStruct&>(*root).GetName();
  } else if (root && root->GetType() == MetaObj::List) {
    const auto& list = static_cast<const MetaObj::MetaList&>(*root);
    const auto& element = list.GetElementTemplate();
    if (element && element->GetType() == MetaObj::Struct)
      rootShape = static_cast<const MetaObj::MetaStruct&>(*element).GetName();
    else
      undeclared = list.GetElementType() == MetaObj::Struct;
  }
  Shapes shapes;
  Collect(root, shapes);
  std::vector<std::string> shapeNames;
  for (const auto& [name, fields] : shapes)
    shapeNames.push_back(name);

  for (const auto& [key, value] : params) {
    const std::string given = "--format-param " + key + "=" + value + ": ";
    if (key == "show-header" || key == "wrap-last") {
      bool ignored;
      if (!ParseBoolWord(value, ignored))
        return given + "\"" + value + "\" is not a boolean (true/false, yes/no, on/off, 1/0)";
      continue;
    }
    std::size_t colon = key.find(':');
    std::string kind = key.substr(0, colon);
    if (kind != "fields" && kind != "table-columns" && kind != "header" && kind != "units")
      return "unknown formatter parameter \"" + key + "\" (known: " + kKeys + ")";
    if (colon == std::string::npos && (kind == "header" || kind == "units"))
      return "formatter parameter \"" + key + "\" names no structure (known: " + kKeys + ")";
    // A result without structures (a boolean, a text) has nothing to select;
    // the parameters in front of --batch apply to such lines too.
    if (shapes.empty() || undeclared)
      continue;
    std::string shape = colon == std::string::npos ? rootShape : key.substr(colon + 1);
    std::string field;
    if (kind == "units") {
      std::size_t dot = shape.find('.');
      if (dot == std::string::npos)
        return "formatter parameter \"" + key + "\" names no field (units:S.F)";
      field = shape.substr(dot + 1);
      shape.erase(dot);
    }

    auto found = shapes.find(shape);
    if (found == shapes.end()) {
      // Another command's structure: the parameters in front of --batch may
      // be meant for other lines.
      if (colon != std::string::npos && TreeHasShape(tree, shape))
        continue;
      return given + "the result of this command has no structure \"" + shape +
             "\" (its structures: " + Join(shapeNames) + ")";
    }
    const std::vector<std::string>& fields = found->second;
    std::vector<std::string> wanted;
    if (kind == "units")
      wanted.push_back(field);
    else if (kind != "header")
      wanted = FieldNames(value);
    for (const std::string& name : wanted)
      if (std::find(fields.begin(), fields.end(), name) == fields.end())
        return given + "\"" + name + "\" is not a field of " + shape +
               " (its fields: " + Join(fields) + ")";
  }
  return "";
}

} // namespace Ostra
