//===- FieldTable.h - Result structures declared as a table ----------------===//
//
// A command declares the fields of each structure it returns as rows of
// FieldDef, in the order they are shown, and builds the template with
// MakeStructure. Every field of a new template is unset. Its output
// specification is made by one of the *ResultSpec functions.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
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

/// An output specification whose result is \p root.
std::shared_ptr<Fabrik::CallSpec::OutputSpec> ResultSpec(Fabrik::MetaObj::MetaObjectPtr root);
/// An output specification whose result is a boolean (the commands that act).
std::shared_ptr<Fabrik::CallSpec::OutputSpec> BoolResultSpec();
/// An output specification whose result is a list of \p element structures.
std::shared_ptr<Fabrik::CallSpec::OutputSpec>
ListResultSpec(std::shared_ptr<Fabrik::MetaObj::MetaStruct> element);

} // namespace CorvexCli::NetworkNamespace
