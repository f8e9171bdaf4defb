//===- Complete.cpp - Shell completion from the command tree ----------------===//
//
// "ostracli --complete WORD..." prints the candidates for the last word, one
// per line, from the live command tree: global options, namespace and command
// names, command options, the values of enumerations, booleans and
// formatters, and the names of the host's objects (LiveNames). The bash
// function installed with ostracli (ostracli.bash) calls it, so completion
// never drifts from the tree or the host.
//
//===----------------------------------------------------------------------===//
#include "Host.h"
#include "HostCtl/Lib.h"

#include "Fabrik/Format.h"
#include "Globals.h"
#include "LiveNames.h"

#include <set>

namespace Ostra {

using namespace Fabrik;

namespace {

bool TakesValue(const std::string& option) {
  const GlobalOption* global = FindGlobalOption(option);
  return global && global->value;
}

void Add(std::string& out, const std::string& candidate, const std::string& prefix) {
  if (candidate.compare(0, prefix.size(), prefix) == 0)
    out += candidate + "\n";
}

} // namespace

std::string Complete(const CommandTree& tree, const std::vector<std::string>& words) {
  std::string out;
  const std::string current = words.empty() ? std::string() : words.back();
  const std::size_t count = words.empty() ? 0 : words.size() - 1; // Complete words before it.

  // Global options, then the path. The host they name is the one whose
  // names are offered.
  std::size_t i = 0;
  std::string host;
  for (; i < count && words[i].size() > 1 && words[i][0] == '-'; ++i) {
    std::size_t eq = words[i].find('=');
    if (words[i].compare(0, eq, "--host") == 0)
      host =
          eq == std::string::npos ? (i + 1 < count ? words[i + 1] : "") : words[i].substr(eq + 1);
    if (TakesValue(words[i].substr(0, eq)) && eq == std::string::npos)
      ++i;
  }
  if (i > count) {
    // The word under the cursor is the value of a global option.
    const std::string& option = words[count - 1];
    if (option == "--formatter")
      for (const std::string& name : Format::FormatterNames())
        Add(out, name, current);
    return out;
  }
  AutoCli::NamespaceNodePtr node = tree.Root();
  for (; i < count; ++i) {
    if (words[i].size() > 1 && words[i][0] == '-')
      break;
    if (node->GetType() != AutoCli::NamespaceKind)
      return out;
    AutoCli::NamespaceNodePtr next = node->GetNamespaceNode(words[i]);
    if (!next)
      return out;
    node = next;
  }
  if (node->GetType() == AutoCli::NamespaceKind) {
    if (i < count)
      return out;
    if (node == tree.Root() && !current.empty() && current[0] == '-') {
      for (const GlobalOption& option : GlobalOptionTable())
        Add(out, option.name, current);
      return out;
    }
    for (const std::string& name : node->GetNamespaceNodeNames())
      Add(out, name, current);
    if (!current.empty() && current[0] == '-')
      Add(out, "--help", current);
    return out;
  }

  // Command options.
  auto command = std::dynamic_pointer_cast<AutoCli::CommandSpec>(node);
  if (!command)
    return out;
  std::shared_ptr<CallSpec::InputSpec> spec;
  try {
    spec = command->GetInputSpec();
  } catch (const HostCtl::Lib::HostCtlException&) {
    return out; // A host that cannot answer completes no options.
  }
  std::set<std::string> given;
  std::shared_ptr<CallSpec::ParameterSpec> pending;
  for (; i < count; ++i) {
    const std::string& word = words[i];
    pending.reset();
    std::shared_ptr<CallSpec::ParameterSpec> parameter;
    if (word.compare(0, 2, "--") == 0)
      parameter = spec->FindParameter(word.substr(2, word.find('=') - 2));
    else if (word.size() == 2 && word[0] == '-')
      parameter = spec->FindShortParameter(word.substr(1));
    if (!parameter)
      continue;
    given.insert(parameter->GetName());
    if (parameter->GetType() != CallSpec::Flag && word.find('=') == std::string::npos) {
      if (i + 1 < count)
        ++i;
      else
        pending = parameter;
    }
  }
  if (pending) {
    if (pending->GetType() == CallSpec::Boolean) {
      Add(out, "true", current);
      Add(out, "false", current);
    } else if (const auto& constraint = pending->GetConstraint()) {
      if (constraint->GetType() == CallSpec::StringEnum ||
          constraint->GetType() == CallSpec::IntEnum)
        for (const auto& value : constraint->GetEnumValues())
          Add(out, value.value, current);
    } else {
      for (const std::string& name : LiveNames(pending->GetName(), host))
        Add(out, name, current);
    }
    return out;
  }
  for (const auto& parameter : spec->GetParameters())
    if (!given.count(parameter->GetName()) || parameter->GetType() == CallSpec::StringList)
      Add(out, "--" + parameter->GetName(), current);
  Add(out, "--help", current);
  return out;
}

} // namespace Ostra
