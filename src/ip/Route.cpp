//===- Route.cpp - network ip route ipv4|ipv6 add, remove, list -----------===//
//
// The six route commands. IPv4 and IPv6 share one implementation: a traits
// structure per family names the routing service's operations, the default
// network and the texts that differ.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/RoutingInfoImpl.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using TvkCtl::Network::RoutingInfoImpl;

namespace {

const std::string kDefaultNetstack = "defaultTcpipStack";
const std::string kDefaultNetwork = "default";
const std::string kNetwork = "Network";
const std::string kNetmask = "Netmask";
const std::string kGateway = "Gateway";
const std::string kInterface = "Interface";
const std::string kSource = "Source";

/// What differs between the IPv4 and the IPv6 commands.
struct Ipv4Family {
  using Network = HostCtl::Network::Ipv4Network;
  using Address = HostCtl::Network::Ipv4Address;
  static constexpr const char* kWord = "Ipv4";      ///< In parameter descriptions.
  static constexpr const char* kUpperWord = "IPv4"; ///< In the type description.
  static const Network& DefaultNetwork() { return RoutingInfoImpl::DEFAULT_IPV4_ROUTE; }
  static void Add(RoutingInfoImpl& routing, const Network& network, const Address& gateway) {
    routing.AddTarvikRoute(network, gateway);
  }
  static void Remove(RoutingInfoImpl& routing, const Network& network, const Address& gateway) {
    routing.RemoveTarvikRoute(network, gateway);
  }
  static Address Running(RoutingInfoImpl& routing) { return routing.GetTvKernelDefaultGateway(); }
  static Address Configured(RoutingInfoImpl& routing) {
    return routing.GetTvKernelConfigDefaultGateway();
  }
  static void ClearDefaultGateway(RoutingInfoImpl& routing) {
    routing.SetTvKernelDefaultGateway(Address("0.0.0.0"), false);
  }
  using Route = HostCtl::Network::Ipv4Route;
  static std::vector<Route> Routes(RoutingInfoImpl& routing,
                                   HostCtl::Network::PortsetGetType selector) {
    return routing.GetCurrentTarvikRoutes(selector);
  }
  /// "Network" and "Netmask" of a route, and the "Source" the IPv4 list adds.
  static void SetRouteFields(MetaStruct& row, const Route& route, RoutingInfoImpl& routing) {
    const Network& network = route.GetNetwork();
    row.SetField(kNetwork, network == DefaultNetwork() ? kDefaultNetwork
                                                       : network.GetNetwork().GetStringAddress());
    row.SetField(kNetmask, network.GetNetmask().GetStringAddress());
    row.SetField(kSource, routing.GetDefaultGatewaySource(network));
  }
};

struct Ipv6Family {
  using Network = HostCtl::Network::Ipv6Network;
  using Address = HostCtl::Network::Ipv6Address;
  static constexpr const char* kWord = "Ipv6";
  static constexpr const char* kUpperWord = "IPv6";
  static const Network& DefaultNetwork() { return RoutingInfoImpl::DEFAULT_IPV6_ROUTE; }
  static void Add(RoutingInfoImpl& routing, const Network& network, const Address& gateway) {
    routing.AddIpv6TarvikRoute(network, gateway);
  }
  static void Remove(RoutingInfoImpl& routing, const Network& network, const Address& gateway) {
    routing.RemoveIpv6TarvikRoute(network, gateway);
  }
  static Address Running(RoutingInfoImpl& routing) {
    return routing.GetIpv6TvKernelDefaultGateway();
  }
  static Address Configured(RoutingInfoImpl& routing) {
    return routing.GetIpv6TvKernelConfigDefaultGateway();
  }
  static void ClearDefaultGateway(RoutingInfoImpl& routing) {
    routing.SetIpv6TvKernelDefaultGateway(Address());
  }
  using Route = HostCtl::Network::Ipv6Route;
  static std::vector<Route> Routes(RoutingInfoImpl& routing,
                                   HostCtl::Network::PortsetGetType selector) {
    return routing.GetCurrentIpv6TarvikRoutes(selector);
  }
  /// "Network" and "Netmask" of a route; the netmask is shown as an address.
  static void SetRouteFields(MetaStruct& row, const Route& route, RoutingInfoImpl& /*routing*/) {
    const Network& network = route.GetNetwork();
    row.SetField(kNetwork, network == DefaultNetwork() ? kDefaultNetwork
                                                       : network.GetAddress().GetStringAddress());
    row.SetField(kNetmask, Network::NetmaskFromNumber(network.GetNetmask()).GetStringAddress());
  }
};

/// Parameters of add (\p add true) and remove.
template <typename Family> std::shared_ptr<InputSpec> ChangeInputSpec(bool add) {
  std::string word = Family::kWord;
  std::string networkText = add ? "The " + word +
                                      " address and prefix length of the network to add the "
                                      "route to. Specify 'default' to indicate the default network."
                                : "The " + word +
                                      " address and prefix length of the network to remove the "
                                      "route from. Specify 'default' to indicate the default "
                                      "network.";
  std::string gatewayText =
      add ? "The " + word + " address of the gateway through which a route to be added."
          : "The " + word + " address of the gateway through which a route to be removed";
  return MakeInputSpec({
      {"network", "n", Fabrik::CallSpec::String, true, networkText},
      {"gateway", "g", Fabrik::CallSpec::String, true, gatewayText},
      {"netstack", "N", Fabrik::CallSpec::String, false, kNetstackDescription},
  });
}

template <typename Family> std::shared_ptr<InputSpec> ListInputSpec() {
  return MakeInputSpec({
      {"netstack", "N", Fabrik::CallSpec::String, false, kNetstackDescription},
      {"type", "t", Fabrik::CallSpec::String, false,
       std::string("List ") + Family::kUpperWord + " routes with given type(e.g. system)."},
  });
}

/// The routing service of the command's netstack.
RoutingInfoImpl OpenRouting(const Input& input) {
  RoutingInfoImpl routing(kDefaultNetstack);
  if (input.HasParameter("netstack") && !input.GetParameter("netstack").empty())
    routing.SetNetstackInstanceKey(input.GetParameter("netstack"));
  return routing;
}

/// The network the user named ("default" or address/prefix length).
template <typename Family> typename Family::Network ParseNetwork(const std::string& text) {
  if (text == kDefaultNetwork)
    return Family::DefaultNetwork();
  return typename Family::Network(text);
}

template <typename Family> void ExecuteAdd(const Input& input, Output& output) {
  try {
    RoutingInfoImpl routing = OpenRouting(input);
    typename Family::Address gateway(input.GetParameter("gateway"));
    typename Family::Network network = ParseNetwork<Family>(input.GetParameter("network"));
    Family::Add(routing, network, gateway);
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

template <typename Family> void ExecuteRemove(const Input& input, Output& output) {
  try {
    RoutingInfoImpl routing = OpenRouting(input);
    const std::string& gatewayText = input.GetParameter("gateway");
    typename Family::Address gateway(gatewayText);
    typename Family::Network network = ParseNetwork<Family>(input.GetParameter("network"));
    if (!(network == Family::DefaultNetwork())) {
      Family::Remove(routing, network, gateway);
    } else if (gateway == Family::Running(routing) || gateway == Family::Configured(routing)) {
      // The default route is the default gateway: clearing it removes both
      // the running route and its configuration.
      Family::ClearDefaultGateway(routing);
    } else {
      output.AddErrorMessage(gatewayText + " is not a default route.");
    }
    output.SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

/// Lists the routes of the command's netstack, one row of \p command's
/// structure each.
template <typename Family, typename Command>
void ExecuteList(Command& command, const Input& input, Output& output) {
  try {
    RoutingInfoImpl routing = OpenRouting(input);
    HostCtl::Network::PortsetGetType selector;
    if (!ReadListType(input, output, selector))
      return;
    std::vector<typename Family::Route> routes = Family::Routes(routing, selector);
    auto list = MetaList::New(Fabrik::MetaObj::Struct, command.GetOutputStructure());
    list->Reserve(routes.size());
    // Every field of a row is set, so a row starts as a shallow copy of one
    // structure (its fields in order, in one allocation) rather than as a
    // fresh template: a listing may hold hundreds of thousands of rows.
    const std::shared_ptr<MetaStruct> shape = command.GetOutputStructure();
    for (const typename Family::Route& route : routes) {
      auto row = std::make_shared<MetaStruct>(*shape);
      Family::SetRouteFields(*row, route, routing);
      row->SetField(kGateway, route.GetGateway().GetStringAddress());
      row->SetField(kInterface, route.GetInterfaceName());
      list->Add(std::move(row));
    }
    output.SetRootObject(list);
  } catch (const HostCtlException& e) {
    output.AddErrorMessage(e.what());
  }
}

} // namespace

// network ip route ipv4 add

CORVEX_DEFINE_NEW(IpRouteIpv4Add)

IpRouteIpv4Add::IpRouteIpv4Add() {
  SetDescription("Add IPv4 route to the Tarvik.");
}

IpRouteIpv4Add::~IpRouteIpv4Add() = default;

std::shared_ptr<InputSpec> IpRouteIpv4Add::GetInputSpecInternal() {
  return ChangeInputSpec<Ipv4Family>(true);
}

std::shared_ptr<OutputSpec> IpRouteIpv4Add::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpRouteIpv4Add::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  ExecuteAdd<Ipv4Family>(*input, *output);
}

// network ip route ipv4 remove

CORVEX_DEFINE_NEW(IpRouteIpv4Remove)

IpRouteIpv4Remove::IpRouteIpv4Remove() {
  SetDescription("Remove IPv4 route");
}

IpRouteIpv4Remove::~IpRouteIpv4Remove() = default;

std::shared_ptr<InputSpec> IpRouteIpv4Remove::GetInputSpecInternal() {
  return ChangeInputSpec<Ipv4Family>(false);
}

std::shared_ptr<OutputSpec> IpRouteIpv4Remove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpRouteIpv4Remove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  ExecuteRemove<Ipv4Family>(*input, *output);
}

// network ip route ipv4 list

CORVEX_DEFINE_NEW(IpRouteIpv4List)

IpRouteIpv4List::IpRouteIpv4List() {
  SetDescription("List configured IPv4 routes");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Ipv4Route", kNetwork + "," + kNetmask + "," + kGateway + "," +
                                                    kInterface + "," + kSource);
}

IpRouteIpv4List::~IpRouteIpv4List() = default;

std::shared_ptr<InputSpec> IpRouteIpv4List::GetInputSpecInternal() {
  return ListInputSpec<Ipv4Family>();
}

std::shared_ptr<MetaStruct> IpRouteIpv4List::GetOutputStructure() {
  using Fabrik::MetaObj::String;
  return MakeStructure("Ipv4Route", {{kNetwork, FieldKind::String},
                                     {kNetmask, FieldKind::String},
                                     {kGateway, FieldKind::String},
                                     {kInterface, FieldKind::String},
                                     {kSource, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpRouteIpv4List::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpRouteIpv4List::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  ExecuteList<Ipv4Family>(*this, *input, *output);
}

// network ip route ipv6 add

CORVEX_DEFINE_NEW(IpRouteIpv6Add)

IpRouteIpv6Add::IpRouteIpv6Add() {
  SetDescription("Add IPv6 route to the Tarvik.");
}

IpRouteIpv6Add::~IpRouteIpv6Add() = default;

std::shared_ptr<InputSpec> IpRouteIpv6Add::GetInputSpecInternal() {
  return ChangeInputSpec<Ipv6Family>(true);
}

std::shared_ptr<OutputSpec> IpRouteIpv6Add::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpRouteIpv6Add::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  ExecuteAdd<Ipv6Family>(*input, *output);
}

// network ip route ipv6 remove

CORVEX_DEFINE_NEW(IpRouteIpv6Remove)

IpRouteIpv6Remove::IpRouteIpv6Remove() {
  SetDescription("Remove IPv6 route from the Tarvik");
}

IpRouteIpv6Remove::~IpRouteIpv6Remove() = default;

std::shared_ptr<InputSpec> IpRouteIpv6Remove::GetInputSpecInternal() {
  return ChangeInputSpec<Ipv6Family>(false);
}

std::shared_ptr<OutputSpec> IpRouteIpv6Remove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpRouteIpv6Remove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                        const std::shared_ptr<Output>& output) {
  ExecuteRemove<Ipv6Family>(*input, *output);
}

// network ip route ipv6 list

CORVEX_DEFINE_NEW(IpRouteIpv6List)

IpRouteIpv6List::IpRouteIpv6List() {
  SetDescription("List configured IPv6 routes");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:Ipv6Route",
                            kNetwork + "," + kNetmask + "," + kGateway + "," + kInterface);
}

IpRouteIpv6List::~IpRouteIpv6List() = default;

std::shared_ptr<InputSpec> IpRouteIpv6List::GetInputSpecInternal() {
  return ListInputSpec<Ipv6Family>();
}

std::shared_ptr<MetaStruct> IpRouteIpv6List::GetOutputStructure() {
  using Fabrik::MetaObj::String;
  return MakeStructure("Ipv6Route", {{kNetwork, FieldKind::String},
                                     {kNetmask, FieldKind::String},
                                     {kGateway, FieldKind::String},
                                     {kInterface, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpRouteIpv6List::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpRouteIpv6List::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  ExecuteList<Ipv6Family>(*this, *input, *output);
}

} // namespace CorvexCli::NetworkNamespace
