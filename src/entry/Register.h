//===- Register.h - Entry point of the network plug-in -------------------===//
//
// The command host loads the plug-in and calls AutoCli_RegisterNamespaces once,
// with its root node, to attach the `network` subtree. Unit tests call it the
// same way on a root of their own.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/AutoCli.h"

#include <memory>

/// Builds the whole `network` subtree (91 namespaces, 152 command
/// registrations) and registers it on \p root under the name "network".
extern "C" __attribute__((visibility("default"))) void
AutoCli_RegisterNamespaces(std::shared_ptr<Fabrik::AutoCli::NamespaceNode>& root);
