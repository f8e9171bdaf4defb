//===- Netstack.cpp - Netstack instances and global IP settings -----------===//
//
// network ip netstack list|add|get|set|remove, and network ip get|set (the
// kernel's IPv6 switch, which takes effect on the next boot of the host).
//
//===----------------------------------------------------------------------===//
#include "ip.h"
#include "ip/InterfaceCommon.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/NetstackInstanceImpl.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "common/IntFit.h"

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;
using HostCtl::Lib::HostCtlException;

namespace {

/// The values of --ecn.
const EnumChoice kEcnChoices[] = {
    {"disabled", "Completely disable ECN functionality"},
    {"enabled", "Fully enable ECN functionality"},
    {"echo-only", "Only echoing ECN, won't initiate"},
};

const std::string kNetstackInstance = "NetstackInstance";
const std::string kKey = "Key";
const std::string kName = "Name";
const std::string kState = "State";
const std::string kEnabled = "Enabled";
const std::string kMaxConnections = "Max Connections";
const std::string kCurrentMaxConnections = "Current Max Connections";
const std::string kCongestionControl = "Congestion Control Algorithm";
const std::string kIpv6Enabled = "IPv6 Enabled";
const std::string kCurrentIpv6Enabled = "Current IPv6 Enabled";
const std::string kEcnStatus = "ECN Status";
const std::string kIpInfo = "IPInfo";

const std::string kNetstack = "netstack";
const std::string kUnableToFind = "Unable to find a Netstack instance ";
const std::string kDefaultEcn = "enabled";
const std::string kNewReno = "newreno";
const std::string kMaxconnParam = "maxconn";

/// The maximum connections go to the host as an unsigned 32-bit number.
const IntFit kSetFits[] = {{kMaxconnParam, 0, kUint32Max}};

/// The state of an instance created in the kernel.
constexpr long kEnabledState = 4660;

const ParameterDef kNetstackParam = {"netstack", "N", CallSpec::String, true,
                                     "The network stack instance"};

} // namespace

// --- network ip netstack list ---------------------------------------------------

CORVEX_DEFINE_NEW(IpNetstackInstanceList)

IpNetstackInstanceList::IpNetstackInstanceList() {
  SetDescription(
      "This command will list the Tarvik Netstack instances currently known to the system.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kNetstackInstance, "%" + kKey + "%");
  SetDefaultOutputParameter("fields:" + kNetstackInstance, kKey + "," + kName + "," + kState);
}

IpNetstackInstanceList::~IpNetstackInstanceList() = default;

std::shared_ptr<MetaObj::MetaStruct> IpNetstackInstanceList::GetOutputStructure() {
  return MakeStructure(
      kNetstackInstance,
      {{kKey, FieldKind::String}, {kName, FieldKind::String}, {kState, FieldKind::Integer}});
}

std::shared_ptr<CallSpec::InputSpec> IpNetstackInstanceList::GetInputSpecInternal() {
  return CallSpec::InputSpec::New();
}

std::shared_ptr<CallSpec::OutputSpec> IpNetstackInstanceList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpNetstackInstanceList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& /*input*/,
                                             const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    for (const auto& instance : info.ListNetstackInstances()) {
      if (!instance)
        continue;
      auto row = GetOutputStructure();
      row->SetField(kKey, instance->GetKey());
      row->SetField(kName, instance->GetInstanceName());
      row->SetField(kState, static_cast<long>(instance->GetState()));
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// --- network ip netstack add ----------------------------------------------------

CORVEX_DEFINE_NEW(IpNetstackInstanceAdd)

IpNetstackInstanceAdd::IpNetstackInstanceAdd() {
  SetDescription("Add a new Netstack Instance.");
}

IpNetstackInstanceAdd::~IpNetstackInstanceAdd() = default;

std::shared_ptr<CallSpec::InputSpec> IpNetstackInstanceAdd::GetInputSpecInternal() {
  return MakeInputSpec({kNetstackParam,
                        {"disabled", "d", CallSpec::Flag, false,
                         "Create the netstack instance only in config i.e. in disabled state. Does "
                         "not create in kernel."}});
}

std::shared_ptr<CallSpec::OutputSpec> IpNetstackInstanceAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpNetstackInstanceAdd::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                            const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    TvkCtl::Network::NetstackInstanceImpl instance(input->GetParameter(kNetstack), 11000, kNewReno,
                                                   true, 2, kDefaultEcn);
    info.AddNetstackInstance(instance, input->IsFlagSet("disabled"));
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to add Netstack Instance. Error was : ") +
                            e.what());
  }
}

// --- network ip netstack remove -------------------------------------------------

CORVEX_DEFINE_NEW(IpNetstackInstanceRemove)

IpNetstackInstanceRemove::IpNetstackInstanceRemove() {
  SetDescription("Remove a new Netstack Instance.");
}

IpNetstackInstanceRemove::~IpNetstackInstanceRemove() = default;

std::shared_ptr<CallSpec::InputSpec> IpNetstackInstanceRemove::GetInputSpecInternal() {
  return MakeInputSpec({kNetstackParam});
}

std::shared_ptr<CallSpec::OutputSpec> IpNetstackInstanceRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpNetstackInstanceRemove::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                               const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    info.RemoveNetstackInstance(input->GetParameter(kNetstack), false);
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to Remove Netstack Instance. Error was : ") +
                            e.what());
  }
}

// --- network ip netstack get ----------------------------------------------------

CORVEX_DEFINE_NEW(IpNetstackInstanceGet)

IpNetstackInstanceGet::IpNetstackInstanceGet() {
  SetDescription("Get runtime/configuration settings for a given Netstack Instance.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kNetstackInstance, "%" + kKey + "%");
  SetDefaultOutputParameter("fields:" + kNetstackInstance,
                            kKey + "," + kName + "," + kEnabled + "," + kMaxConnections + "," +
                                kCurrentMaxConnections + "," + kCongestionControl + "," +
                                kIpv6Enabled + "," + kCurrentIpv6Enabled + "," + kEcnStatus + "," +
                                kState);
}

IpNetstackInstanceGet::~IpNetstackInstanceGet() = default;

std::shared_ptr<MetaObj::MetaStruct> IpNetstackInstanceGet::GetOutputStructure() {
  return MakeStructure(kNetstackInstance, {{kKey, FieldKind::String},
                                           {kName, FieldKind::String},
                                           {kEnabled, FieldKind::Boolean},
                                           {kMaxConnections, FieldKind::Integer},
                                           {kCurrentMaxConnections, FieldKind::Integer},
                                           {kCongestionControl, FieldKind::String},
                                           {kIpv6Enabled, FieldKind::Boolean},
                                           {kCurrentIpv6Enabled, FieldKind::Boolean},
                                           {kEcnStatus, FieldKind::String},
                                           {kState, FieldKind::Integer}});
}

std::shared_ptr<CallSpec::InputSpec> IpNetstackInstanceGet::GetInputSpecInternal() {
  return MakeInputSpec({kNetstackParam});
}

std::shared_ptr<CallSpec::OutputSpec> IpNetstackInstanceGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpNetstackInstanceGet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                            const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    const std::string& key = input->GetParameter(kNetstack);
    auto instance = info.LookupNetstackInstanceByKey(key);
    if (!instance) {
      output->AddErrorMessage(kUnableToFind + key);
      return;
    }
    auto row = GetOutputStructure();
    row->SetField(kKey, instance->GetKey());
    row->SetField(kName, instance->GetInstanceName());
    row->SetField(kEnabled, static_cast<long>(instance->GetState()) == kEnabledState);
    row->SetField(kMaxConnections, static_cast<long>(instance->GetMaxConnections()));
    row->SetField(kCurrentMaxConnections, static_cast<long>(instance->GetCurrentMaxConnections()));
    row->SetField(kCongestionControl, instance->GetCongestionControlAlgorithm());
    row->SetField(kIpv6Enabled, instance->GetIpv6Enabled());
    row->SetField(kCurrentIpv6Enabled, instance->GetCurrentIpv6Enabled());
    row->SetField(kEcnStatus, instance->GetEcnStatus());
    row->SetField(kState, static_cast<long>(instance->GetState()));
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    list->Add(row);
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Error getting Netstack instance configuration. ") +
                            ". Error was : " + e.what());
  }
}

// --- network ip netstack set ----------------------------------------------------

CORVEX_DEFINE_NEW(IpNetstackInstanceSet)

IpNetstackInstanceSet::IpNetstackInstanceSet() {
  SetDescription("Configure settings for a given Netstack Instance.");
}

IpNetstackInstanceSet::~IpNetstackInstanceSet() = default;

std::shared_ptr<CallSpec::InputSpec> IpNetstackInstanceSet::GetInputSpecInternal() {
  // The algorithms are the host's; each is offered with a description of its own.
  const std::vector<std::string> algorithms =
      TvkCtl::Network::NetstackInstanceImpl::GetCongestionControlAlgorithmList();
  std::vector<std::string> descriptions;
  descriptions.reserve(algorithms.size());
  std::vector<EnumChoice> ccalgoChoices;
  ccalgoChoices.reserve(algorithms.size());
  for (const std::string& name : algorithms) {
    descriptions.push_back("Set " + name + " as the algorithm");
    ccalgoChoices.push_back({name, descriptions.back()});
  }
  return MakeInputSpec({
      {"netstack", "N", CallSpec::String, true,
       "The network stack instance. This name must be an interface listed in the netstack list "
       "command."},
      {"enable", "e", CallSpec::Boolean, false, "Enable the netstack instance (create in kernel)"},
      {"name", "n", CallSpec::String, false, "The name for this netstack instance."},
      {"maxconn", "m", CallSpec::Integer, false,
       "The maximum number of connections for this netstack instance (applied only during "
       "netstack creation)."},
      {"ccalgo", "c", CallSpec::String, false,
       "The TCP Congestion Contol Algorithm for this netstack instance (not applied to existing "
       "connections).: %FULLENUM%",
       ParameterCheck::OneOf(ccalgoChoices)},
      {"ipv6enabled", "i", CallSpec::Boolean, false,
       "To enable IPv6 for this netstack instance (aplied only during netstack creation)."},
      {"ecn", "", CallSpec::String, false,
       "The status of ECN (Explicit Congestion Notification). %FULLENUM%",
       ParameterCheck::OneOf(kEcnChoices)},
  });
}

std::shared_ptr<CallSpec::OutputSpec> IpNetstackInstanceSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpNetstackInstanceSet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                                            const std::shared_ptr<CallSpec::Output>& output) {
  if (auto problem = OutOfRange(*input, kSetFits[0])) {
    output->AddErrorMessage(*problem);
    return;
  }
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    const std::string& key = input->GetParameter(kNetstack);
    auto instance = info.LookupNetstackInstanceByKey(key);
    if (!instance) {
      output->AddErrorMessage(kUnableToFind + key);
      return;
    }
    if (input->HasParameter("name") && !input->GetParameter("name").empty())
      instance->SetInstanceName(input->GetParameter("name"), true);
    if (input->HasParameter("enable")) {
      if (input->GetParameterBool("enable"))
        instance->Enable();
      else
        instance->Disable();
    }
    if (input->HasParameter(kMaxconnParam))
      instance->SetMaxConnections(static_cast<uint32_t>(input->GetParameterInt(kMaxconnParam)),
                                  true);
    if (input->HasParameter("ccalgo") && !input->GetParameter("ccalgo").empty())
      instance->SetCongestionControlAlgorithm(input->GetParameter("ccalgo"), true);
    if (input->HasParameter("ipv6enabled"))
      instance->SetIpv6Enabled(input->GetParameterBool("ipv6enabled"), true);
    if (input->HasParameter("ecn"))
      instance->SetEcnStatus(input->GetParameter("ecn"));
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(std::string("Error setting configuration") + e.what());
  }
}

// --- network ip get -------------------------------------------------------------

CORVEX_DEFINE_NEW(IpGet)

IpGet::IpGet() {
  SetDescription("Get global IP settings");
  SetDefaultOutputFormatter("simple");
}

IpGet::~IpGet() = default;

std::shared_ptr<MetaObj::MetaStruct> IpGet::GetOutputStructure() {
  return MakeStructure(kIpInfo, {{kIpv6Enabled, FieldKind::Boolean}});
}

std::shared_ptr<CallSpec::InputSpec> IpGet::GetInputSpecInternal() {
  return CallSpec::InputSpec::New();
}

std::shared_ptr<CallSpec::OutputSpec> IpGet::GetOutputSpecInternal() {
  return ResultSpec(GetOutputStructure());
}

void IpGet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& /*input*/,
                            const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    auto result = GetOutputStructure();
    result->SetField(kIpv6Enabled, info.IsTvkIpv6Enabled());
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// --- network ip set -------------------------------------------------------------

CORVEX_DEFINE_NEW(IpSet)

IpSet::IpSet() {
  SetDescription("Update global IP settings");
}

IpSet::~IpSet() = default;

std::shared_ptr<CallSpec::InputSpec> IpSet::GetInputSpecInternal() {
  return MakeInputSpec({{"ipv6-enabled", "e", CallSpec::Boolean, false,
                         "Enable or disable IPv6 (Reboot Required)"}});
}

std::shared_ptr<CallSpec::OutputSpec> IpSet::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpSet::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                            const std::shared_ptr<CallSpec::Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    if (input->HasParameter("ipv6-enabled"))
      info.SetTvkIpv6Enabled(input->GetParameterBool("ipv6-enabled"));
    output->SetRootObject(MetaObj::MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
