//===- Dcb.cpp - DCB status of a physical NIC -----------------------------===//
//
// network nic dcb status get: one nested structure built from the NIC's DCB
// information object. The nested structures' fields are tables so that the
// template and the filling walk the same rows.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/DcbInfoImpl.h"
#include "common/DcbFormat.h"
#include "nic/HwCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::DcbClassArray;
using HostCtl::Network::DcbIeeeEtsConfig;
using HostCtl::Network::DcbIeeePfcConfig;

namespace {

const std::string kNicName = "nic-name";

const std::string kStatusStruct = "DCBStatus";
const std::string kNicNameField = "Nic Name";
const std::string kMode = "Mode";
const std::string kEnabled = "Enabled";
const std::string kCapabilities = "Capabilities";
const std::string kPfcEnabled = "PFC Enabled";
const std::string kPfcConfiguration = "PFC Configuration";
const std::string kIeeePfc = "IEEE PFC Configuration";
const std::string kIeeeEts = "IEEE ETS Configuration";
const std::string kApps = "DCB Apps";

const std::string kCapsStruct = "DcbCapabilities";
const std::string kPriorityGroup = "Priority Group";
const std::string kPriorityFlowControl = "Priority Flow Control";
const std::string kUpToTcMap = "UP to TC Map";
const std::string kPgTrafficClasses = "PG Traffic Classes";
const std::string kPfcTrafficClasses = "PFC Traffic Classes";

const std::string kEtsStruct = "DcbIeeeEtsConfig";
const std::string kWilling = "Willing Bit In ETS Config TLV";
const std::string kSupportedCapacity = "Supported Capacity";
const std::string kCreditBasedShaper = "Credit Based Shaper ETS Algorithm Supported";
const std::string kTxBandwidth = "TX Bandwidth Per TC";
const std::string kRxBandwidth = "RX Bandwidth Per TC";
const std::string kTsaTable = "TSA Assignment Table Per TC";
const std::string kPriorityAssignment = "Priority Assignment Per TC";
const std::string kRecommendedBandwidth = "Recommended TC Bandwidth Per TC";
const std::string kRecommendedBandwith = "Recommended TC Bandwith Per TC";
const std::string kRecommendedTsa = "Recommended TSA Assignment Per TC";
const std::string kRecommendedPriority = "Recommended Priority Assignment Per TC";

const std::string kPfcStruct = "DcbIeeePfcConfig";
const std::string kTrafficClasses = "Number Of Traffic Classes";
const std::string kMacsecBypass = "Macsec Bypass Capability Is Enabled";
const std::string kDelay = "Round Trip Propagation Delay Of Link";
const std::string kSentFrames = "Sent PFC Frames";
const std::string kReceivedFrames = "Received PFC Frames";

const std::string kAppsStruct = "DcbApps";
const std::string kAppType = "App Type";
const std::string kProtocolId = "Protocol ID";
const std::string kUserPriority = "User Priority";

/// A per-class array field of the ETS structure.
struct EtsArray {
  const std::string& field;                ///< Result field.
  DcbClassArray DcbIeeeEtsConfig::*member; ///< Record array.
};

const EtsArray kEtsArrays[] = {
    {kTxBandwidth, &DcbIeeeEtsConfig::txBandwidth},
    {kRxBandwidth, &DcbIeeeEtsConfig::rxBandwidth},
    {kTsaTable, &DcbIeeeEtsConfig::tsaTable},
    {kPriorityAssignment, &DcbIeeeEtsConfig::priorityAssignment},
    {kRecommendedBandwidth, &DcbIeeeEtsConfig::recommendedBandwidth},
    {kRecommendedBandwith, &DcbIeeeEtsConfig::recommendedBandwidth},
    {kRecommendedTsa, &DcbIeeeEtsConfig::recommendedTsa},
    {kRecommendedPriority, &DcbIeeeEtsConfig::recommendedPriority},
};

const ParameterDef kParams[] = {
    {kNicName, "n", Fabrik::CallSpec::String, true,
     "The name of the NIC for which you need the info. See \"nic list\" command."}};

const std::string* const kStatusDisplay[] = {&kNicNameField, &kMode,       &kEnabled,
                                             &kCapabilities, &kPfcEnabled, &kPfcConfiguration,
                                             &kIeeeEts,      &kIeeePfc,    &kApps};
const std::string* const kCapsDisplay[] = {&kPriorityGroup, &kPriorityFlowControl,
                                           &kPgTrafficClasses, &kPfcTrafficClasses};
const std::string* const kEtsDisplay[] = {
    &kWilling,        &kSupportedCapacity,  &kCreditBasedShaper,  &kTxBandwidth,
    &kRxBandwidth,    &kTsaTable,           &kPriorityAssignment, &kRecommendedBandwidth,
    &kRecommendedTsa, &kRecommendedPriority};
const std::string* const kPfcDisplay[] = {&kTrafficClasses, &kPfcConfiguration, &kMacsecBypass,
                                          &kDelay,          &kSentFrames,       &kReceivedFrames};
const std::string* const kAppsFields[] = {&kAppType, &kProtocolId, &kUserPriority};

std::shared_ptr<MetaStruct> CapsStructure() {
  auto structure = MetaStruct::New(kCapsStruct);
  structure->SetField(kPriorityGroup, MetaBool::New());
  structure->SetField(kPriorityFlowControl, MetaBool::New());
  structure->SetField(kUpToTcMap, MetaBool::New());
  structure->SetField(kPgTrafficClasses, MetaInt::New());
  structure->SetField(kPfcTrafficClasses, MetaInt::New());
  return structure;
}

std::shared_ptr<MetaStruct> PfcStructure() {
  auto structure = MetaStruct::New(kPfcStruct);
  structure->SetField(kTrafficClasses, MetaInt::New());
  structure->SetField(kPfcConfiguration, MetaString::New());
  structure->SetField(kMacsecBypass, MetaInt::New());
  structure->SetField(kDelay, MetaInt::New());
  structure->SetField(kSentFrames, MetaString::New());
  structure->SetField(kReceivedFrames, MetaString::New());
  return structure;
}

std::shared_ptr<MetaStruct> EtsStructure() {
  auto structure = MetaStruct::New(kEtsStruct);
  structure->SetField(kWilling, MetaInt::New());
  structure->SetField(kSupportedCapacity, MetaInt::New());
  structure->SetField(kCreditBasedShaper, MetaString::New());
  for (const EtsArray& array : kEtsArrays)
    structure->SetField(array.field, MetaString::New());
  return structure;
}

std::shared_ptr<MetaStruct> AppsStructure() {
  return NicHw::StringStructure(kAppsStruct, kAppsFields);
}

} // namespace

// network nic dcb status get

CORVEX_DEFINE_MAKE_SHARED(NicDcbStatusGet)

NicDcbStatusGet::NicDcbStatusGet() {
  SetDescription("Get the DCB information for a NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:" + kStatusStruct, NicHw::JoinFields(kStatusDisplay));
  SetDefaultOutputParameter("fields:" + kEtsStruct, NicHw::JoinFields(kEtsDisplay));
  SetDefaultOutputParameter("fields:" + kPfcStruct, NicHw::JoinFields(kPfcDisplay));
  SetDefaultOutputParameter("fields:" + kAppsStruct, NicHw::JoinFields(kAppsFields));
  SetDefaultOutputParameter("fields:" + kCapsStruct, NicHw::JoinFields(kCapsDisplay));
}

NicDcbStatusGet::~NicDcbStatusGet() = default;

std::shared_ptr<InputSpec> NicDcbStatusGet::GetInputSpecInternal() {
  return MakeInputSpec(kParams);
}

std::shared_ptr<MetaStruct> NicDcbStatusGet::GetOutputStructure() {
  auto structure = MetaStruct::New(kStatusStruct);
  structure->SetField(kNicNameField, MetaString::New());
  structure->SetField(kMode, MetaString::New());
  structure->SetField(kEnabled, MetaBool::New());
  structure->SetField(kCapabilities, CapsStructure());
  structure->SetField(kPfcEnabled, MetaBool::New());
  structure->SetField(kPfcConfiguration, MetaString::New());
  structure->SetField(kIeeePfc, PfcStructure());
  structure->SetField(kIeeeEts, EtsStructure());
  structure->SetField(kApps, MetaList::New(Fabrik::MetaObj::Struct, AppsStructure()));
  return structure;
}

std::shared_ptr<OutputSpec> NicDcbStatusGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void NicDcbStatusGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    const std::string& name = input->GetParameter(kNicName);
    TvkCtl::Network::DcbInfoImpl dcb(name);
    auto status = GetOutputStructure();
    status->SetField(kNicNameField, name);
    status->SetField(kMode, DcbModeToString(dcb.GetMode()));
    status->SetField(kEnabled, dcb.IsEnabled());

    HostCtl::Network::DcbCapabilities caps = dcb.GetCapabilities();
    auto capabilities = CapsStructure();
    capabilities->SetField(kPriorityGroup, caps.priorityGroup);
    capabilities->SetField(kPriorityFlowControl, caps.priorityFlowControl);
    capabilities->SetField(kUpToTcMap, caps.upToTcMap);
    capabilities->SetField(kPgTrafficClasses, static_cast<long>(caps.pgTrafficClasses));
    capabilities->SetField(kPfcTrafficClasses, static_cast<long>(caps.pfcTrafficClasses));
    status->SetField(kCapabilities, capabilities);

    status->SetField(kPfcEnabled, dcb.IsPfcEnabled());
    status->SetField(kPfcConfiguration, DcbIntMaskToString(dcb.GetPfcConfig()));

    DcbIeeeEtsConfig etsConfig = dcb.GetIeeeEtsConfig();
    auto ets = EtsStructure();
    ets->SetField(kWilling, static_cast<long>(etsConfig.willing));
    ets->SetField(kSupportedCapacity, static_cast<long>(etsConfig.supportedCapacity));
    ets->SetField(kCreditBasedShaper, etsConfig.creditBasedShaper);
    for (const EtsArray& array : kEtsArrays)
      ets->SetField(array.field, DcbArrayToString(etsConfig.*array.member));

    DcbIeeePfcConfig pfcConfig = dcb.GetIeeePfcConfig();
    auto pfc = PfcStructure();
    pfc->SetField(kTrafficClasses, static_cast<long>(pfcConfig.trafficClasses));
    pfc->SetField(kPfcConfiguration, DcbIntMaskToString(pfcConfig.mask));
    pfc->SetField(kMacsecBypass, static_cast<long>(pfcConfig.macsecBypass));
    pfc->SetField(kDelay, static_cast<long>(pfcConfig.delay));
    pfc->SetField(kSentFrames, DcbArrayToString(pfcConfig.sentFrames));
    pfc->SetField(kReceivedFrames, DcbArrayToString(pfcConfig.receivedFrames));
    status->SetField(kIeeePfc, pfc);
    status->SetField(kIeeeEts, ets);

    std::vector<HostCtl::Network::DcbAppInfo> entries = dcb.GetAppInfo();
    auto apps = MetaList::New(Fabrik::MetaObj::Struct, AppsStructure());
    apps->Reserve(entries.size());
    for (const HostCtl::Network::DcbAppInfo& entry : entries) {
      auto app = AppsStructure();
      app->SetField(kAppType, entry.appType);
      app->SetField(kProtocolId, entry.protocolId);
      app->SetField(kUserPriority, entry.userPriority);
      apps->Add(app);
    }
    status->SetField(kApps, apps);
    output->SetRootObject(status);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
