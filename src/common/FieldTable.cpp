//===- FieldTable.cpp - Structure templates built from tables -------------===//
#include "common/FieldTable.h"

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik::MetaObj;

namespace {

MetaObjectPtr Template(FieldKind kind) {
  switch (kind) {
  case FieldKind::Integer:
    return MetaInt::New();
  case FieldKind::Boolean:
    return MetaBool::New();
  case FieldKind::StringList:
    return MetaList::New(String);
  case FieldKind::String:
    break;
  }
  return MetaString::New();
}

} // namespace

std::shared_ptr<MetaStruct> MakeStructure(const std::string& name,
                                          std::span<const FieldDef> table) {
  auto structure = MetaStruct::New(name);
  for (const FieldDef& field : table)
    structure->SetField(std::string(field.name.View()), Template(field.kind));
  return structure;
}

std::shared_ptr<MetaStruct> MakeStructure(const std::string& name,
                                          std::initializer_list<FieldDef> table) {
  return MakeStructure(name, std::span<const FieldDef>(table.begin(), table.size()));
}

std::shared_ptr<Fabrik::CallSpec::OutputSpec> ResultSpec(MetaObjectPtr root) {
  auto spec = Fabrik::CallSpec::OutputSpec::New();
  spec->SetRootObject(std::move(root));
  return spec;
}

std::shared_ptr<Fabrik::CallSpec::OutputSpec> BoolResultSpec() {
  return ResultSpec(MetaBool::New());
}

std::shared_ptr<Fabrik::CallSpec::OutputSpec> ListResultSpec(std::shared_ptr<MetaStruct> element) {
  return ResultSpec(MetaList::New(Struct, std::move(element)));
}

} // namespace CorvexCli::NetworkNamespace
