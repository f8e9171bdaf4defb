//===- ParameterTable.cpp - Input specifications built from tables ---------===//
#include "common/ParameterTable.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::ParameterConstraint;
using Fabrik::CallSpec::ParameterConstraintType;

namespace {

std::string Text(const TextRef& text) {
  return std::string(text.View());
}

std::shared_ptr<ParameterConstraint> MakeConstraint(const ParameterCheck& check) {
  if (check.kind == 0)
    return nullptr;
  auto constraint = ParameterConstraint::New(static_cast<ParameterConstraintType>(check.kind));
  switch (check.kind) {
  case Fabrik::CallSpec::IntRange:
    constraint->SetIntRange(check.min, check.max);
    break;
  case Fabrik::CallSpec::IntEnum:
    for (long value : check.integers)
      constraint->AddIntEnum(value);
    break;
  case Fabrik::CallSpec::StringEnum:
    for (const EnumChoice& choice : check.choices)
      constraint->AddStringEnum(Text(choice.value), Text(choice.description));
    break;
  case Fabrik::CallSpec::StringRegex:
    constraint->SetStringRegex(Text(check.pattern));
    break;
  default:
    break;
  }
  return constraint;
}

} // namespace

void AddParameters(Fabrik::CallSpec::InputSpec& spec, std::span<const ParameterDef> table) {
  for (const ParameterDef& row : table) {
    auto parameter = Fabrik::CallSpec::ParameterSpec::New(Text(row.name), row.type);
    parameter->SetShortName(Text(row.shortName));
    parameter->SetDescription(Text(row.description));
    parameter->SetRequired(row.required);
    parameter->SetConstraint(MakeConstraint(row.check));
    spec.AddParameter(std::move(parameter));
  }
}

void AddParameters(Fabrik::CallSpec::InputSpec& spec, std::initializer_list<ParameterDef> table) {
  AddParameters(spec, std::span<const ParameterDef>(table.begin(), table.size()));
}

std::shared_ptr<Fabrik::CallSpec::InputSpec> MakeInputSpec(std::span<const ParameterDef> table) {
  auto spec = Fabrik::CallSpec::InputSpec::New();
  AddParameters(*spec, table);
  return spec;
}

std::shared_ptr<Fabrik::CallSpec::InputSpec>
MakeInputSpec(std::initializer_list<ParameterDef> table) {
  return MakeInputSpec(std::span<const ParameterDef>(table.begin(), table.size()));
}

} // namespace CorvexCli::NetworkNamespace
