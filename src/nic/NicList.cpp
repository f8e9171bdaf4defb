//===- NicList.cpp - network nic list ---------------------------------------===//
//
// Lists every physical NIC with its PCI address, driver, states, speed,
// duplex, MAC address, MTU, description and backing DPU.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "nic.h"
#include "nic/PseudoDevice.h"

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Lib.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "HostCtl/SmartNic.h"

#include <cstring>
#include <vector>

namespace CorvexCli::NetworkNamespace {

using namespace Fabrik;

namespace {

const std::string kNic = "Nic";
const std::string kName = "Name";
const std::string kPciDevice = "PCI Device";
const std::string kDriver = "Driver";
const std::string kLink = "Link";
const std::string kAdminStatus = "Admin Status";
const std::string kLinkStatus = "Link Status";
const std::string kSpeed = "Speed";
const std::string kDuplex = "Duplex";
const std::string kMacAddress = "MAC Address";
const std::string kMtu = "MTU";
const std::string kDescription = "Description";
const std::string kDpuId = "DPU Id";

const char* UpDown(bool up) {
  return up ? "Up" : "Down";
}

} // namespace

void ParsePseudoDevice(const std::string& text, std::string& vendor, std::string& device) {
  vendor = "Unknown";
  device = "Unknown";
  // The description is read as a 127-character text at most.
  char buffer[128];
  std::strncpy(buffer, text.c_str(), sizeof buffer - 1);
  buffer[sizeof buffer - 1] = '\0';
  std::vector<std::string> fields;
  for (const char* p = buffer; *p;) {
    while (*p == ':')
      ++p;
    const char* start = p;
    while (*p && *p != ':')
      ++p;
    if (p > start)
      fields.emplace_back(start, p);
  }
  if (fields.empty())
    return;
  static const char* const kPrefixes[] = {"USB-NIC", "ACPI-NIC", "PhyDev"};
  for (const char* prefix : kPrefixes) {
    if (std::strncmp(buffer, prefix, std::strlen(prefix)) == 0) {
      if (fields.size() > 1)
        vendor = fields[1];
      if (fields.size() > 2)
        device = fields[2];
      return;
    }
  }
}

CORVEX_DEFINE_NEW(NicList)

NicList::NicList() {
  SetDescription("This command will list the Physical NICs currently installed and loaded on the "
                 "system.");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kNic, kName + "," + kPciDevice + "," + kDriver + "," +
                                                  kAdminStatus + "," + kLinkStatus + "," + kSpeed +
                                                  "," + kDuplex + "," + kMacAddress + "," + kMtu +
                                                  "," + kDescription);
}

NicList::~NicList() = default;

std::shared_ptr<MetaObj::MetaStruct> NicList::GetOutputStructure() {
  auto nic = MetaObj::MetaStruct::New(kNic);
  nic->SetField(kName, MetaObj::MetaString::New());
  nic->SetField(kPciDevice, MetaObj::MetaString::New());
  nic->SetField(kDriver, MetaObj::MetaString::New());
  nic->SetField(kLink, MetaObj::MetaString::New());
  nic->SetField(kAdminStatus, MetaObj::MetaString::New());
  nic->SetField(kLinkStatus, MetaObj::MetaString::New());
  nic->SetField(kSpeed, MetaObj::MetaInt::New());
  nic->SetField(kDuplex, MetaObj::MetaString::New());
  nic->SetField(kMacAddress, MetaObj::MetaString::New());
  nic->SetField(kMtu, MetaObj::MetaInt::New());
  nic->SetField(kDescription, MetaObj::MetaString::New());
  nic->SetField(kDpuId, MetaObj::MetaString::New());
  return nic;
}

std::shared_ptr<CallSpec::InputSpec> NicList::GetInputSpecInternal() {
  return CallSpec::InputSpec::New();
}

std::shared_ptr<CallSpec::OutputSpec> NicList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicList::ExecuteInternal(const std::shared_ptr<CallSpec::Input>& input,
                              const std::shared_ptr<CallSpec::Output>& output) {
  try {
    std::unique_ptr<HostCtl::Network::NetworkInfo> info =
        HostCtl::Network::NetworkFactory::GetNetworkInfo();
    auto list = MetaObj::MetaList::New(MetaObj::Struct, GetOutputStructure());
    for (const auto& nic : info->GetPnics(HostCtl::Network::PnicGetAll)) {
      if (!nic)
        continue;
      auto row = GetOutputStructure();
      const std::string name = nic->GetName();
      row->SetField(kName, name);
      std::string pci, vendor, device;
      if (auto pciDevice = nic->GetPciDevice()) {
        pci = pciDevice->GetAddress();
        vendor = pciDevice->GetVendorName();
        device = pciDevice->GetDeviceName();
      } else {
        pci = "Pseudo";
        ParsePseudoDevice(nic->GetPseudoDeviceDescription(), vendor, device);
      }
      row->SetField(kPciDevice, pci);
      row->SetField(kDriver, nic->GetDriverName());
      row->SetField(kLink, UpDown(nic->IsLinkUp()));
      row->SetField(kAdminStatus, UpDown(nic->IsAdminUp()));
      row->SetField(kLinkStatus, UpDown(nic->IsLinkStatusUp()));
      row->SetField(kSpeed, static_cast<long>(nic->GetSpeed()));
      row->SetField(kDuplex, nic->GetDuplex() == 1 ? "Full" : "Half");
      row->SetField(kMacAddress, nic->GetMacAddress().GetStringAddress());
      row->SetField(kMtu, static_cast<long>(nic->GetMtu()));
      row->SetField(kDescription, vendor + " " + device);
      std::string dpu = "N/A";
      if (auto smartNic = HostCtl::SmartNic::SmartNicInfo::GetSmartNicByPnic(name))
        dpu = smartNic->GetId();
      row->SetField(kDpuId, dpu);
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtl::Lib::HostCtlException& e) {
    output->AddErrorMessage(std::string("Unable to list NICs.  Error was ") + e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
