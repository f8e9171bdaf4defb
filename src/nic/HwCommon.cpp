//===- HwCommon.cpp - Shared pieces of the NIC hardware command families --===//
#include "nic/HwCommon.h"

#include "HostCtl/Misc.h"

namespace CorvexCli::NetworkNamespace::NicHw {

using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Network::Pnic;

std::shared_ptr<MetaStruct> StringStructure(const std::string& name,
                                            std::span<const std::string* const> fields) {
  auto structure = MetaStruct::New(name);
  for (const std::string* field : fields)
    structure->SetField(*field, MetaString::New());
  return structure;
}

std::string JoinFields(std::span<const std::string* const> names) {
  std::string joined;
  for (const std::string* name : names) {
    if (!joined.empty())
      joined += ",";
    joined += *name;
  }
  return joined;
}

std::string PnicNotFound(const std::string& name) {
  return "Pnic with name " + name + " not found";
}

bool SelectNics(HostCtl::Network::NetworkInfo& info, const Fabrik::CallSpec::Input& input,
                const std::string& param, NotFoundText notFound, Fabrik::CallSpec::Output& output,
                std::vector<std::unique_ptr<Pnic>>& nics) {
  if (!input.HasParameter(param)) {
    nics = info.GetPnics(HostCtl::Network::PnicGetAll);
    return true;
  }
  std::unique_ptr<Pnic> nic = FindNic(info, input, param, notFound, output);
  if (!nic)
    return false;
  nics.push_back(std::move(nic));
  return true;
}

bool SelectNicList(HostCtl::Network::NetworkInfo& info, const Fabrik::CallSpec::Input& input,
                   const std::string& param, NotFoundText notFound,
                   Fabrik::CallSpec::Output& output, std::vector<std::unique_ptr<Pnic>>& nics) {
  if (!input.HasParameter(param)) {
    nics = info.GetPnics(HostCtl::Network::PnicGetAll);
    return true;
  }
  std::vector<std::string> names;
  input.GetParameterList(param, names);
  for (const std::string& name : names) {
    std::unique_ptr<Pnic> nic = info.GetPnicByName(name);
    if (!nic) {
      output.AddErrorMessage(notFound(name));
      return false;
    }
    nics.push_back(std::move(nic));
  }
  return true;
}

std::unique_ptr<Pnic> FindNic(HostCtl::Network::NetworkInfo& info,
                              const Fabrik::CallSpec::Input& input, const std::string& param,
                              NotFoundText notFound, Fabrik::CallSpec::Output& output) {
  const std::string& name = input.GetParameter(param);
  std::unique_ptr<Pnic> nic = info.GetPnicByName(name);
  if (!nic)
    output.AddErrorMessage(notFound(name));
  return nic;
}

std::string Hex(uint64_t value, int width) {
  return HostCtl::Misc::StrPrintf("%0*llx", width, static_cast<unsigned long long>(value));
}

} // namespace CorvexCli::NetworkNamespace::NicHw
