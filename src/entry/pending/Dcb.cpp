//===- Dcb.cpp - Interim DCB status command -------------------------------===//
//
// Interim definitions of the commands of the Dcb family: DCB status. Each
// command is a complete node of the tree, with its description, default output
// settings and result schema, but running it only reports that it is not
// available yet. src/nic/Dcb.cpp replaces this file.
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "entry/pending/Pending.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;

namespace {

/// The "Capabilities" structure of `network nic dcb status get`.
std::shared_ptr<MetaStruct> DcbCapabilitiesStructure() {
  auto structure = MetaStruct::New("DcbCapabilities");
  structure->SetField("Priority Group", MetaBool::New());
  structure->SetField("Priority Flow Control", MetaBool::New());
  structure->SetField("UP to TC Map", MetaBool::New());
  structure->SetField("PG Traffic Classes", MetaInt::New());
  structure->SetField("PFC Traffic Classes", MetaInt::New());
  return structure;
}

/// The "IEEE PFC Configuration" structure of `network nic dcb status get`.
std::shared_ptr<MetaStruct> DcbIeeePfcConfigStructure() {
  auto structure = MetaStruct::New("DcbIeeePfcConfig");
  structure->SetField("Number Of Traffic Classes", MetaInt::New());
  structure->SetField("PFC Configuration", MetaString::New());
  structure->SetField("Macsec Bypass Capability Is Enabled", MetaInt::New());
  structure->SetField("Round Trip Propagation Delay Of Link", MetaInt::New());
  structure->SetField("Sent PFC Frames", MetaString::New());
  structure->SetField("Received PFC Frames", MetaString::New());
  return structure;
}

/// The "IEEE ETS Configuration" structure of `network nic dcb status get`.
std::shared_ptr<MetaStruct> DcbIeeeEtsConfigStructure() {
  auto structure = MetaStruct::New("DcbIeeeEtsConfig");
  structure->SetField("Willing Bit In ETS Config TLV", MetaInt::New());
  structure->SetField("Supported Capacity", MetaInt::New());
  structure->SetField("Credit Based Shaper ETS Algorithm Supported", MetaString::New());
  structure->SetField("TX Bandwidth Per TC", MetaString::New());
  structure->SetField("RX Bandwidth Per TC", MetaString::New());
  structure->SetField("TSA Assignment Table Per TC", MetaString::New());
  structure->SetField("Priority Assignment Per TC", MetaString::New());
  structure->SetField("Recommended TC Bandwidth Per TC", MetaString::New());
  structure->SetField("Recommended TC Bandwith Per TC", MetaString::New());
  structure->SetField("Recommended TSA Assignment Per TC", MetaString::New());
  structure->SetField("Recommended Priority Assignment Per TC", MetaString::New());
  return structure;
}

/// One entry of the "DCB Apps" list of `network nic dcb status get`.
std::shared_ptr<MetaStruct> DcbAppsStructure() {
  auto structure = MetaStruct::New("DcbApps");
  structure->SetField("App Type", MetaString::New());
  structure->SetField("Protocol ID", MetaString::New());
  structure->SetField("User Priority", MetaString::New());
  return structure;
}

} // namespace

// network nic dcb status get

CORVEX_DEFINE_MAKE_SHARED(NicDcbStatusGet)

NicDcbStatusGet::NicDcbStatusGet() {
  SetDescription("Get the DCB information for a NIC.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("fields:DCBStatus",
                            "Nic Name,Mode,Enabled,Capabilities,PFC Enabled,PFC Configuration,IEEE "
                            "ETS Configuration,IEEE PFC Configuration,DCB Apps");
  SetDefaultOutputParameter(
      "fields:DcbIeeeEtsConfig",
      "Willing Bit In ETS Config TLV,Supported Capacity,Credit Based Shaper ETS Algorithm "
      "Supported,TX Bandwidth Per TC,RX Bandwidth Per TC,TSA Assignment Table Per TC,Priority "
      "Assignment Per TC,Recommended TC Bandwidth Per TC,Recommended TSA Assignment Per "
      "TC,Recommended Priority Assignment Per TC");
  SetDefaultOutputParameter(
      "fields:DcbIeeePfcConfig",
      "Number Of Traffic Classes,PFC Configuration,Macsec Bypass Capability Is Enabled,Round Trip "
      "Propagation Delay Of Link,Sent PFC Frames,Received PFC Frames");
  SetDefaultOutputParameter("fields:DcbApps", "App Type,Protocol ID,User Priority");
  SetDefaultOutputParameter(
      "fields:DcbCapabilities",
      "Priority Group,Priority Flow Control,PG Traffic Classes,PFC Traffic Classes");
}

CORVEX_PENDING_OPERATIONS(NicDcbStatusGet)

std::shared_ptr<MetaStruct> NicDcbStatusGet::GetOutputStructure() {
  auto structure = MetaStruct::New("DCBStatus");
  structure->SetField("Nic Name", MetaString::New());
  structure->SetField("Mode", MetaString::New());
  structure->SetField("Enabled", MetaBool::New());
  structure->SetField("Capabilities", DcbCapabilitiesStructure());
  structure->SetField("PFC Enabled", MetaBool::New());
  structure->SetField("PFC Configuration", MetaString::New());
  structure->SetField("IEEE PFC Configuration", DcbIeeePfcConfigStructure());
  structure->SetField("IEEE ETS Configuration", DcbIeeeEtsConfigStructure());
  structure->SetField("DCB Apps", MetaList::New(Fabrik::MetaObj::Struct, DcbAppsStructure()));
  return structure;
}

std::shared_ptr<OutputSpec> NicDcbStatusGet::GetOutputSpecInternal() {
  auto spec = OutputSpec::New();
  spec->SetRootObject(GetOutputStructure());
  return spec;
}

} // namespace CorvexCli::NetworkNamespace
