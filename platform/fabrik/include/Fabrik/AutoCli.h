//===- Fabrik/AutoCli.h - The command tree ---------------------------------===//
//
// Nodes of the command tree: namespaces and commands. A node learns its name
// from the parent it is registered on; children keep their registration order.
// A command is a node that describes its parameters and result and can run.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace Fabrik::AutoCli {

class NamespaceNode;
using NamespaceNodePtr = std::shared_ptr<NamespaceNode>;

/// Kinds of node, as GetType reports them.
enum NodeType : int {
  NamespaceKind = 0,
  CommandKind = 1,
};

/// A node of the command tree.
class NamespaceNode : public std::enable_shared_from_this<NamespaceNode> {
public:
  NamespaceNode() = default;
  NamespaceNode(const NamespaceNode&) = delete;
  NamespaceNode& operator=(const NamespaceNode&) = delete;
  virtual ~NamespaceNode();

  // The virtual operations are defined here, each forwarding to the library,
  // so that a plug-in's command classes refer to them within the plug-in: the
  // dynamic loader then has no symbol to look up for each of the hundreds of
  // vtable entries when the plug-in is loaded.
  virtual NamespaceNodePtr GetThis() { return shared_from_this(); }
  virtual NodeType GetType() const = 0;
  /// Names from the root (exclusive) down to this node.
  virtual std::vector<std::string> GetPath() const { return PathOf(); }
  virtual std::string GetPathString(char separator) const { return PathStringOf(separator); }
  virtual bool HasNamespaceNode(const std::string& name) const { return kids_.count(name) != 0; }
  virtual std::vector<std::string> GetNamespaceNodeNames() const { return order_; }
  virtual std::vector<NamespaceNodePtr> GetNamespaceNodes() const { return ChildrenOf(); }
  virtual NamespaceNodePtr GetNamespaceNode(const std::string& name) const { return ChildOf(name); }
  virtual void RegisterNamespaceNode(NamespaceNodePtr node, const std::string& name) {
    Register(std::move(node), name);
  }
  virtual void RegisterNamespaceNode(NamespaceNodePtr node, char const* name) {
    Register(std::move(node), name);
  }
  /// Follows \p words from this node; returns the deepest node reached and
  /// sets \p consumed to the number of words used.
  virtual NamespaceNodePtr ResolveNode(const std::vector<std::string>& words,
                                       std::size_t& consumed) {
    return Resolve(words, consumed);
  }
  /// The child namespace of that name, created when missing.
  virtual NamespaceNodePtr SubNamespace(const std::string& name) { return SubNamespaceOf(name); }
  /// The command this node dispatches to, or null for a namespace.
  virtual NamespaceNodePtr GetDispatcher() { return nullptr; }
  virtual void SetParent(const NamespaceNodePtr& parent, const std::string& name) {
    parent_ = parent;
    name_ = name;
  }
  virtual NamespaceNodePtr GetParent() const { return parent_.lock(); }

  void SetDescription(char const* description) { description_ = description; }
  void SetDescription(const std::string& description) { description_ = description; }
  const std::string& GetDescription() const { return description_; }
  /// The name under which the parent holds this node ("" for a root).
  const std::string& GetName() const { return name_; }

private:
  std::vector<std::string> PathOf() const;
  std::string PathStringOf(char separator) const;
  std::vector<NamespaceNodePtr> ChildrenOf() const;
  NamespaceNodePtr ChildOf(const std::string& name) const;
  void Register(NamespaceNodePtr node, const std::string& name);
  void Register(NamespaceNodePtr node, char const* name);
  NamespaceNodePtr Resolve(const std::vector<std::string>& words, std::size_t& consumed);
  NamespaceNodePtr SubNamespaceOf(const std::string& name);

  std::string description_;                      ///< Help text.
  std::string name_;                             ///< Name given by the parent.
  std::weak_ptr<NamespaceNode> parent_;          ///< Parent, if registered.
  std::vector<std::string> order_;               ///< Child names, in registration order.
  std::map<std::string, NamespaceNodePtr> kids_; ///< Children by name.
};

/// A node that only groups other nodes.
class Namespace : public NamespaceNode {
public:
  static NamespaceNodePtr New();
  NodeType GetType() const override { return NamespaceKind; }
};

/// A node that describes a command: its parameters, its result and how the
/// result is shown by default.
class CommandSpec : public NamespaceNode {
public:
  ~CommandSpec() override;
  NodeType GetType() const override { return CommandKind; }
  NamespaceNodePtr GetDispatcher() override { return GetThis(); }

  virtual std::shared_ptr<CallSpec::InputSpec> GetInputSpec() { return GetInputSpecInternal(); }
  virtual std::shared_ptr<CallSpec::OutputSpec> GetOutputSpec() { return GetOutputSpecInternal(); }

  void SetDefaultOutputFormatter(const std::string& name) { formatter_ = name; }
  void SetDefaultOutputParameter(const std::string& key, const std::string& value);
  /// "" when the command sets none.
  const std::string& GetDefaultOutputFormatter() const { return formatter_; }
  /// In the order first set; a later value of the same key replaces the earlier.
  const std::vector<std::pair<std::string, std::string>>& GetDefaultOutputParameters() const {
    return parameters_;
  }

protected:
  virtual std::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() = 0;
  virtual std::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() = 0;

private:
  std::string formatter_;                                       ///< Default formatter name.
  std::vector<std::pair<std::string, std::string>> parameters_; ///< Default parameters.
};

/// A command that can be run.
class Command : public CommandSpec {
public:
  Command();
  ~Command() override;
  /// Runs the command: ExecuteInternal with the validated input.
  virtual void Execute(const std::shared_ptr<CallSpec::Input>& input,
                       const std::shared_ptr<CallSpec::Output>& output) {
    ExecuteInternal(input, output);
  }

protected:
  virtual void ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                               const std::shared_ptr<CallSpec::Output>& output) = 0;
};

} // namespace Fabrik::AutoCli

/// The entry point a plug-in exports: registers its subtree on \p root.
extern "C" typedef void (*AutoCli_RegisterNamespacesFn)(Fabrik::AutoCli::NamespaceNodePtr& root);
