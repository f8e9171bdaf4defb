//===- AutoCli.cpp - The command tree ---------------------------------------===//
//
// Registration, look-up and resolution of tree nodes, and the entries through
// which the command host reaches a command's specifications and execution.
//
//===----------------------------------------------------------------------===//
#include "Fabrik/AutoCli.h"

#include <stdexcept>

namespace Fabrik::AutoCli {

NamespaceNode::~NamespaceNode() = default;

NamespaceNodePtr NamespaceNode::GetThis() {
  return shared_from_this();
}

std::vector<std::string> NamespaceNode::GetPath() const {
  // Walk up to the root, which has no parent and whose own name is not part of
  // the path, then reverse.
  std::vector<std::string> path;
  const NamespaceNode* node = this;
  NamespaceNodePtr parent = node->GetParent();
  while (parent) {
    path.push_back(node->GetName());
    node = parent.get();
    parent = node->GetParent();
  }
  return {path.rbegin(), path.rend()};
}

std::string NamespaceNode::GetPathString(char separator) const {
  std::string text;
  for (const std::string& name : GetPath()) {
    if (!text.empty())
      text += separator;
    text += name;
  }
  return text;
}

bool NamespaceNode::HasNamespaceNode(const std::string& name) const {
  return kids_.count(name) != 0;
}

std::vector<std::string> NamespaceNode::GetNamespaceNodeNames() const {
  return order_;
}

std::vector<NamespaceNodePtr> NamespaceNode::GetNamespaceNodes() const {
  std::vector<NamespaceNodePtr> nodes;
  nodes.reserve(order_.size());
  for (const std::string& name : order_)
    nodes.push_back(kids_.at(name));
  return nodes;
}

NamespaceNodePtr NamespaceNode::GetNamespaceNode(const std::string& name) const {
  auto it = kids_.find(name);
  return it == kids_.end() ? nullptr : it->second;
}

void NamespaceNode::RegisterNamespaceNode(NamespaceNodePtr node, const std::string& name) {
  if (!node)
    throw std::invalid_argument("cannot register an empty node as \"" + name + "\"");
  if (name.empty())
    throw std::invalid_argument("cannot register a node without a name");
  // A node registered on itself or on one of its descendants would make the
  // tree a cycle, and every walk towards the root would never end.
  for (const NamespaceNode* ancestor = this; ancestor;) {
    if (ancestor == node.get())
      throw std::invalid_argument("cannot register \"" + name +
                                  "\" below itself or one of its descendants");
    NamespaceNodePtr up = ancestor->GetParent();
    ancestor = up.get();
  }

  auto it = kids_.find(name);
  if (it == kids_.end()) {
    order_.push_back(name);
  } else if (it->second != node && it->second->GetParent().get() == this) {
    // The replaced node leaves the tree.
    it->second->SetParent(nullptr, it->second->GetName());
  }
  // A parent that no shared pointer owns cannot be linked back to; the child
  // then has no parent but still learns its name.
  node->SetParent(weak_from_this().lock(), name);
  kids_[name] = std::move(node);
}

void NamespaceNode::RegisterNamespaceNode(NamespaceNodePtr node, char const* name) {
  if (!name)
    throw std::invalid_argument("cannot register a node without a name");
  RegisterNamespaceNode(std::move(node), std::string(name));
}

NamespaceNodePtr NamespaceNode::ResolveNode(const std::vector<std::string>& words,
                                            std::size_t& consumed) {
  NamespaceNodePtr node = GetThis();
  consumed = 0;
  while (consumed < words.size()) {
    NamespaceNodePtr child = node->GetNamespaceNode(words[consumed]);
    if (!child)
      break;
    node = std::move(child);
    ++consumed;
  }
  return node;
}

NamespaceNodePtr NamespaceNode::SubNamespace(const std::string& name) {
  if (NamespaceNodePtr existing = GetNamespaceNode(name)) {
    if (existing->GetType() != NamespaceKind)
      throw std::invalid_argument("\"" + name + "\" is a command, not a namespace");
    return existing;
  }
  NamespaceNodePtr created = Namespace::New();
  RegisterNamespaceNode(created, name);
  return created;
}

NamespaceNodePtr NamespaceNode::GetDispatcher() {
  return nullptr;
}

void NamespaceNode::SetParent(const NamespaceNodePtr& parent, const std::string& name) {
  parent_ = parent;
  name_ = name;
}

NamespaceNodePtr NamespaceNode::GetParent() const {
  return parent_.lock();
}

NamespaceNodePtr Namespace::New() {
  return std::make_shared<Namespace>();
}

std::shared_ptr<CallSpec::InputSpec> CommandSpec::GetInputSpec() {
  return GetInputSpecInternal();
}

std::shared_ptr<CallSpec::OutputSpec> CommandSpec::GetOutputSpec() {
  return GetOutputSpecInternal();
}

void CommandSpec::SetDefaultOutputParameter(const std::string& key, const std::string& value) {
  for (auto& parameter : parameters_) {
    if (parameter.first == key) {
      parameter.second = value;
      return;
    }
  }
  parameters_.emplace_back(key, value);
}

Command::Command() = default;

void Command::Execute(const std::shared_ptr<CallSpec::Input>& input,
                      const std::shared_ptr<CallSpec::Output>& output) {
  ExecuteInternal(input, output);
}

} // namespace Fabrik::AutoCli
