//===- HwCap.cpp - Hardware capabilities of physical NICs -----------------===//
//
// network nic hwCap supported|activated list. The twins differ only in the
// capability mask they read and the name of their second field: one table
// row each.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/PnicImpl.h"
#include "nic/HwCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Pnic;
using HostCtl::Network::PnicHwCapabilities;

namespace {

const std::string kVmnic = "vmnic";
const std::string kSettingsStruct = "Settings";
const std::string kNic = "NIC";
const std::string kSupportedField = "Device Hardware Cap Supported";
const std::string kActivatedField = "Device Hardware Cap Activated";
const std::string kNotAvailable = "N/A";
const std::string kCapSeparator = "   ";

/// Highest capability bit that the lists examine.
constexpr int kLastListedBit = 30;

const ParameterDef kParams[] = {
    {kVmnic, "n", Fabrik::CallSpec::StringList, false,
     "Limit the output to only the physical NICS with the specified names."}};

/// One of the twin lists.
struct CapList {
  const std::string& field;           ///< Second result field.
  uint64_t PnicHwCapabilities::*mask; ///< Mask it reads.
  const std::string* fields[2];       ///< Result fields.
};

const CapList kSupported = {
    kSupportedField, &PnicHwCapabilities::supported, {&kNic, &kSupportedField}};
const CapList kActivated = {
    kActivatedField, &PnicHwCapabilities::activated, {&kNic, &kActivatedField}};

std::string CantFindPnic(const std::string& name) {
  return "Can't find PNIC with name " + name;
}

std::string CapName(int bit) {
  return TvkCtl::Network::PnicImpl::GetHwCapName(bit);
}

void CapListExecute(const CapList& kind, const Input& input, Output& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    auto list = MetaList::New(Fabrik::MetaObj::Struct,
                              NicHw::StringStructure(kSettingsStruct, kind.fields));
    std::vector<std::unique_ptr<Pnic>> nics;
    if (!NicHw::SelectNicList(*info, input, kVmnic, CantFindPnic, output, nics))
      return;
    list->Reserve(nics.size());
    for (const std::unique_ptr<Pnic>& nic : nics) {
      if (!nic)
        continue;
      auto row = NicHw::StringStructure(kSettingsStruct, kind.fields);
      row->SetField(kNic, nic->GetName());
      std::string text;
      try {
        PnicHwCapabilities caps{};
        nic->GetHwCapabilities(caps);
        text = HwCapText(caps.*kind.mask, CapName);
      } catch (const HostCtlException&) {
        text = kNotAvailable;
      }
      row->SetField(kind.field, text);
      list->Add(row);
    }
    output.SetRootObject(list);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

std::string HwCapText(uint64_t mask, std::string (*name)(int bit)) {
  std::string text;
  for (int bit = 0; bit <= kLastListedBit; ++bit)
    if (mask & (uint64_t{1} << bit))
      text += name(bit) + kCapSeparator;
  return text;
}

#define CORVEX_HWCAP_LIST(Class, Kind, Description)                                                \
  CORVEX_DEFINE_MAKE_SHARED(Class)                                                                 \
  Class::Class() {                                                                                 \
    SetDescription(Description);                                                                   \
    SetDefaultOutputFormatter("table");                                                            \
    SetDefaultOutputParameter("fields:" + kSettingsStruct, NicHw::JoinFields(Kind.fields));        \
  }                                                                                                \
  Class::~Class() = default;                                                                       \
  std::shared_ptr<InputSpec> Class::GetInputSpecInternal() {                                       \
    return MakeInputSpec(kParams);                                                                 \
  }                                                                                                \
  std::shared_ptr<MetaStruct> Class::GetOutputStructure() {                                        \
    return NicHw::StringStructure(kSettingsStruct, Kind.fields);                                   \
  }                                                                                                \
  std::shared_ptr<OutputSpec> Class::GetOutputSpecInternal() {                                     \
    return ListResultSpec(GetOutputStructure());                                                   \
  }                                                                                                \
  void Class::ExecuteInternal(const std::shared_ptr<Input>& input,                                 \
                              const std::shared_ptr<Output>& output) {                             \
    CapListExecute(Kind, *input, *output);                                                         \
  }

CORVEX_HWCAP_LIST(NicHwCapSupportedList, kSupported,
                  "List supported hardware capabilities of physical NICs.")
CORVEX_HWCAP_LIST(NicHwCapActivatedList, kActivated,
                  "List activated hardware capabilities of physical NICs.")

} // namespace CorvexCli::NetworkNamespace
