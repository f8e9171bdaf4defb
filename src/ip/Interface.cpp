//===- Interface.cpp - Kernel network interfaces --------------------------===//
//
// network ip interface list|add|remove|set. An interface is attached to its
// switch through a connection point: a port group of a standard switch, a DV
// port of a distributed switch or an opaque network. Add and remove name the
// point by port group or by distributed switch and port; adding an interface
// to a service netstack moves that service's tag to it.
//
//===----------------------------------------------------------------------===//
#include "ip.h"
#include "ip/InterfaceCommon.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/Network/Switching.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "TvkCtl/Network/Switching.h"
#include "TvkCtl/Network/TvkNicImpl.h"
#include "TvkCtl/Util.h"
#include "common/IntFit.h"

#include <climits>
#include <ctime>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::ConnectionPoint;
using HostCtl::Network::TvkNic;
using HostCtl::Network::TvkNicTagType;

namespace {

const std::string kNetworkInterface = "NetworkInterface";
const std::string kName = "Name";
const std::string kMacAddress = "MAC Address";
const std::string kPortset = "Portset";
const std::string kPortgroup = "Portgroup";
const std::string kNetstackInstance = "Netstack Instance";
const std::string kKrxName = "KRX Name";
const std::string kKrxUuid = "KRX UUID";
const std::string kKrxPort = "KRX Port";
const std::string kKrxConnection = "KRX Connection";
const std::string kOpaqueNetworkId = "Opaque Network ID";
const std::string kOpaqueNetworkType = "Opaque Network Type";
const std::string kExternalId = "External ID";
const std::string kMtu = "MTU";
const std::string kTsoMss = "TSO MSS";
const std::string kRxDispQueueSize = "RXDispQueue Size";
const std::string kEnabled = "Enabled";
const std::string kPortId = "Port ID";
const std::string kNotAvailable = "N/A";

const std::string kNetstack = "netstack";
const std::string kPortgroupName = "portgroup-name";
const std::string kDvsName = "dvs-name";
const std::string kDvportId = "dvport-id";
const std::string kInterfaceName = "interface-name";
const std::string kDefaultNetstack = "defaultTcpipStack";
const std::string kMtuParam = "mtu";

/// `ip interface set` passes a non-negative MTU on as an unsigned 32-bit number.
const IntFit kSetFits[] = {{kMtuParam, 0, kUint32Max}};

/// Names tvk0 to tvk255 without leading zeros.
const std::string kInterfaceNamePattern = "tvk([0-9]|[1-9][0-9]|1[0-9][0-9]|2[0-4][0-9]|25[0-5])";

const std::string kOnlyOnePoint =
    "Only one connection point can be specified, vswitch port group or DVPort.";
const std::string kNeedPoint =
    "A connection point of either vswitch port group name or dvs-name/dvport-id should be "
    "specified. If connection point is DVPort, --dvs-name and --dvport-id must be specified at "
    "the same time.";
const std::string kInvalidPoint = "Invalid vswitch port group or DVPort parameters.";

/// The service tags and the netstacks of their services.
struct ServiceNetstack {
  const char* netstack; ///< Netstack key.
  TvkNicTagType tag;    ///< The service's tag.
};

const ServiceNetstack kServiceNetstacks[] = {
    {"driftway", HostCtl::Network::TvkNicTagDriftway},
    {"twinRun", HostCtl::Network::TvkNicTagTwinRun},
    {"AmbrelProvisioning", HostCtl::Network::TvkNicTagAmbrel},
};

/// The netstack whose interfaces run the file-copy daemon.
const std::string kProvisioningNetstack = "AmbrelProvisioning";

/// Which connection point the parameters name.
enum class PointChoice { PortGroup, DVPort, Refused };

/// Chooses the connection point from the given parameters; adds the refusal
/// message when they do not name exactly one.
PointChoice ChoosePoint(const CallSpec::Input& input, CallSpec::Output& output) {
  bool portgroup = input.HasParameter(kPortgroupName);
  bool dvs = input.HasParameter(kDvsName);
  bool dvport = input.HasParameter(kDvportId);
  if (dvs && dvport) {
    if (portgroup) {
      output.AddErrorMessage(kOnlyOnePoint);
      return PointChoice::Refused;
    }
    return PointChoice::DVPort;
  }
  if (portgroup && !dvs && !dvport)
    return PointChoice::PortGroup;
  output.AddErrorMessage(kNeedPoint);
  return PointChoice::Refused;
}

/// Builds the chosen connection point, reporting a failure with the text of
/// its stage; null after an error.
std::unique_ptr<ConnectionPoint> BuildPoint(PointChoice choice, const CallSpec::Input& input,
                                            CallSpec::Output& output) {
  if (choice == PointChoice::DVPort) {
    const std::string& dvsName = input.GetParameter(kDvsName);
    const std::string prefix = "Unable to retrieve DVS info by specified DVS name " + dvsName;
    try {
      auto dvs = HostCtl::Network::NetworkFactory::GetDVSwitchByName(dvsName);
      if (!dvs) {
        output.AddErrorMessage(prefix + ". Error was: no distributed switch has this name");
        return nullptr;
      }
      HostCtl::Network::DVPortParam param{dvs->GetUuid(), input.GetParameter(kDvportId), 0};
      TvkCtl::Network::DVPortImpl trial(param);
      if (trial.IsValid()) {
        uint32_t connectionId = trial.GetConnectionId();
        if (connectionId == 0) {
          connectionId = static_cast<uint32_t>(std::time(nullptr));
          trial.SetConnectionId(connectionId);
        }
        param.connectionId = connectionId;
      }
      return std::make_unique<TvkCtl::Network::DVPortImpl>(param);
    } catch (const HostCtlException& e) {
      output.AddErrorMessage(prefix + ". Error was: " + e.what());
      return nullptr;
    }
  }
  const std::string& portgroup = input.GetParameter(kPortgroupName);
  try {
    return std::make_unique<TvkCtl::Network::PortGroupImpl>(portgroup);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage("Invalid vswitch port group name " + portgroup +
                           ". Error was: " + e.what());
    return nullptr;
  }
}

/// Gives \p nic the service tag \p tag and takes it from every interface of
/// the default netstack.
void ApplyExclusiveServiceTag(TvkCtl::Network::TvKernelNicInfoImpl& service, TvkNic& nic,
                              TvkNicTagType tag) {
  nic.AddTag(tag, false);
  for (const auto& other : service.GetTvKernelNicsByTag(tag))
    if (other && other->GetNetstackInstanceName() == kDefaultNetstack)
      other->RemoveTag(tag);
}

/// Fills the connection block of one listed interface.
void SetConnectionFields(TvkNic& nic, MetaObj::MetaStruct& row, CallSpec::Output& output) {
  auto point = nic.GetConnectionPoint();
  if (!point) {
    for (const std::string* field :
         {&kPortset, &kPortgroup, &kNetstackInstance, &kKrxName, &kKrxUuid, &kKrxPort,
          &kOpaqueNetworkId, &kOpaqueNetworkType, &kExternalId})
      row.SetField(*field, kNotAvailable);
    row.SetField(kKrxConnection, -1L);
    return;
  }
  std::string portset = point->GetPortsetName();
  row.SetField(kPortset, portset.empty() ? kNotAvailable : portset);
  auto setOpaqueNA = [&] {
    row.SetField(kOpaqueNetworkId, kNotAvailable);
    row.SetField(kOpaqueNetworkType, kNotAvailable);
    row.SetField(kExternalId, kNotAvailable);
  };
  auto setKrxNA = [&] {
    row.SetField(kKrxName, kNotAvailable);
    row.SetField(kKrxUuid, kNotAvailable);
    row.SetField(kKrxPort, kNotAvailable);
    row.SetField(kKrxConnection, -1L);
  };
  switch (point->GetType()) {
  case ConnectionPoint::CONNECTION_PORTGROUP:
    row.SetField(kPortgroup, point->GetPortGroupName());
    row.SetField(kNetstackInstance, nic.GetNetstackInstanceName());
    setKrxNA();
    setOpaqueNA();
    break;
  case ConnectionPoint::CONNECTION_DVPORT: {
    HostCtl::Network::DVPortParam param = point->GetDVPortParam();
    row.SetField(kPortgroup, kNotAvailable);
    row.SetField(kNetstackInstance, nic.GetNetstackInstanceName());
    TvkCtl::Network::VirtualSwitchInfoImpl switches;
    if (auto dvs = switches.GetDVSwitchByName(portset)) {
      row.SetField(kKrxName, dvs->GetDisplayName());
    } else {
      output.AddErrorMessage("Unable to access the associated KRX");
      row.SetField(kKrxName, kNotAvailable);
    }
    row.SetField(kKrxUuid, param.switchUuid);
    row.SetField(kKrxPort, param.portId);
    row.SetField(kKrxConnection, static_cast<long>(param.connectionId));
    setOpaqueNA();
    break;
  }
  case ConnectionPoint::CONNECTION_OPAQUE: {
    HostCtl::Network::OpaqueNetworkParam param = point->GetOpaqueNetworkParam();
    row.SetField(kPortgroup, kNotAvailable);
    row.SetField(kNetstackInstance, nic.GetNetstackInstanceName());
    setKrxNA();
    row.SetField(kOpaqueNetworkId, param.networkId);
    row.SetField(kOpaqueNetworkType, param.networkType);
    row.SetField(kExternalId, param.externalId);
    break;
  }
  default:
    output.AddErrorMessage(
        "Unknown ConnectionPoint type found in list of Tarvik network interfaces.");
    break;
  }
}

/// An interface name that ostracli creates or removes: tvk0 to tvk255.
const ParameterCheck kInterfaceNameCheck = ParameterCheck::Matching(kInterfaceNamePattern);

const ParameterDef kDvsNameParam = {
    "dvs-name", "s", CallSpec::String, false,
    "DVSwitch name of the connection point. This requires --dvport-id to be given in the same "
    "command"};
const ParameterDef kDvportIdParam = {
    "dvport-id", "P", CallSpec::String, false,
    "DVPort ID of the connection point. This requires --dvs-name to be given in the same command"};
const ParameterDef kNetstackUseDefaultParam = {
    "netstack", "N", CallSpec::String, false,
    "The network stack instance; if unspecified, use the default netstack instance"};

} // namespace

// --- network ip interface list ---------------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceList)

IpInterfaceList::IpInterfaceList() {
  SetDescription(
      "This command will list the Tarvik network interfaces currently known to the system.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kNetworkInterface, "%" + kName + "%");
  std::string fields;
  for (const std::string* field :
       {&kName, &kMacAddress, &kEnabled, &kPortset, &kPortgroup, &kNetstackInstance, &kKrxName,
        &kKrxUuid, &kKrxPort, &kKrxConnection, &kOpaqueNetworkId, &kOpaqueNetworkType, &kExternalId,
        &kMtu, &kTsoMss, &kRxDispQueueSize, &kPortId})
    fields += (fields.empty() ? "" : ",") + *field;
  SetDefaultOutputParameter("fields:" + kNetworkInterface, fields);
}

IpInterfaceList::~IpInterfaceList() = default;

std::shared_ptr<MetaObj::MetaStruct> IpInterfaceList::GetOutputStructure() {
  return MakeStructure(kNetworkInterface, {{kName, FieldKind::String},
                                           {kMacAddress, FieldKind::String},
                                           {kPortset, FieldKind::String},
                                           {kPortgroup, FieldKind::String},
                                           {kNetstackInstance, FieldKind::String},
                                           {kKrxName, FieldKind::String},
                                           {kKrxUuid, FieldKind::String},
                                           {kKrxPort, FieldKind::String},
                                           {kKrxConnection, FieldKind::Integer},
                                           {kOpaqueNetworkId, FieldKind::String},
                                           {kOpaqueNetworkType, FieldKind::String},
                                           {kExternalId, FieldKind::String},
                                           {kMtu, FieldKind::Integer},
                                           {kTsoMss, FieldKind::Integer},
                                           {kRxDispQueueSize, FieldKind::Integer},
                                           {kEnabled, FieldKind::Boolean},
                                           {kPortId, FieldKind::Integer}});
}

std::shared_ptr<CallSpec::InputSpec> IpInterfaceList::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"netstack", "N", CallSpec::String, false,
        "The network stack instance; if unspecified, consider all netstack instances"},
       {"type", "t", CallSpec::String, false,
        "List Tarvik network interfaces with given type(e.g. system)."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpInterfaceList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                      const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::TvKernelNicInfoImpl service;
    ListTvkNics(
        service, *input, *output, [this] { return GetOutputStructure(); },
        [&](MetaObj::MetaStruct& row, HostCtl::Network::TvkNic& nic) {
          row.SetField(kMacAddress, nic.GetMacAddress().GetStringAddress());
          SetConnectionFields(nic, row, *output);
          row.SetField(kMtu, static_cast<long>(nic.GetMtu()));
          row.SetField(kTsoMss, static_cast<long>(nic.GetTsoMss()));
          row.SetField(kRxDispQueueSize, static_cast<long>(nic.GetNumRxQueue()));
          row.SetField(kEnabled, nic.IsEnabled());
          if (auto port = nic.GetPort())
            row.SetField(kPortId, static_cast<long>(port->GetId()));
        });
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// --- network ip interface add ----------------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceAdd)

IpInterfaceAdd::IpInterfaceAdd() {
  SetDescription("Add a new Tarvik network interface.");
}

IpInterfaceAdd::~IpInterfaceAdd() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceAdd::GetInputSpecInternal() {
  return MakeInputSpec(
      {kNetstackUseDefaultParam,
       {"portgroup-name", "p", CallSpec::String, false,
        "The name of the vswitch port group to add this Tarvik network interface to."},
       kDvsNameParam,
       kDvportIdParam,
       {"mtu", "m", CallSpec::Integer, false,
        "Set the MTU setting for a given Tarvik network interface on creation",
        ParameterCheck::Range(HostCtl::Network::TvkNic::MIN_MTU,
                              HostCtl::Network::TvkNic::MAX_MTU)},
       {"num-rxqueue", "R", CallSpec::Integer, false,
        "Set the number of RX dispatch queues for a given Tarvik network interface on creation",
        ParameterCheck::Range(1, 1000)},
       {"mac-address", "M", CallSpec::String, false,
        "Set the MAC address for the newly created Tarvik network interface."},
       {"interface-name", "i", CallSpec::String, false,
        "The name of the Tarvik network interface to create. This name must be in the form tvkX, "
        "where X is a number 0-255",
        kInterfaceNameCheck}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceAdd::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                     const std::shared_ptr<CallSpec::Output>& output) {
  // A failure while the netstacks are listed is left to the command host.
  if (input->HasParameter(kNetstack)) {
    const std::string& key = input->GetParameter(kNetstack);
    TvkCtl::Network::NetworkInfoImpl info;
    bool found = false;
    for (const auto& instance : info.ListNetstackInstances())
      if (instance && instance->GetKey() == key) {
        found = true;
        break;
      }
    if (!found) {
      output->AddErrorMessage("The netstack " + key + " does not exist.");
      return;
    }
  }
  PointChoice choice = ChoosePoint(*input, *output);
  if (choice == PointChoice::Refused)
    return;
  HostCtl::Network::MacAddress mac;
  if (input->HasParameter("mac-address")) {
    const std::string& text = input->GetParameter("mac-address");
    if (!HostCtl::Network::MacAddress::IsValid(text)) {
      output->AddErrorMessage("Invalid unicast MAC address specified.");
      return;
    }
    mac = HostCtl::Network::MacAddress(text);
  }
  uint32_t mtu =
      input->HasParameter("mtu") ? static_cast<uint32_t>(input->GetParameterInt("mtu")) : 0;
  uint32_t rxQueues = input->HasParameter("num-rxqueue")
                          ? static_cast<uint32_t>(input->GetParameterInt("num-rxqueue"))
                          : 0;
  std::string name = input->HasParameter(kInterfaceName) ? input->GetParameter(kInterfaceName) : "";

  std::unique_ptr<ConnectionPoint> point = BuildPoint(choice, *input, *output);
  if (!point)
    return;
  try {
    if (!point->IsValid()) {
      output->AddErrorMessage(kInvalidPoint);
      return;
    }
    std::string netstack =
        input->HasParameter(kNetstack) ? input->GetParameter(kNetstack) : kDefaultNetstack;
    TvkCtl::Network::TvKernelNicInfoImpl service;
    std::unique_ptr<TvkNic> nic = service.AddTvKernelNic(
        point.get(), netstack, HostCtl::Network::IpConfig(), mac, 0, mtu, rxQueues, name, false);
    for (const ServiceNetstack& entry : kServiceNetstacks) {
      if (netstack != entry.netstack)
        continue;
      ApplyExclusiveServiceTag(service, *nic, entry.tag);
      if (netstack == kProvisioningNetstack) {
        std::string command = "/etc/init.d/quilld " + TvkCtl::Util::MakeChildRpTvkOption(24);
        if (TvkCtl::Util::TvkCtl_Exec(command, false, true, false) != 0)
          output->AddErrorMessage("Unable to start the QUILL daemon. Take a look at "
                                  "/var/log/quilld.log for more information.");
      }
    }
    HostCtl::Network::IpConfig config;
    config.SetUseIpv6RouterAdvertised(true);
    nic->SetIpConfig(config);
    if (auto* announce = dynamic_cast<HostCtl::Network::TvkNicAnnounce*>(nic.get()))
      announce->Announce();
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to add Tarvik network interface. Error was : ") +
                            e.what());
  }
}

// --- network ip interface remove -------------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceRemove)

IpInterfaceRemove::IpInterfaceRemove() {
  SetDescription("Remove a Tarvik network interface from the Ostra host. A TarVik network "
                 "interface can be uniquely specified by --interface-name or --portgroup-name or "
                 "--dvs-name/--dvport-id. i.e. Providing its name or its connection point are two "
                 "ways to uniquely specify a TarVik network interface.");
}

IpInterfaceRemove::~IpInterfaceRemove() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceRemove::GetInputSpecInternal() {
  return MakeInputSpec(
      {kNetstackUseDefaultParam,
       {"portgroup-name", "p", CallSpec::String, false,
        "The name of the vswitch port group to delete this Tarvik network interface from."},
       kDvsNameParam,
       kDvportIdParam,
       {"interface-name", "i", CallSpec::String, false,
        "The name of the Tarvik network interface to remove. This name must be in the form tvkX, "
        "where X is a number 0-255",
        kInterfaceNameCheck}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceRemove::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                        const std::shared_ptr<CallSpec::Output>& output) {
  bool byName = input->HasParameter(kInterfaceName);
  bool portgroup = input->HasParameter(kPortgroupName);
  bool dvs = input->HasParameter(kDvsName);
  bool dvport = input->HasParameter(kDvportId);
  if ((byName && (portgroup || dvs)) || (!portgroup && !dvs && byName == dvport)) {
    output->AddErrorMessage(
        "Please correctly and uniquely specify a way to remove it. A TarVik network interface "
        "can be uniquely specified by --interface-name or --portgroup-name or "
        "--dvs-name/--dvport-id. i.e. Providing its name or its connection point are two ways to "
        "uniquely specify a TarVik network interface.");
    return;
  }
  const std::string failed = "Unable to remove Tarvik network interface. Error was : ";
  if (byName) {
    const std::string& name = input->GetParameter(kInterfaceName);
    try {
      TvkCtl::Network::TvKernelNicInfoImpl service;
      for (const auto& nic : service.GetTvKernelNics(0)) {
        if (nic && nic->GetInterfaceName() == name) {
          nic->Remove();
          output->SetRootObject(MetaObj::MetaBool::New(true));
          return;
        }
      }
      output->AddErrorMessage("Unable to find Tarvik network interface with the name " + name);
      output->SetRootObject(MetaObj::MetaBool::New(false));
    } catch (const HostCtlException& e) {
      output->AddErrorMessage(failed + e.what());
    }
    return;
  }
  PointChoice choice = ChoosePoint(*input, *output);
  if (choice == PointChoice::Refused)
    return;
  std::unique_ptr<ConnectionPoint> point = BuildPoint(choice, *input, *output);
  if (!point)
    return;
  try {
    if (!point->IsValid()) {
      output->AddErrorMessage(kInvalidPoint);
      return;
    }
    std::string netstack = input->HasParameter(kNetstack) ? input->GetParameter(kNetstack) : "";
    if (netstack.empty())
      netstack = kDefaultNetstack;
    TvkCtl::Network::TvKernelNicInfoImpl service;
    service.RemoveTvKernelNic(point.get(), netstack);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(failed + e.what());
  }
}

// --- network ip interface set ----------------------------------------------------

CORVEX_DEFINE_NEW(IpInterfaceSet)

IpInterfaceSet::IpInterfaceSet() {
  SetDescription("This command sets the enabled status and MTU size of a given IP interface ");
}

IpInterfaceSet::~IpInterfaceSet() = default;

std::shared_ptr<CallSpec::InputSpec> IpInterfaceSet::GetInputSpecInternal() {
  return MakeInputSpec(
      {{"interface-name", "i", CallSpec::String, true,
        "The name of the interface to apply the configurations."},
       {"enabled", "e", CallSpec::Boolean, false,
        "Set to true to enable the interface, set to false to disable it."},
       {"mtu", "m", CallSpec::Integer, false, "The MTU size of the IP interface. "}});
}

std::shared_ptr<CallSpec::OutputSpec> IpInterfaceSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpInterfaceSet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                     const std::shared_ptr<CallSpec::Output>& output) {
  try {
    const std::string& name = input->GetParameter(kInterfaceName);
    TvkCtl::Network::TvKernelNicInfoImpl service;
    std::unique_ptr<TvkNic> found;
    for (auto& nic : service.GetTvKernelNics(0)) {
      if (nic && nic->GetInterfaceName() == name) {
        found = std::move(nic);
        break;
      }
    }
    if (!found) {
      output->AddErrorMessage("Unable to find an interface with name " + name);
      return;
    }
    if (input->HasParameter("enabled")) {
      if (input->GetParameterBool("enabled"))
        found->Enable();
      else
        found->Disable();
    }
    if (input->HasParameter("mtu")) {
      long mtu = input->GetParameterInt("mtu");
      if (mtu < 0) {
        output->AddErrorMessage("MTU size should be a positive value");
        return;
      }
      RequireFit(*input, kSetFits);
      found->SetMtu(static_cast<uint32_t>(mtu));
    }
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
