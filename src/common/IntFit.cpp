//===- IntFit.cpp - Integer parameters a command stores in fewer bits -----===//
#include "common/IntFit.h"

#include "HostCtl/Lib.h"

namespace CorvexCli::NetworkNamespace {

std::optional<std::string> OutOfRange(const Fabrik::CallSpec::Input& input, const IntFit& fit) {
  if (!input.HasParameter(fit.name))
    return std::nullopt;
  long value = input.GetParameterInt(fit.name);
  if (value >= fit.min && value <= fit.max)
    return std::nullopt;
  return "option --" + fit.name + ": value " + std::to_string(value) + " is out of range [" +
         std::to_string(fit.min) + " - " + std::to_string(fit.max) + "]";
}

void RequireFit(const Fabrik::CallSpec::Input& input, std::span<const IntFit> fits) {
  for (const IntFit& fit : fits)
    if (auto problem = OutOfRange(input, fit))
      throw HostCtl::Lib::HostCtlException(*problem);
}

} // namespace CorvexCli::NetworkNamespace
