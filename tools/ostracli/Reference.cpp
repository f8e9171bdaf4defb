//===- Reference.cpp - The command reference, generated from the tree ------===//
//
// "ostracli --reference" prints docs/reference.md: every namespace and command
// with its description, options and result fields, in registration order. A
// test compares the file with the tree, so the reference stays current.
//
//===----------------------------------------------------------------------===//
#include "Host.h"

#include "Fabrik/MetaObj.h"

namespace Ostra {

using namespace Fabrik;

const char* ReferenceTypeName(CallSpec::ParameterType type) {
  switch (type) {
  case CallSpec::String:
    return "string";
  case CallSpec::Integer:
    return "integer";
  case CallSpec::Boolean:
    return "boolean";
  case CallSpec::Flag:
    return "flag";
  case CallSpec::StringList:
    return "string list";
  }
  return "value";
}

namespace {

/// Makes \p text safe inside a Markdown table cell.
std::string Cell(const std::string& text) {
  std::string out;
  for (char c : text) {
    if (c == '|')
      out += "\\|";
    else if (c == '\n')
      out += "<br>";
    else
      out += c;
  }
  return out;
}

std::string Describe(const MetaObj::MetaObjectPtr& value) {
  if (!value)
    return "nothing";
  switch (value->GetType()) {
  case MetaObj::Boolean:
    return "boolean";
  case MetaObj::Integer:
    return "integer";
  case MetaObj::String:
    return "string";
  case MetaObj::Struct:
    return "structure " + static_cast<const MetaObj::MetaStruct&>(*value).GetName();
  case MetaObj::List: {
    const auto& list = static_cast<const MetaObj::MetaList&>(*value);
    if (list.GetElementType() == MetaObj::Struct && list.GetElementTemplate())
      return "list of " + Describe(list.GetElementTemplate());
    return list.GetElementType() == MetaObj::String ? "list of strings" : "list";
  }
  }
  return "value";
}

/// The fields of every structure reachable from \p value, each once.
void Structures(const MetaObj::MetaObjectPtr& value, std::vector<std::string>& seen,
                std::string& out) {
  if (!value)
    return;
  if (value->GetType() == MetaObj::List) {
    Structures(static_cast<const MetaObj::MetaList&>(*value).GetElementTemplate(), seen, out);
    return;
  }
  if (value->GetType() != MetaObj::Struct)
    return;
  const auto& structure = static_cast<const MetaObj::MetaStruct&>(*value);
  for (const std::string& name : seen)
    if (name == structure.GetName())
      return;
  seen.push_back(structure.GetName());
  out += "\nStructure `" + structure.GetName() + "`:\n\n| field | type |\n|---|---|\n";
  for (std::size_t i = 0; i < structure.GetFieldCount(); ++i)
    out += "| " + Cell(structure.GetFieldName(i)) + " | " +
           Describe(structure.GetFieldValue(i).ToObject()) + " |\n";
  for (std::size_t i = 0; i < structure.GetFieldCount(); ++i)
    Structures(structure.GetFieldValue(i).GetObject(), seen, out);
}

void Walk(const AutoCli::NamespaceNodePtr& node, std::string& out) {
  std::string path = node->GetPathString(' ');
  if (!path.empty()) {
    if (node->GetType() == AutoCli::NamespaceKind) {
      out += "\n## " + path + "\n\n" + node->GetDescription() + "\n";
    } else {
      auto command = std::dynamic_pointer_cast<AutoCli::CommandSpec>(node);
      out += "\n### " + path + "\n\n" + node->GetDescription() + "\n";
      std::shared_ptr<CallSpec::InputSpec> input = command->GetInputSpec();
      if (input->GetParameters().empty()) {
        out += "\nNo options.\n";
      } else {
        out += "\n| option | short | type | required | description |\n|---|---|---|---|---|\n";
        for (const auto& parameter : input->GetParameters()) {
          std::string text = parameter->GetExpandedDescription();
          if (const auto& constraint = parameter->GetConstraint())
            text += " (" + constraint->Describe() + ")";
          out += "| `--" + parameter->GetName() + "` | " +
                 (parameter->GetShortName().empty() ? "" : "`-" + parameter->GetShortName() + "`") +
                 " | " + ReferenceTypeName(parameter->GetType()) + " | " +
                 (parameter->IsRequired() ? "yes" : "no") + " | " + Cell(text) + " |\n";
        }
      }
      std::shared_ptr<CallSpec::OutputSpec> output = command->GetOutputSpec();
      const MetaObj::MetaObjectPtr root = output ? output->GetRootObject() : nullptr;
      out += "\nResult: " + Describe(root) + ".\n";
      std::vector<std::string> seen;
      Structures(root, seen, out);
      std::string formatter = command->GetDefaultOutputFormatter();
      if (!formatter.empty() || !command->GetDefaultOutputParameters().empty()) {
        out += "\nDefault output: " + (formatter.empty() ? std::string("simple") : formatter);
        for (const auto& [key, value] : command->GetDefaultOutputParameters())
          out += "; `" + key + "` = \"" + value + "\"";
        out += ".\n";
      }
    }
  }
  for (const AutoCli::NamespaceNodePtr& child : node->GetNamespaceNodes())
    Walk(child, out);
}

} // namespace

std::string Reference(const CommandTree& tree) {
  std::string out = "# Command reference\n\n"
                    "Generated by `ostracli --reference` from the registered command tree; "
                    "do not edit.\nSee docs/cli.md for the options and formatters of "
                    "ostracli itself.\n";
  Walk(tree.Root(), out);
  return out;
}

} // namespace Ostra
