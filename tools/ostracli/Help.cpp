//===- Help.cpp - Help texts generated from the command tree ---------------===//
#include "Help.h"

#include "Globals.h"

#include <algorithm>
#include <vector>

namespace Ostra {

using namespace Fabrik;

namespace {

std::string Lower(std::string text) {
  for (char& c : text)
    if (c >= 'A' && c <= 'Z')
      c = static_cast<char>(c - 'A' + 'a');
  return text;
}

std::size_t EditDistance(const std::string& a, const std::string& b) {
  std::vector<std::size_t> row(b.size() + 1);
  for (std::size_t j = 0; j <= b.size(); ++j)
    row[j] = j;
  for (std::size_t i = 1; i <= a.size(); ++i) {
    std::size_t diagonal = row[0];
    row[0] = i;
    for (std::size_t j = 1; j <= b.size(); ++j) {
      std::size_t above = row[j];
      row[j] = std::min({row[j] + 1, row[j - 1] + 1, diagonal + (a[i - 1] == b[j - 1] ? 0 : 1)});
      diagonal = above;
    }
  }
  return row[b.size()];
}

std::string PathText(const AutoCli::NamespaceNode& node) {
  std::string path = node.GetPathString(' ');
  return path.empty() ? "ostracli" : "ostracli " + path;
}

const char* TypeName(CallSpec::ParameterType type) {
  switch (type) {
  case CallSpec::String:
    return "string";
  case CallSpec::Integer:
    return "long";
  case CallSpec::Boolean:
    return "bool";
  case CallSpec::Flag:
    return "flag";
  case CallSpec::StringList:
    return "string list";
  }
  return "value";
}

/// Two columns: a name padded to \p width, then the text with its line breaks
/// indented under the second column.
void Columns(std::string& out, const std::string& name, const std::string& text,
             std::size_t width) {
  std::string line = "  " + name;
  if (line.size() + 2 > width)
    line += "\n" + std::string(width, ' ');
  else
    line += std::string(width - line.size(), ' ');
  for (char c : text) {
    line += c;
    if (c == '\n')
      line += std::string(width, ' ');
  }
  out += line + "\n";
}

} // namespace

std::vector<std::string> ClosestNames(const std::string& word,
                                      const std::vector<std::string>& names) {
  std::vector<std::string> close;
  // No name is near a word this long, and the distance costs its length.
  if (word.size() > 64)
    return close;
  const std::size_t limit = word.size() <= 4 ? 1 : 2;
  std::size_t best = limit + 1;
  for (const std::string& name : names) {
    std::size_t distance = EditDistance(Lower(name), Lower(word));
    if (distance < best) {
      best = distance;
      close.clear();
    }
    if (distance == best)
      close.push_back(name);
  }
  return close;
}

std::string DidYouMean(const std::vector<std::string>& close, const char* before,
                       const char* after) {
  if (close.empty())
    return "";
  std::string text = "; did you mean";
  for (std::size_t i = 0; i < close.size(); ++i)
    text += (i ? ", " : " ") + (before + close[i]) + after;
  return text + "?";
}

std::string UnknownWordMessage(const AutoCli::NamespaceNode& node, const std::string& word) {
  std::string where = node.GetPathString(' ');
  std::string message =
      "Error: unknown " +
      std::string(node.GetType() == AutoCli::CommandKind ? "argument" : "command") + " \"" + word +
      "\"" + (where.empty() ? "" : " under \"" + where + "\"");
  if (node.GetType() == AutoCli::NamespaceKind)
    message += DidYouMean(ClosestNames(word, node.GetNamespaceNodeNames()));
  return message + "\n";
}

std::string NamespaceHelpText(const AutoCli::NamespaceNode& node, const std::string& hostState) {
  std::string out = "Usage: " + PathText(node) + " {cmd} [cmd options]\n";
  const bool root = node.GetPathString(' ').empty();
  if (root) {
    out = "Usage: ostracli [options] {namespace}+ {cmd} [cmd options]\n\n"
          "Options (before the command words):\n";
    for (const GlobalOption& option : GlobalOptionTable()) {
      std::string name = option.alias ? std::string(option.alias) + ", " : std::string();
      name += option.name;
      if (option.value)
        name += std::string(" ") + option.value;
      Columns(out, name, option.text, 28);
    }
    out += "\nExit status: 0 success; 1 the command reported an error; 2 the command line was "
           "refused\n(unknown command or option, missing or invalid value) and nothing ran.\n";
    out += "\nHost state: " + hostState + ".\nOverride it with --host or OSTRACLI_HOST.\n";
  } else if (!node.GetDescription().empty()) {
    out += "\nDescription:\n  " + node.GetDescription() + "\n";
  }
  std::string namespaces, commands;
  for (const AutoCli::NamespaceNodePtr& child : node.GetNamespaceNodes()) {
    std::string& into = child->GetType() == AutoCli::NamespaceKind ? namespaces : commands;
    Columns(into, child->GetName(), child->GetDescription(), 24);
  }
  if (!namespaces.empty())
    out += "\nAvailable Namespaces:\n" + namespaces;
  if (!commands.empty())
    out += "\nAvailable Commands:\n" + commands;
  out += "\nFor more information: " + PathText(node) +
         (root ? " {namespace} --help\n" : " {cmd} --help\n");
  return out;
}

std::string CommandHelpText(const AutoCli::CommandSpec& command, const CallSpec::InputSpec& spec) {
  std::string out = "Usage: " + PathText(command) + " [cmd options]\n\nDescription:\n";
  Columns(out, command.GetName(), command.GetDescription(), 24);
  if (spec.GetParameters().empty())
    return out + "\nThis command takes no options.\n";
  out += "\nCmd options:\n";
  for (const auto& parameter : spec.GetParameters()) {
    std::string name =
        parameter->GetShortName().empty() ? "" : "-" + parameter->GetShortName() + "|";
    name += "--" + parameter->GetName();
    if (parameter->GetType() != CallSpec::Flag)
      name += std::string("=<") + TypeName(parameter->GetType()) + ">";
    std::string text = parameter->GetExpandedDescription();
    if (const auto& constraint = parameter->GetConstraint()) {
      if (constraint->GetType() == CallSpec::IntRange ||
          constraint->GetType() == CallSpec::StringRegex)
        text += " (" + constraint->Describe() + ")";
    }
    if (parameter->GetType() == CallSpec::StringList)
      text += " (repeat the option for several values)";
    if (parameter->IsRequired())
      text += " (required)";
    Columns(out, name, text, 30);
  }
  return out;
}

MetaObj::MetaObjectPtr NamespaceHelpValue(const AutoCli::NamespaceNode& node) {
  auto help = MetaObj::MetaStruct::New("NamespaceHelp");
  help->SetField("path", node.GetPathString(' '));
  help->SetField("kind", "namespace");
  help->SetField("description", node.GetDescription());
  auto children = MetaObj::MetaList::New(MetaObj::Struct, MetaObj::MetaStruct::New("Child"));
  for (const AutoCli::NamespaceNodePtr& child : node.GetNamespaceNodes()) {
    auto entry = MetaObj::MetaStruct::New("Child");
    entry->SetField("name", child->GetName());
    entry->SetField("kind", child->GetType() == AutoCli::NamespaceKind ? "namespace" : "command");
    entry->SetField("description", child->GetDescription());
    children->Add(std::move(entry));
  }
  help->SetField("children", std::move(children));
  return help;
}

namespace {

/// The constraint of a parameter as help shows it: its type code, then the
/// range, the pattern or the accepted values.
std::shared_ptr<MetaObj::MetaStruct> ConstraintValue(const CallSpec::ParameterConstraint& check) {
  auto constraint = MetaObj::MetaStruct::New("Constraint");
  constraint->SetField("type", static_cast<long>(check.GetType()));
  switch (check.GetType()) {
  case CallSpec::IntRange:
    constraint->SetField("min", check.GetMin());
    constraint->SetField("max", check.GetMax());
    break;
  case CallSpec::StringRegex:
    constraint->SetField("pattern", check.GetPattern());
    break;
  case CallSpec::IntEnum:
  case CallSpec::StringEnum: {
    auto values = MetaObj::MetaList::New(MetaObj::Struct, MetaObj::MetaStruct::New("EnumValue"));
    for (const auto& value : check.GetEnumValues()) {
      auto entry = MetaObj::MetaStruct::New("EnumValue");
      entry->SetField("value", value.value);
      entry->SetField("description", value.description);
      values->Add(std::move(entry));
    }
    constraint->SetField("values", std::move(values));
    break;
  }
  }
  return constraint;
}

} // namespace

MetaObj::MetaObjectPtr CommandHelpValue(const AutoCli::CommandSpec& command,
                                        const CallSpec::InputSpec& spec) {
  auto help = MetaObj::MetaStruct::New("CommandHelp");
  help->SetField("path", command.GetPathString(' '));
  help->SetField("kind", "command");
  help->SetField("description", command.GetDescription());
  auto parameters = MetaObj::MetaList::New(MetaObj::Struct, MetaObj::MetaStruct::New("Parameter"));
  for (const auto& parameter : spec.GetParameters()) {
    auto entry = MetaObj::MetaStruct::New("Parameter");
    entry->SetField("name", parameter->GetName());
    entry->SetField("shortName", parameter->GetShortName());
    entry->SetField("type", TypeName(parameter->GetType()));
    entry->SetField("typeCode", static_cast<long>(parameter->GetType()));
    entry->SetField("required", parameter->IsRequired());
    entry->SetField("description", parameter->GetExpandedDescription());
    if (const auto& constraint = parameter->GetConstraint())
      entry->SetField("constraint", ConstraintValue(*constraint));
    parameters->Add(std::move(entry));
  }
  help->SetField("parameters", std::move(parameters));
  // The default output parameters are pairs of key and value, in order.
  auto output = MetaObj::MetaStruct::New("Output");
  output->SetField("formatter", command.GetDefaultOutputFormatter());
  auto pairs = MetaObj::MetaList::New(MetaObj::List);
  for (const auto& [key, value] : command.GetDefaultOutputParameters()) {
    auto pair = MetaObj::MetaList::New(MetaObj::String);
    pair->Add(key);
    pair->Add(value);
    pairs->Add(std::move(pair));
  }
  output->SetField("parameters", std::move(pairs));
  help->SetField("output", std::move(output));
  return help;
}

} // namespace Ostra
