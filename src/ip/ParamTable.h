//===- ParamTable.h - Result fields of the IP services declared as tables --===//
//
// The IP service families declare each result structure's fields as a table;
// these helpers turn a table into the structure template. Their parameters
// are tables of ParameterDef (common/ParameterTable.h).
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

#include <memory>
#include <string>
#include <vector>

namespace CorvexCli::NetworkNamespace {

/// An output specification whose result is \p root.
inline std::shared_ptr<Fabrik::CallSpec::OutputSpec>
MakeOutputSpec(Fabrik::MetaObj::MetaObjectPtr root) {
  auto spec = Fabrik::CallSpec::OutputSpec::New();
  spec->SetRootObject(std::move(root));
  return spec;
}

/// The description of the "netstack" parameter.
inline const char* const kNetstackDescription =
    "The network stack instance; if unspecified, use the default netstack instance";

} // namespace CorvexCli::NetworkNamespace
