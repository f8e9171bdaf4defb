//===- FieldTable.h - Result structures declared as a table ----------------===//
//
// A command declares the fields of each structure it returns as rows of
// FieldDef, in the order they are shown, and builds the template with
// MakeStructure. Every field of a new template is unset.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/MetaObj.h"
#include "common/ParameterTable.h"

#include <initializer_list>
#include <memory>
#include <span>
#include <string>

namespace CorvexCli::NetworkNamespace {

/// The kind of value a field holds.
enum class FieldKind { String, Integer, Boolean, StringList };

/// One field of a result structure.
struct FieldDef {
  TextRef name;   ///< Field name, as shown.
  FieldKind kind; ///< Value type.
};

/// A structure template named \p name with the fields of \p table, in order.
std::shared_ptr<Fabrik::MetaObj::MetaStruct> MakeStructure(const std::string& name,
                                                           std::span<const FieldDef> table);
std::shared_ptr<Fabrik::MetaObj::MetaStruct> MakeStructure(const std::string& name,
                                                           std::initializer_list<FieldDef> table);

} // namespace CorvexCli::NetworkNamespace
