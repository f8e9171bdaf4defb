//===- NicInfo.cpp - NIC information, link state and negotiation ----------===//
//
// network nic get, set, up, down and negotiate restart: the generic
// configuration of one physical NIC, the settings that `set` changes, its
// administrative state and the restart of its link negotiation.
//
//===----------------------------------------------------------------------===//
#include "nic.h"
#include "nic/NicText.h"

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicRecords.h"
#include "HostCtl/SmartNic.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "common/FieldTable.h"
#include "common/IntFit.h"
#include "common/ParameterTable.h"

#include <cstring>
#include <iterator>
#include <limits>
#include <vector>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::PnicInfo;

namespace {

// Parameter names.
const std::string kNicName = "nic-name";
const std::string kPort = "port";
const std::string kPhyAddress = "phy-address";
const std::string kVirtualAddress = "virtual-address";
const std::string kTransceiverType = "transceiver-type";
const std::string kWakeOnLan = "wake-on-lan";
const std::string kMessageLevel = "message-level";
const std::string kSpeed = "speed";
const std::string kDuplex = "duplex";
const std::string kAuto = "auto";
const std::string kVmnic = "vmnic";
const std::string kNicNameDescription = "The name of the NIC to configured. This must be one of "
                                        "the cards listed in the nic list command.";
const std::string kNoPnic = "There is no pnic with name ";

// Result structures and fields of `network nic get`.
const std::string kNicInfo = "NICInfo";
const std::string kName = "Name";
const std::string kSupportedPorts = "Supported Ports";
const std::string kSupportsAutoNegotiation = "Supports Auto Negotiation";
const std::string kAdvertisedLinkModes = "Advertised Link Modes";
const std::string kAdvertisedAutoNegotiation = "Advertised Auto Negotiation";
const std::string kCableType = "Cable Type";
/// The record's PHY address and message level are unsigned 32-bit numbers.
/// Below 1 a PHY address is -1 (left as it is) or refused.
const IntFit kSetFits[] = {{kPhyAddress, 1, kUint32Max}, {kMessageLevel, 0, kUint32Max}};

const std::string kPhyAddressField = "PHY Address";
const std::string kVirtualAddressField = "Virtual Address";
const std::string kTransceiver = "Transceiver";
const std::string kAutoNegotiation = "Auto Negotiation";
const std::string kSupportsWakeon = "Supports Wakeon";
const std::string kWakeon = "Wakeon";
const std::string kCurrentMessageLevel = "Current Message Level";
const std::string kLinkDetected = "Link Detected";
const std::string kSupportsPause = "Supports Pause";
const std::string kPauseAutonegotiate = "Pause Autonegotiate";
const std::string kPauseRx = "Pause RX";
const std::string kPauseTx = "Pause TX";
const std::string kLinkStatus = "Link Status";
const std::string kDriverInfo = "Driver Info";
const std::string kBackingDpuId = "Backing DPU Id";
const std::string kNicDriverInfo = "NICDriverInfo";
const std::string kDriver = "Driver";
const std::string kVersion = "Version";
const std::string kFirmwareVersion = "Firmware Version";
const std::string kBusInfo = "Bus Info";

/// The fields of "NICInfo" before "Driver Info", in order.
const FieldDef kNicInfoFields[] = {
    {kName, FieldKind::String},
    {kSupportedPorts, FieldKind::StringList},
    {kSupportsAutoNegotiation, FieldKind::Boolean},
    {kAdvertisedLinkModes, FieldKind::StringList},
    {kAdvertisedAutoNegotiation, FieldKind::Boolean},
    {kCableType, FieldKind::String},
    {kPhyAddressField, FieldKind::Integer},
    {kVirtualAddressField, FieldKind::String},
    {kTransceiver, FieldKind::String},
    {kAutoNegotiation, FieldKind::Boolean},
    {kSupportsWakeon, FieldKind::Boolean},
    {kWakeon, FieldKind::StringList},
    {kCurrentMessageLevel, FieldKind::Integer},
    {kLinkDetected, FieldKind::Boolean},
    {kSupportsPause, FieldKind::Boolean},
    {kPauseAutonegotiate, FieldKind::Boolean},
    {kPauseRx, FieldKind::Boolean},
    {kPauseTx, FieldKind::Boolean},
    {kLinkStatus, FieldKind::String},
};

// Code tables of the NIC information record.
const char* const kPortTexts[] = {"TP", "AUI", "BNC", "MII", "FIBRE", "DA", "BACKPLANE"};
const char* const kCableTexts[] = {"Twisted Pair", "AUI", "BNC", "MII", "FIBRE", "DA", "BACKPLANE"};
const char* const kMediaTexts[] = {
    "None",    "Unknown", "BaseT",     "BaseX",    "BaseKX",     "BaseSX",         "BaseLX",
    "BaseKR",  "BaseLR",  "BaseSR",    "BaseER",   "BaseTwinax", "BaseTwinaxLong", "BaseLRM",
    "BaseCR1", "BaseKR2", "BaseMLD2",  "BaseKR4",  "BaseKX4",    "BaseCR4",        "BaseSR4",
    "BaseLR4", "BaseR4",  "BaseSGMII", "BaseSFI",  "XLPPI",      "BaseCX-SGMII",   "BaseDR4",
    "BaseFR4", "AUI-8",   "AUI-4",     "BaseSR16", "BaseFR8",    "BaseLR8",        "AUI-16",
    "BaseER4", "BaseER8", "BaseCX4",   "BaseCR2"};
const char* const kDuplexTexts[] = {"Auto", "Full", "Half"};
const char* const kWakeOnTexts[] = {
    "PHY Activity",
    "Unicast Messagess",
    "Multicast Messages",
    "Broadcast Messages",
    "ARP",
    "MagicPacket(tm)",
    "Enable SecureOn(tm) Password for                            MagicPacket(tm)",
    "Unsupported",
    "Disabled"};

template <std::size_t N>
std::string FromTable(const char* const (&table)[N], uint32_t code, const char* other) {
  return code < N ? table[code] : other;
}

const EnumChoice kPortValues[] = {
    {"tp", "Select TP (Twisted Pair) as the device port"},
    {"aui", "Select AUI (Attachment Unit Interface) as the device port"},
    {"bnc", "Select BNC (Bayonet Neill-Concelman) as the device port"},
    {"mii", "Select MII (Media Independent Interface) as the device port"},
    {"fibre", "Select fibre as the device port"},
    {"da", "Select DA (Direct Attach copper) as the device port"},
    {"backplane", "Select Backplane as the device port"},
};
const EnumChoice kTransceiverValues[] = {
    {"internal", "Set the transceiver type to internal"},
    {"external", "Set the transceiver type to external"},
};
const EnumChoice kDuplexValues[] = {
    {"full", "Set this nic to full duplex"},
    {"half", "Set this nic to half duplex"},
};
const long kSpeeds[] = {10,    100,   1000,  2500,  5000,  10000,  20000,  25000,
                        37500, 40000, 50000, 56000, 75000, 100000, 200000, 400000};
/// Wake-on letters in the order of their codes.
const char kWakeOnLetters[] = "pumbags";

/// The parameters of `network nic set`.
const ParameterDef kSetParameters[] = {
    {kNicName, "n", CallSpec::String, true, kNicNameDescription},
    {kPort, "p", CallSpec::String, false,
     "Selects device port. Available device ports are %FULLENUM%",
     ParameterCheck::OneOf(kPortValues)},
    {kPhyAddress, "P", CallSpec::Integer, false, "Set the PHY address of the device"},
    {kVirtualAddress, "V", CallSpec::String, false, "Set the virtual address of the device"},
    {kTransceiverType, "t", CallSpec::String, false,
     "Selects transeiver type. Currently only internal and external can be specified, in the "
     "future future types might be added. Available transeiver types are %FULLENUM%",
     ParameterCheck::OneOf(kTransceiverValues)},
    {kWakeOnLan, "w", CallSpec::String, false,
     "Sets Wake-on-LAN options. Not all devices support this. The argument to this option is a "
     "string of characters specifying which options to enable. \np Wake on phy activity\nu Wake "
     "on unicast messages\nm Wake on multicast messages\nb Wake on broadcast messages\na Wake on "
     "ARP\ng Wake on MagicPacket(tm)\ns Enable SecureOn(tm) password for MagicPacket(tm)\n",
     ParameterCheck::Matching("[pumbagsd]+")},
    {kMessageLevel, "l", CallSpec::Integer, false,
     "Sets the driver message level. Meaning differ per driver."},
    {kSpeed, "S", CallSpec::Integer, false,
     "The speed to set this NIC to, in Mbps. Acceptable values are: %ENUM%",
     ParameterCheck::OneOfIntegers(kSpeeds)},
    {kDuplex, "D", CallSpec::String, false,
     "The duplex to set this NIC to. Acceptable values are: %ENUM%",
     ParameterCheck::OneOf(kDuplexValues)},
    {kAuto, "a", CallSpec::Flag, false, "Set the speed and duplexity settings to autonegotiate."},
};

/// The one parameter of the commands that act on one NIC.
const ParameterDef kNicNameParameters[] = {
    {kNicName, "n", CallSpec::String, true, kNicNameDescription},
};
/// Looks the NIC up; adds "There is no pnic with name " and the name when it
/// is missing.
std::unique_ptr<HostCtl::Network::Pnic> FindPnic(TvkCtl::Network::NetworkInfoImpl& info,
                                                 const std::string& name,
                                                 const std::shared_ptr<CallSpec::Output>& output) {
  std::unique_ptr<HostCtl::Network::Pnic> nic = info.GetPnicByName(name);
  if (!nic)
    output->AddErrorMessage(kNoPnic + name);
  return nic;
}

/// network nic up and down: sets the administrative status.
void SetAdminStatus(const std::shared_ptr<CallSpec::Input>& input,
                    const std::shared_ptr<CallSpec::Output>& output, bool up) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    const std::string& name = input->GetParameter(kNicName);
    std::unique_ptr<HostCtl::Network::Pnic> nic = FindPnic(info, name, output);
    if (!nic)
      return;
    nic->SetAdminStatus(up);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace

std::string PortToString(uint32_t code) {
  return FromTable(kPortTexts, code, "UNKNOWN");
}

std::string CableTypeToString(uint32_t code) {
  return FromTable(kCableTexts, code, "");
}

std::string WakeOnToString(uint32_t code) {
  return FromTable(kWakeOnTexts, code, "None");
}

std::string LinkModeToString(const HostCtl::Network::PnicLinkMode& mode) {
  if (mode.speed == 0)
    return "Auto";
  return std::to_string(mode.speed) + FromTable(kMediaTexts, mode.media, "Unknown") + "/" +
         FromTable(kDuplexTexts, mode.duplex, "");
}

// network nic get

CORVEX_DEFINE_NEW(NicGet)

NicGet::NicGet() {
  SetDescription("Get the generic configuration of a network device");
  SetDefaultOutputFormatter("simple");
}

NicGet::~NicGet() = default;

std::shared_ptr<MetaObj::MetaStruct> NicGet::GetDriverInfoStructure() {
  return MakeStructure(kNicDriverInfo, {{kDriver, FieldKind::String},
                                        {kVersion, FieldKind::String},
                                        {kFirmwareVersion, FieldKind::String},
                                        {kBusInfo, FieldKind::String}});
}

std::shared_ptr<MetaObj::MetaStruct> NicGet::GetOutputStructure() {
  auto structure = MakeStructure(kNicInfo, kNicInfoFields);
  structure->SetField(kDriverInfo, GetDriverInfoStructure());
  structure->SetField(kBackingDpuId, MetaObj::MetaString::New());
  return structure;
}

std::shared_ptr<CallSpec::InputSpec> NicGet::GetInputSpecInternal() {
  return MakeInputSpec(kNicNameParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void NicGet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                             const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    const std::string& name = input->GetParameter(kNicName);
    std::unique_ptr<HostCtl::Network::Pnic> nic = FindPnic(info, name, output);
    if (!nic)
      return;
    auto result = GetOutputStructure();
    PnicInfo record{};
    HostCtl::Network::PnicPauseParams pause{};
    HostCtl::Network::PnicDriverInfo driver{};
    nic->GetPnicInfo(record, 0, 0);
    nic->GetPauseParams(pause);
    nic->GetDriverInfo(driver);

    result->SetField(kName, name);
    std::vector<std::string> ports;
    for (uint32_t code : record.supportedPorts)
      ports.push_back(PortToString(code));
    result->SetField(kSupportedPorts, ports);
    result->SetField(kSupportsAutoNegotiation, record.supportsAutoNegotiation);
    std::vector<std::string> modes;
    for (const HostCtl::Network::PnicLinkMode& mode : record.advertisedModes)
      modes.push_back(LinkModeToString(mode));
    result->SetField(kAdvertisedLinkModes, modes);
    result->SetField(kAdvertisedAutoNegotiation, record.advertisedAutoNegotiation);
    result->SetField(kCableType, CableTypeToString(record.port));
    result->SetField(kPhyAddressField, static_cast<long>(record.phyAddress));
    result->SetField(kVirtualAddressField, record.virtualAddress);
    result->SetField(kTransceiver, record.transceiver == 0   ? "internal"
                                   : record.transceiver == 1 ? "external"
                                                             : "");
    result->SetField(kAutoNegotiation, record.autoNegotiation);
    std::vector<std::string> wakeOn;
    if (!record.supportsWakeOn) {
      wakeOn.push_back("None");
    } else {
      for (uint32_t code : record.wakeOn)
        wakeOn.push_back(WakeOnToString(code));
    }
    result->SetField(kWakeon, wakeOn);
    result->SetField(kSupportsWakeon, record.supportsWakeOn);
    result->SetField(kLinkStatus, record.linkStatus);
    result->SetField(kCurrentMessageLevel,
                     record.messageLevelSupported ? static_cast<long>(record.messageLevel) : -1L);
    result->SetField(kLinkDetected, nic->IsLinkUp());
    result->SetField(kSupportsPause, pause.supported);
    if (pause.supported) {
      result->SetField(kPauseAutonegotiate, pause.autoNegotiation);
      result->SetField(kPauseRx, pause.rx);
      result->SetField(kPauseTx, pause.tx);
    }
    auto driverInfo = GetDriverInfoStructure();
    driverInfo->SetField(kDriver, driver.driver);
    driverInfo->SetField(kVersion, driver.version);
    driverInfo->SetField(kFirmwareVersion, driver.firmwareVersion);
    driverInfo->SetField(kBusInfo, driver.busInfo);
    result->SetField(kDriverInfo, driverInfo);
    std::string dpu = "N/A";
    if (auto smartNic = HostCtl::SmartNic::SmartNicInfo::GetSmartNicByPnic(name))
      dpu = smartNic->GetId();
    result->SetField(kBackingDpuId, dpu);
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic set

CORVEX_DEFINE_NEW(NicSet)

NicSet::NicSet() {
  SetDescription("Set the general options for the specified ethernet device.");
}

NicSet::~NicSet() = default;

std::shared_ptr<CallSpec::InputSpec> NicSet::GetInputSpecInternal() {
  return MakeInputSpec(kSetParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

bool NicSet::GetInfoFromParam(const std::shared_ptr<CallSpec::Input>& input, PnicInfo& info) {
  bool changed = false;
  if (input->HasParameter(kPort)) {
    const std::string& value = input->GetParameter(kPort);
    uint32_t code = 0;
    while (code < std::size(kPortValues) && value != kPortValues[code].value.View())
      ++code;
    if (code != info.port) {
      info.port = code;
      info.portChanged = true;
      changed = true;
    } else {
      changed = false;
    }
  }
  if (input->HasParameter(kPhyAddress)) {
    long phy = input->GetParameterInt(kPhyAddress);
    if (phy >= 1) {
      RequireFit(*input, std::span(kSetFits, 1));
      if (static_cast<uint32_t>(phy) != info.phyAddress) {
        info.phyAddress = static_cast<uint32_t>(phy);
        info.phyAddressChanged = true;
        changed = true;
      }
    } else if (phy != -1) {
      throw HostCtlException("Invalid PHY address value.");
    }
  }
  if (input->HasParameter(kVirtualAddress)) {
    const std::string& address = input->GetParameter(kVirtualAddress);
    if (address != info.virtualAddress) {
      info.virtualAddress = address;
      info.virtualAddressChanged = true;
      changed = true;
    }
  }
  if (input->HasParameter(kTransceiverType)) {
    uint32_t code = input->GetParameter(kTransceiverType) == "external" ? 1 : 0;
    if (code != info.transceiver) {
      info.transceiver = code;
      info.transceiverChanged = true;
      changed = true;
    }
  }
  if (input->HasParameter(kWakeOnLan)) {
    if (!info.supportsWakeOn)
      throw HostCtlException("Not Support wol.");
    info.wakeOnChanged = true;
    changed = true;
    info.wakeOn.clear();
    for (char letter : input->GetParameter(kWakeOnLan)) {
      const char* found = letter ? std::strchr(kWakeOnLetters, letter) : nullptr;
      if (!found)
        throw HostCtlException("Invalid wol value.");
      info.wakeOn.push_back(static_cast<uint32_t>(found - kWakeOnLetters));
    }
  }
  if (input->HasParameter(kMessageLevel)) {
    if (!info.messageLevelSupported)
      throw HostCtlException("Not Support msglvl.");
    RequireFit(*input, std::span(kSetFits + 1, 1));
    auto level = static_cast<uint32_t>(input->GetParameterInt(kMessageLevel));
    if (level != info.messageLevel) {
      info.messageLevel = level;
      info.messageLevelChanged = true;
      changed = true;
    }
  }
  return changed;
}

void NicSet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                             const std::shared_ptr<CallSpec::Output>& output) {
  try {
    const std::string& name = input->GetParameter(kNicName);
    bool hasSpeed = input->HasParameter(kSpeed);
    bool hasDuplex = input->HasParameter(kDuplex);
    bool autoSet = input->IsFlagSet(kAuto);
    if (hasSpeed != hasDuplex) {
      output->AddErrorMessage("The --speed and --duplex options must be specified together");
      return;
    }
    if (autoSet && hasSpeed && hasDuplex) {
      output->AddErrorMessage(
          "The options --speed and --duplex cannot be specified with the --auto option.");
      return;
    }
    bool changeLink = autoSet || (hasSpeed && hasDuplex);
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<HostCtl::Network::Pnic> nic = FindPnic(info, name, output);
    if (!nic)
      return;
    PnicInfo record{};
    nic->GetPnicInfo(record, 0, 0);
    if (GetInfoFromParam(input, record)) {
      nic->SetPnicInfo(record);
    } else if (!changeLink) {
      output->AddErrorMessage("There is no change for nic " + name);
      return;
    }
    if (changeLink) {
      if (autoSet)
        nic->SetSpeedDuplex(0, 0);
      else
        nic->SetSpeedDuplex(static_cast<uint32_t>(input->GetParameterInt(kSpeed)),
                            input->GetParameter(kDuplex) == "full" ? 1 : 2);
    }
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic up

CORVEX_DEFINE_NEW(NicUp)

NicUp::NicUp() {
  SetDescription("Bring up the specified network device.");
}

NicUp::~NicUp() = default;

std::shared_ptr<CallSpec::InputSpec> NicUp::GetInputSpecInternal() {
  return MakeInputSpec(kNicNameParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicUp::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicUp::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                            const std::shared_ptr<CallSpec::Output>& output) {
  SetAdminStatus(input, output, true);
}

// network nic down

CORVEX_DEFINE_NEW(NicDown)

NicDown::NicDown() {
  SetDescription("Bring down the specified network device.");
}

NicDown::~NicDown() = default;

std::shared_ptr<CallSpec::InputSpec> NicDown::GetInputSpecInternal() {
  return MakeInputSpec(kNicNameParameters);
}

std::shared_ptr<CallSpec::OutputSpec> NicDown::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicDown::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                              const std::shared_ptr<CallSpec::Output>& output) {
  SetAdminStatus(input, output, false);
}

// network nic negotiate restart

CORVEX_DEFINE_NEW(NicNegotiationRestart)

NicNegotiationRestart::NicNegotiationRestart() {
  SetDescription("Restart N-Way negotiation on a nic");
}

NicNegotiationRestart::~NicNegotiationRestart() = default;

std::shared_ptr<CallSpec::InputSpec> NicNegotiationRestart::GetInputSpecInternal() {
  return MakeInputSpec(
      {{kVmnic, "n", CallSpec::String, true, "Name of vmnic to restart negotiation"}});
}

std::shared_ptr<CallSpec::OutputSpec> NicNegotiationRestart::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicNegotiationRestart::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                            const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    const std::string& name = input->GetParameter(kVmnic);
    std::unique_ptr<HostCtl::Network::Pnic> nic = info.GetPnicByName(name);
    if (!nic) {
      output->AddErrorMessage("Pnic with name " + name + " not found");
      return;
    }
    nic->RestartNegotiation();
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
