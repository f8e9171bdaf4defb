//===- IpSecConfigImpl.cpp - The kernel's IPsec databases -----------------===//
#include "sim/IpSecConfigImpl.h"

#include "HostCtl/Lib.h"
#include "model/IpServicesModel.h"
#include "model/Store.h"

#include <algorithm>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpSecSadParam;
using HostCtl::Network::IpSecSpdParam;
using Model::Statement;
using Model::Store;

IpSecConfigImpl::IpSecConfigImpl() = default;
IpSecConfigImpl::~IpSecConfigImpl() = default;

void IpSecConfigImpl::AddSADConfig(const IpSecSadParam& sa) {
  Store& store = Store::Host();
  store.CheckFault("AddSADConfig", sa.name);
  if (sa.name == "auto")
    throw HostCtlException("The SA name auto is reserved for SAs made by key exchange");
  IpSecSadParam added = sa;
  added.state = 1; // A manually keyed SA is mature at once.
  added.lifetime = 0;
  store.Write([&] { Model::IpSvc::InsertSa(store, added); });
}

namespace {

/// Marks the policies bound to SA \p name as having lost their SA.
void OrphanPolicies(Store& store, const std::string& name) {
  store.Prepare("UPDATE ipsvc_ipsec_sp SET sa_name = '', sa_lost = 1 WHERE sa_name = ?")
      .Bind(1, name)
      .Run();
}

} // namespace

void IpSecConfigImpl::RemoveSADConfig(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("RemoveSADConfig", name);
  store.Write([&] {
    if (name != "auto")
      store.Prepare("DELETE FROM ipsvc_ipsec_sa WHERE name = ?").Bind(1, name).Run();
    if (name == "auto" || store.Changes() == 0)
      throw HostCtlException("No SA named " + name + " exists");
    OrphanPolicies(store, name);
  });
}

void IpSecConfigImpl::RemoveAutoSADConfig(const IpSecSadParam& sa) {
  Store& store = Store::Host();
  store.CheckFault("RemoveAutoSADConfig", sa.name);
  std::string source = HostCtl::Network::Ipv6Address(sa.srcAddress).GetStringAddress();
  std::string destination = HostCtl::Network::Ipv6Address(sa.dstAddress).GetStringAddress();
  store.Write([&] {
    store
        .Prepare("DELETE FROM ipsvc_ipsec_sa WHERE name = 'auto' AND source = ? AND destination "
                 "= ? AND spi = ?")
        .BindAll(source, destination, static_cast<int64_t>(sa.spi))
        .Run();
    if (store.Changes() == 0)
      throw HostCtlException("No auto SA from " + source + " to " + destination +
                             " with that SPI exists");
  });
}

void IpSecConfigImpl::FlushSADConfig() {
  Store& store = Store::Host();
  store.CheckFault("FlushSADConfig", "*");
  store.Write([&] {
    store.Exec("UPDATE ipsvc_ipsec_sp SET sa_name = '', sa_lost = 1 WHERE sa_name <> ''");
    store.Exec("DELETE FROM ipsvc_ipsec_sa");
  });
}

void IpSecConfigImpl::GetSADConfigList(std::vector<IpSecSadParam>& list) {
  Store& store = Store::Host();
  store.CheckFault("GetSADConfigList", "*");
  store.Read([&] {
    Statement rows = store.Prepare(
        "SELECT name, source, destination, spi, mode, encryption, integrity, encryption_key, "
        "integrity_key, state, lifetime FROM ipsvc_ipsec_sa ORDER BY id");
    enum {
      kName,
      kSource,
      kDestination,
      kSpi,
      kMode,
      kEncryption,
      kIntegrity,
      kEncryptionKey,
      kIntegrityKey,
      kState,
      kLifetime
    };
    while (rows.Step()) {
      IpSecSadParam sa;
      sa.name = rows.Text(kName);
      sa.srcAddress = rows.Text(kSource);
      sa.dstAddress = rows.Text(kDestination);
      sa.spi = static_cast<uint32_t>(rows.Int(kSpi));
      sa.mode = static_cast<int>(rows.Int(kMode));
      sa.encryptionAlgorithm = static_cast<int>(rows.Int(kEncryption));
      sa.integrityAlgorithm = static_cast<int>(rows.Int(kIntegrity));
      sa.encryptionKey = rows.Text(kEncryptionKey);
      sa.integrityKey = rows.Text(kIntegrityKey);
      sa.state = static_cast<int>(rows.Int(kState));
      sa.lifetime = static_cast<uint64_t>(rows.Int(kLifetime));
      list.push_back(std::move(sa));
    }
  });
}

void IpSecConfigImpl::AddSPDConfig(const IpSecSpdParam& sp) {
  Store& store = Store::Host();
  store.CheckFault("AddSPDConfig", sp.name);
  if (sp.saName == "UNKNOWN" || sp.saName == "auto")
    throw HostCtlException("No SA named " + sp.saName + " exists");
  store.Write([&] { Model::IpSvc::InsertSp(store, sp); });
}

void IpSecConfigImpl::RemoveSPDConfig(const std::string& name) {
  Store& store = Store::Host();
  store.CheckFault("RemoveSPDConfig", name);
  store.Write([&] {
    store.Prepare("DELETE FROM ipsvc_ipsec_sp WHERE name = ?").Bind(1, name).Run();
    if (store.Changes() == 0)
      throw HostCtlException("No SP named " + name + " exists");
  });
}

void IpSecConfigImpl::FlushSPDConfig() {
  Store& store = Store::Host();
  store.CheckFault("FlushSPDConfig", "*");
  store.Write([&] { store.Exec("DELETE FROM ipsvc_ipsec_sp"); });
}

void IpSecConfigImpl::GetSPDConfigList(std::vector<IpSecSpdParam>& list) {
  Store& store = Store::Host();
  store.CheckFault("GetSPDConfigList", "*");
  store.Read([&] {
    Statement rows = store.Prepare(
        "SELECT name, source, source_prefix, source_port, destination, destination_prefix, "
        "destination_port, protocol, direction, action, mode, sa_name, sa_lost FROM "
        "ipsvc_ipsec_sp ORDER BY id");
    enum {
      kName,
      kSource,
      kSourcePrefix,
      kSourcePort,
      kDestination,
      kDestinationPrefix,
      kDestinationPort,
      kProtocol,
      kDirection,
      kAction,
      kMode,
      kSaName,
      kSaLost
    };
    while (rows.Step()) {
      IpSecSpdParam sp;
      sp.name = rows.Text(kName);
      sp.srcAddress = rows.Text(kSource);
      sp.srcPrefixLength = static_cast<int>(rows.Int(kSourcePrefix));
      sp.srcPort = static_cast<uint32_t>(rows.Int(kSourcePort));
      sp.dstAddress = rows.Text(kDestination);
      sp.dstPrefixLength = static_cast<int>(rows.Int(kDestinationPrefix));
      sp.dstPort = static_cast<uint32_t>(rows.Int(kDestinationPort));
      sp.ulProto = static_cast<int>(rows.Int(kProtocol));
      sp.direction = static_cast<int>(rows.Int(kDirection));
      sp.action = static_cast<int>(rows.Int(kAction));
      sp.mode = static_cast<int>(rows.Int(kMode));
      sp.saName = rows.Bool(kSaLost) ? std::string("UNKNOWN") : rows.Text(kSaName);
      list.push_back(std::move(sp));
    }
  });
}

} // namespace Sim
