//===- TvkNicAttach.cpp - Kernel interfaces on their connection points ----===//
//
// Adding, removing and describing the attachment of kernel interfaces: each
// interface has one port on a port group, a DV port or an opaque network.
// A port group or DV port takes one kernel interface at most; a new interface
// gets the lowest free name and a fresh MAC unless told otherwise.
//
//===----------------------------------------------------------------------===//
#include "sim/TvkNicImpl.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetstackInstance.h"
#include "HostCtl/Network/Switching.h"
#include "model/IpModel.h"
#include "model/Store.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::ConnectionPoint;
using HostCtl::Network::DVPortParam;
using HostCtl::Network::IpConfig;
using HostCtl::Network::MacAddress;
using HostCtl::Network::OpaqueNetworkParam;
using Model::Statement;
using Model::Store;
namespace Ip = Model::Ip;

void WriteIpConfig(Store& store, const std::string& name, const IpConfig& config);

namespace {

/// The connection point of an existing interface, as its rows say.
class TvkNicPointImpl : public ConnectionPoint {
public:
  TvkNicPointImpl(Ip::Attachment attachment, std::string switchUuid)
      : a_(std::move(attachment)), uuid_(std::move(switchUuid)) {}
  std::string GetPortsetName() const override { return a_.portsetName; }
  int GetType() const override { return a_.kind; }
  std::string GetPortGroupName() const override { return a_.portgroupName; }
  DVPortParam GetDVPortParam() const override {
    return a_.kind == 2 ? DVPortParam{uuid_, a_.dvportKey, a_.connectionId} : DVPortParam{};
  }
  OpaqueNetworkParam GetOpaqueNetworkParam() const override {
    return a_.kind == 3 ? OpaqueNetworkParam{a_.opaqueId, a_.opaqueType, a_.externalId}
                        : OpaqueNetworkParam{};
  }
  bool IsValid() const override { return true; }

private:
  Ip::Attachment a_; ///< Where the interface is attached.
  std::string uuid_; ///< UUID of a distributed switch.
};

/// What the caller's connection point names, read through its interface
/// (before the write transaction opens).
struct PointRequest {
  int kind = 0;              ///< Connection point type.
  std::string portsetName;   ///< Switch name.
  std::string portgroupName; ///< Type 1.
  DVPortParam dvport;        ///< Type 2.
  OpaqueNetworkParam opaque; ///< Type 3.
};

PointRequest ReadPoint(ConnectionPoint* point) {
  if (!point)
    throw HostCtlException("A connection point is required for a Tarvik network interface");
  PointRequest request;
  request.kind = point->GetType();
  switch (request.kind) {
  case ConnectionPoint::CONNECTION_PORTGROUP:
    request.portgroupName = point->GetPortGroupName();
    break;
  case ConnectionPoint::CONNECTION_DVPORT:
    request.portsetName = point->GetPortsetName();
    request.dvport = point->GetDVPortParam();
    break;
  case ConnectionPoint::CONNECTION_OPAQUE:
    request.portsetName = point->GetPortsetName();
    request.opaque = point->GetOpaqueNetworkParam();
    break;
  default:
    throw HostCtlException("Unknown connection point type " + std::to_string(request.kind));
  }
  return request;
}

/// The rows the request names (inside a transaction); throws when the host
/// does not have them.
Ip::Attachment Resolve(Store& store, const PointRequest& request) {
  Ip::Attachment a;
  a.kind = request.kind;
  if (request.kind == ConnectionPoint::CONNECTION_PORTGROUP) {
    Statement row = store.Prepare("SELECT pg.id, s.id, s.name, s.mtu FROM portgroup pg JOIN "
                                  "portset s ON s.id = pg.portset_id WHERE pg.name = ?");
    enum { kPortgroupId, kPortsetId, kPortsetName, kMtu };
    row.Bind(1, request.portgroupName);
    if (!row.Step())
      throw HostCtlException("Port group " + request.portgroupName + " does not exist");
    a.portgroupId = row.Int(kPortgroupId);
    a.portsetId = row.Int(kPortsetId);
    a.portsetName = row.Text(kPortsetName);
    a.portsetMtu = row.Int(kMtu);
    a.portgroupName = request.portgroupName;
    return a;
  }
  const char* kind = request.kind == ConnectionPoint::CONNECTION_DVPORT ? "dvs" : "opaque";
  Statement row = store.Prepare("SELECT id, mtu FROM portset WHERE name = ? AND kind = ?");
  enum { kId, kMtu };
  row.BindAll(request.portsetName, kind);
  if (request.portsetName.empty() || !row.Step())
    throw HostCtlException("The switch of the connection point does not exist");
  a.portsetId = row.Int(kId);
  a.portsetMtu = row.Int(kMtu);
  a.portsetName = request.portsetName;
  if (request.kind == ConnectionPoint::CONNECTION_DVPORT) {
    a.dvportKey = request.dvport.portId;
    Statement port = store.Prepare("SELECT 1 FROM dvport WHERE portset_id = ? AND port_key = ?");
    port.BindAll(a.portsetId, a.dvportKey);
    if (!port.Step())
      throw HostCtlException("Distributed switch " + a.portsetName + " has no port " + a.dvportKey);
  } else {
    a.opaqueId = request.opaque.networkId;
    a.opaqueType = request.opaque.networkType;
    a.externalId = request.opaque.externalId;
  }
  return a;
}

/// The lowest free interface name.
std::string FreeName(Store& store) {
  std::vector<bool> used(256, false);
  Statement rows = store.Prepare("SELECT name FROM tvknic");
  enum { kName };
  while (rows.Step()) {
    int number = Ip::TvkNicNumber(rows.Text(kName));
    if (number >= 0)
      used[static_cast<std::size_t>(number)] = true;
  }
  for (int i = 0; i < 256; ++i)
    if (!used[static_cast<std::size_t>(i)])
      return "tvk" + std::to_string(i);
  throw HostCtlException("All 256 Tarvik network interface names are in use");
}

} // namespace

std::unique_ptr<ConnectionPoint> TvkNicImpl::GetConnectionPoint() {
  Store& store = Store::Host();
  store.CheckFault("GetConnectionPoint", data_.name);
  return store.Read([&]() -> std::unique_ptr<ConnectionPoint> {
    Ip::Attachment a = Ip::AttachmentOf(store, data_.name);
    if (a.kind == 0)
      return nullptr;
    std::string uuid;
    if (a.kind == 2) {
      Statement row = store.Prepare("SELECT uuid FROM dvswitch WHERE portset_id = ?");
      enum { kUuid };
      row.Bind(1, a.portsetId);
      if (row.Step())
        uuid = row.Text(kUuid);
    }
    return std::make_unique<TvkNicPointImpl>(std::move(a), std::move(uuid));
  });
}

std::unique_ptr<HostCtl::Network::TvkNic>
TvKernelNicInfoImpl::AddTvKernelNic(ConnectionPoint* point, const std::string& netstack,
                                    const IpConfig& config, const MacAddress& mac,
                                    uint32_t /*flags*/, uint32_t mtu, uint32_t rxQueues,
                                    const std::string& name, bool /*persistOnly*/) {
  Store& store = Store::Host();
  store.CheckFault("AddTvKernelNic", name.empty() ? netstack : name);
  PointRequest request = ReadPoint(point);
  if (!name.empty() && !Ip::IsValidTvkNicName(name))
    throw HostCtlException("Invalid interface name " + name +
                           "; it must be tvk0 to tvk255 without leading zeros");
  if (mtu != 0 &&
      (mtu < HostCtl::Network::TvkNic::MIN_MTU || mtu > HostCtl::Network::TvkNic::MAX_MTU))
    throw HostCtlException("MTU " + std::to_string(mtu) + " is out of range; it must be " +
                           std::to_string(HostCtl::Network::TvkNic::MIN_MTU) + " to " +
                           std::to_string(HostCtl::Network::TvkNic::MAX_MTU));
  if (rxQueues > 1000)
    throw HostCtlException("The number of RX dispatch queues must be 1 to 1000");
  if (!mac.IsUnset() && mac.IsMulticast())
    throw HostCtlException("MAC address " + mac.GetStringAddress() + " is not a unicast address");
  std::string chosen = store.Write([&] {
    Statement stack = store.Prepare("SELECT state FROM netstack WHERE key = ?");
    enum { kState };
    stack.Bind(1, netstack);
    if (!stack.Step())
      throw HostCtlException("Netstack instance " + netstack + " does not exist");
    if (stack.Int(kState) != HostCtl::Network::NetstackInstance::STATE_ENABLED)
      throw HostCtlException("Netstack instance " + netstack +
                             " is not created in the kernel; enable it first");
    std::string nicName = name.empty() ? FreeName(store) : name;
    Statement taken = store.Prepare("SELECT 1 FROM tvknic WHERE name = ?");
    taken.Bind(1, nicName);
    if (taken.Step())
      throw HostCtlException("Tarvik network interface " + nicName + " already exists");
    Ip::Attachment a = Resolve(store, request);
    uint32_t nicMtu = mtu != 0 ? mtu : 1500;
    if (nicMtu > a.portsetMtu)
      throw HostCtlException("MTU " + std::to_string(nicMtu) + " is above the MTU " +
                             std::to_string(a.portsetMtu) + " of switch " + a.portsetName);
    std::string macText;
    if (mac.IsUnset()) {
      macText = Ip::FreshMac(store, static_cast<uint32_t>(Ip::TvkNicNumber(nicName)) << 8);
    } else {
      macText = mac.GetStringAddress();
      if (Ip::MacInUse(store, macText))
        throw HostCtlException("MAC address " + macText +
                               " is already used by another interface or NIC");
    }
    Statement ord = store.Prepare("SELECT coalesce(max(ord), -1) + 1 AS next_ord FROM tvknic");
    enum { kNextOrd };
    ord.Step();
    store.Prepare("INSERT INTO tvknic(name, ord, netstack, mac, mtu) VALUES(?, ?, ?, ?, ?)")
        .BindAll(nicName, ord.Int(kNextOrd), netstack, macText, nicMtu)
        .Run();
    store
        .Prepare("UPDATE tvknic SET rx_queues = ?, opaque_id = ?, opaque_type = ?, external_id = ? "
                 "WHERE name = ?")
        .BindAll(rxQueues != 0 ? rxQueues : 1u, a.opaqueId, a.opaqueType, a.externalId, nicName)
        .Run();
    int64_t portId = Ip::AttachPort(store, nicName, a, std::nullopt);
    store.Prepare("UPDATE tvknic SET port_id = ? WHERE name = ?").BindAll(portId, nicName).Run();
    WriteIpConfig(store, nicName, config);
    return nicName;
  });
  return std::make_unique<TvkNicImpl>(chosen);
}

void TvKernelNicInfoImpl::RemoveTvKernelNic(ConnectionPoint* point, const std::string& netstack) {
  Store& store = Store::Host();
  store.CheckFault("RemoveTvKernelNic", netstack);
  PointRequest request = ReadPoint(point);
  store.Write([&] {
    Ip::Attachment a = Resolve(store, request);
    Statement row = store.Prepare(
        "SELECT t.name, t.netstack FROM tvknic t JOIN port p ON p.id = t.port_id WHERE "
        "p.portset_id = ? AND ((?2 > 0 AND p.portgroup_id = ?2) OR (?3 <> '' AND p.dvport_key = "
        "?3) OR (?4 = 3 AND p.portgroup_id IS NULL AND p.dvport_key IS NULL))");
    enum { kName, kNetstack };
    row.BindAll(a.portsetId, a.portgroupId, a.dvportKey, a.kind);
    std::string where = a.kind == 1   ? "port group " + a.portgroupName
                        : a.kind == 2 ? "DVPort " + a.dvportKey + " of " + a.portsetName
                                      : "opaque switch " + a.portsetName;
    while (row.Step()) {
      if (row.Text(kNetstack) != netstack)
        continue;
      Ip::DeleteInterface(store, row.Text(kName));
      return;
    }
    throw HostCtlException("No Tarvik network interface of netstack " + netstack + " is on " +
                           where);
  });
}

} // namespace Sim
