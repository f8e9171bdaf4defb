//===- ParameterTable.h - Parameters of a command declared as a table -----===//
//
// A command declares its parameters as an array of ParameterDef and builds its
// input specification with MakeInputSpec, so that names, short names, types
// and descriptions are written once, in the order the command takes them.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"

#include <memory>
#include <string>

namespace CorvexCli::NetworkNamespace {

/// One parameter of a command.
struct ParameterDef {
  const std::string& name;              ///< Long name (a file-level constant).
  const char* shortName;                ///< One letter.
  Fabrik::CallSpec::ParameterType type; ///< Value type.
  bool required;                        ///< Must be given.
  const char* description;              ///< Help text.
};

/// The input specification holding \p defs in order.
template <std::size_t N>
std::shared_ptr<Fabrik::CallSpec::InputSpec> MakeInputSpec(const ParameterDef (&defs)[N]) {
  auto spec = Fabrik::CallSpec::InputSpec::New();
  for (const ParameterDef& def : defs) {
    auto parameter = Fabrik::CallSpec::ParameterSpec::New(def.name, def.type);
    parameter->SetShortName(def.shortName);
    parameter->SetDescription(def.description);
    parameter->SetRequired(def.required);
    spec->AddParameter(parameter);
  }
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
