//===- PnicImpl.cpp - Identity, link and admin state of a physical NIC ----===//
#include "sim/PnicImpl.h"

#include "HostCtl/Lib.h"
#include "model/Store.h"

namespace Sim {

using HostCtl::Lib::HostCtlException;
using Model::Statement;
using Model::Store;

namespace {

class PciDeviceImpl : public HostCtl::Network::PciDevice {
public:
  PciDeviceImpl(std::string address, std::string vendor, std::string device)
      : address_(std::move(address)), vendor_(std::move(vendor)), device_(std::move(device)) {}
  std::string GetVendorName() const override { return vendor_; }
  std::string GetDeviceName() const override { return device_; }
  std::string GetAddress() const override { return address_; }

private:
  std::string address_; ///< PCI address.
  std::string vendor_;  ///< Vendor name.
  std::string device_;  ///< Device name.
};

} // namespace

namespace {

/// The columns of a NIC's basic state, as ReadPnicRow reads them.
#define PNIC_COLUMNS                                                                               \
  "name, pci_address, vendor, device, pseudo_desc, driver, admin_up, link_up, speed, duplex, "     \
  "mac, mtu FROM pnic "
enum PnicColumn {
  kName,
  kPciAddress,
  kVendor,
  kDevice,
  kPseudoDesc,
  kDriver,
  kAdminUp,
  kLinkUp,
  kSpeed,
  kDuplex,
  kMac,
  kMtu
};

/// One row of PNIC_COLUMNS.
PnicData ReadPnicRow(const Statement& row) {
  PnicData data;
  data.name = row.Text(kName);
  data.hasPci = !row.IsNull(kPciAddress);
  data.pciAddress = row.Text(kPciAddress);
  data.vendor = row.Text(kVendor);
  data.device = row.Text(kDevice);
  data.pseudoDevice = row.Text(kPseudoDesc);
  data.driver = row.Text(kDriver);
  data.adminUp = row.Bool(kAdminUp);
  data.carrier = row.Bool(kLinkUp);
  data.speed = static_cast<uint32_t>(row.Int(kSpeed));
  data.duplex = static_cast<uint32_t>(row.Int(kDuplex));
  data.mac = row.Text(kMac);
  data.mtu = static_cast<uint32_t>(row.Int(kMtu));
  return data;
}

} // namespace

bool LoadPnicData(Store& store, const std::string& name, PnicData& data) {
  Statement row = store.Prepare("SELECT " PNIC_COLUMNS "WHERE name = ?");
  row.Bind(1, name);
  if (!row.Step())
    return false;
  data = ReadPnicRow(row);
  return true;
}

std::vector<PnicData> ListPnicData(Store& store) {
  std::vector<PnicData> nics;
  Statement rows = store.Prepare("SELECT " PNIC_COLUMNS "ORDER BY ord");
  while (rows.Step())
    nics.push_back(ReadPnicRow(rows));
  return nics;
}

PnicImpl::PnicImpl(std::string name) : stale_(true) {
  data_.name = std::move(name);
}

PnicImpl::PnicImpl(PnicData data) : data_(std::move(data)), stale_(false) {}

PnicImpl::~PnicImpl() = default;

bool PnicImpl::IsValidPnic(const std::string& name) {
  Store& store = Store::Host();
  return store.Read([&] {
    Statement row = store.Prepare("SELECT 1 FROM pnic WHERE name = ?");
    row.Bind(1, name);
    return row.Step();
  });
}

const PnicData& PnicImpl::Data() const {
  if (stale_) {
    Store& store = Store::Host();
    store.CheckFault("GetPnic", data_.name);
    bool found = store.Read([&] { return LoadPnicData(store, data_.name, data_); });
    if (!found)
      throw HostCtlException("There is no physical NIC named " + data_.name + " on this host");
    stale_ = false;
  }
  return data_;
}

void PnicImpl::Refresh() {
  stale_ = true;
}

std::string PnicImpl::GetName() const {
  return data_.name;
}

std::unique_ptr<HostCtl::Network::PciDevice> PnicImpl::GetPciDevice() const {
  const PnicData& data = Data();
  if (!data.hasPci)
    return nullptr;
  return std::make_unique<PciDeviceImpl>(data.pciAddress, data.vendor, data.device);
}

uint32_t PnicImpl::GetDuplex() const {
  return Data().duplex;
}

bool PnicImpl::IsLinkUp() const {
  const PnicData& data = Data();
  return data.adminUp && data.carrier;
}

bool PnicImpl::IsLinkStatusUp() const {
  return Data().carrier;
}

bool PnicImpl::IsAdminUp() const {
  return Data().adminUp;
}

uint32_t PnicImpl::GetSpeed() const {
  const PnicData& data = Data();
  return data.adminUp && data.carrier ? data.speed : 0;
}

std::string PnicImpl::GetDriverName() const {
  return Data().driver;
}

HostCtl::Network::MacAddress PnicImpl::GetMacAddress() const {
  return HostCtl::Network::MacAddress(Data().mac);
}

uint32_t PnicImpl::GetMtu() const {
  return Data().mtu;
}

std::string PnicImpl::GetPseudoDeviceDescription() const {
  return Data().pseudoDevice;
}

void PnicImpl::SetAdminStatus(bool up) {
  Store& store = Store::Host();
  store.CheckFault("SetAdminStatus", data_.name);
  store.Write([&] {
    Statement update = store.Prepare("UPDATE pnic SET admin_up = ? WHERE name = ?");
    update.BindAll(up, data_.name).Run();
    if (store.Changes() == 0)
      throw HostCtlException("There is no physical NIC named " + data_.name + " on this host");
  });
  stale_ = true;
}

} // namespace Sim
