//===- ParamTable.h - Parameters and result fields declared from tables ---===//
//
// The IP service families declare each command's parameters and each result
// structure's fields as a table; these helpers turn a table into the input
// specification or the structure template.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "ip/IpCommon.h"

#include <memory>
#include <string>
#include <vector>

namespace CorvexCli::NetworkNamespace {

/// One parameter of a command.
struct ParamDef {
  const char* name;                         ///< Long name.
  Fabrik::CallSpec::ParameterType type;     ///< Value type.
  const char* shortName;                    ///< One letter.
  bool required;                            ///< Must be given.
  std::string description;                  ///< Help text.
  std::vector<const char*> enumValues = {}; ///< String enumeration, if any.
};

/// One field of a result structure.
struct FieldDef {
  const char* name;               ///< Field name.
  Fabrik::MetaObj::MetaType type; ///< Boolean, Integer, String, or List (of strings).
};

/// The input specification holding \p params in order.
inline std::shared_ptr<Fabrik::CallSpec::InputSpec>
MakeInputSpec(const std::vector<ParamDef>& params) {
  auto spec = Fabrik::CallSpec::InputSpec::New();
  for (const ParamDef& def : params) {
    auto param = Fabrik::CallSpec::ParameterSpec::New(def.name, def.type);
    param->SetShortName(def.shortName);
    param->SetDescription(def.description);
    param->SetRequired(def.required);
    if (!def.enumValues.empty()) {
      auto constraint = Fabrik::CallSpec::ParameterConstraint::New(Fabrik::CallSpec::StringEnum);
      for (const char* value : def.enumValues)
        constraint->AddStringEnum(value);
      param->SetConstraint(constraint);
    }
    spec->AddParameter(param);
  }
  return spec;
}

/// A structure template named \p name with \p fields in order.
inline std::shared_ptr<Fabrik::MetaObj::MetaStruct>
MakeStructure(const char* name, const std::vector<FieldDef>& fields) {
  using namespace Fabrik::MetaObj;
  auto structure = MetaStruct::New(name);
  for (const FieldDef& field : fields) {
    switch (field.type) {
    case Boolean:
      structure->SetField(field.name, MetaBool::New());
      break;
    case Integer:
      structure->SetField(field.name, MetaInt::New());
      break;
    case List:
      structure->SetField(field.name, MetaList::New(String));
      break;
    default:
      structure->SetField(field.name, MetaString::New());
      break;
    }
  }
  return structure;
}

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
