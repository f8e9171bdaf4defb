//===- PortStats.cpp - Port and port filter statistics commands -----------===//
//
// network port stats get and network port filter stats get: the packet and
// byte counters of one virtual port, and the counters of its active filters.
//
//===----------------------------------------------------------------------===//
#include "common/FieldTable.h"
#include "datapath.h"

#include "HostCtl/Lib.h"
#include "TvkCtl/Network/Switching.h"
#include "common/ParameterTable.h"

#include <algorithm>
#include <cstdlib>

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaInt;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaString;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::FilterStats;
using HostCtl::Network::PacketStats;
using HostCtl::Network::Port;
using TvkCtl::Network::VirtualSwitchInfoImpl;

namespace {

const std::string kPortIdParam = "portid";

const std::string kPortStruct = "Port";
const std::string kPortIdField = "Port ID";
const std::string kPacketsReceivedField = "Packets received";
const std::string kPacketsSentField = "Packets sent";
const std::string kBytesReceivedField = "Bytes received";
const std::string kBytesSentField = "Bytes sent";
const std::string kBroadcastReceivedField = "Broadcast packets received";
const std::string kBroadcastSentField = "Broadcast packets sent";
const std::string kMulticastReceivedField = "Multicast packets received";
const std::string kMulticastSentField = "Multicast packets sent";
const std::string kUnicastReceivedField = "Unicast packets received";
const std::string kUnicastSentField = "Unicast packets sent";
const std::string kReceiveDroppedField = "Receive packets dropped";
const std::string kTransmitDroppedField = "Transmit packets dropped";

/// The counter fields of "Port", in structure order (after "Port ID").
const std::string* const kPortCounterFields[] = {
    &kPacketsReceivedField,   &kPacketsSentField,       &kBytesReceivedField,
    &kBytesSentField,         &kBroadcastReceivedField, &kBroadcastSentField,
    &kMulticastReceivedField, &kMulticastSentField,     &kUnicastReceivedField,
    &kUnicastSentField,       &kReceiveDroppedField,    &kTransmitDroppedField};

const std::string kFilterStruct = "Filter";
const std::string kFilterNameField = "Filter name";
const std::string kFilterDirectionField = "Filter direction";

/// A counter of a filter record.
struct FilterCounter {
  const char* field;              ///< Field of "Filter".
  uint64_t FilterStats::*counter; ///< The record's counter.
  bool extended;                  ///< Kept only by filters with extended counters.
};

const FilterCounter kFilterCounters[] = {
    {"Packets in", &FilterStats::packetsIn, false},
    {"Packets out", &FilterStats::packetsOut, false},
    {"Packets dropped", &FilterStats::packetsDropped, false},
    {"Packets filtered", &FilterStats::packetsFiltered, true},
    {"Packets faulted", &FilterStats::packetsFaulted, true},
    {"Packets queued", &FilterStats::packetsQueued, true},
    {"Packets injected", &FilterStats::packetsInjected, true},
    {"Packet errors", &FilterStats::packetErrors, true},
};

/// Port kind whose filter directions are reversed.
constexpr int kReversedPortKind = 4;

const ParameterDef kStatsParameters[] = {
    {kPortIdParam, "p", Fabrik::CallSpec::Integer, true, "Port ID for the port to get statistics."},
};

const ParameterDef kFilterStatsParameters[] = {
    {kPortIdParam, "p", Fabrik::CallSpec::Integer, true,
     "Port ID for the port to get filter statistics."},
};

/// The first port of any switch with id \p id, or null.
std::unique_ptr<Port> FindPort(int64_t id) {
  VirtualSwitchInfoImpl switches;
  for (const auto& portset : switches.GetAllSwitches()) {
    if (!portset)
      continue;
    for (auto& port : portset->GetPorts())
      if (port->GetId() == id)
        return std::move(port);
  }
  return nullptr;
}

/// The requested port id, converted from the text as typed.
int64_t RequestedPort(const Input& input) {
  return std::strtol(input.GetParameter(kPortIdParam).c_str(), nullptr, 10);
}

/// Counters are shown as the framework's signed integers.
long Shown(uint64_t counter) {
  return static_cast<long>(counter);
}

std::string JoinFields(const std::vector<std::string>& fields) {
  std::string out;
  for (const std::string& field : fields)
    out += (out.empty() ? "" : ",") + field;
  return out;
}

} // namespace

bool sortFilterStats(const FilterStats& a, const FilterStats& b) {
  if (a.direction != b.direction)
    return !a.direction;
  // std::string compares bytes as unsigned characters.
  return a.direction ? b.sortKey < a.sortKey : a.sortKey < b.sortKey;
}

uint64_t UnicastPackets(uint64_t total, uint64_t multicast, uint64_t broadcast) {
  return total - (multicast + broadcast);
}

// network port stats get

CORVEX_DEFINE_NEW(PortStatsGet)

PortStatsGet::PortStatsGet() {
  SetDescription("Packet statistics for a given port.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kPortStruct, "Packet statistics for port %Port ID%");
  std::vector<std::string> fields;
  for (const std::string* field : kPortCounterFields)
    fields.push_back(*field);
  SetDefaultOutputParameter("fields:" + kPortStruct, JoinFields(fields));
}

PortStatsGet::~PortStatsGet() = default;

std::shared_ptr<InputSpec> PortStatsGet::GetInputSpecInternal() {
  return MakeInputSpec(kStatsParameters);
}

std::shared_ptr<MetaStruct> PortStatsGet::GetOutputStructure() {
  auto structure = MetaStruct::New(kPortStruct);
  structure->SetField(kPortIdField, MetaInt::New());
  for (const std::string* field : kPortCounterFields)
    structure->SetField(*field, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> PortStatsGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void PortStatsGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                   const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<Port> port = FindPort(RequestedPort(*input));
    if (!port) {
      output->AddErrorMessage("Couldn't find requested port");
      return;
    }
    PacketStats packets{};
    HostCtl::Network::PortStats bytes{};
    port->GetPortStats(bytes);
    port->GetPacketStats(packets);
    auto row = GetOutputStructure();
    row->SetField(kPortIdField, static_cast<long>(port->GetId()));
    row->SetField(kPacketsReceivedField, Shown(packets.packetsReceived));
    row->SetField(kPacketsSentField, Shown(packets.packetsSent));
    row->SetField(kBytesReceivedField, Shown(bytes.bytesReceived));
    row->SetField(kBytesSentField, Shown(bytes.bytesSent));
    row->SetField(kBroadcastReceivedField, Shown(packets.broadcastPacketsReceived));
    row->SetField(kBroadcastSentField, Shown(packets.broadcastPacketsSent));
    row->SetField(kMulticastReceivedField, Shown(packets.multicastPacketsReceived));
    row->SetField(kMulticastSentField, Shown(packets.multicastPacketsSent));
    row->SetField(kUnicastReceivedField,
                  Shown(UnicastPackets(packets.packetsReceived, packets.multicastPacketsReceived,
                                       packets.broadcastPacketsReceived)));
    row->SetField(kUnicastSentField,
                  Shown(UnicastPackets(packets.packetsSent, packets.multicastPacketsSent,
                                       packets.broadcastPacketsSent)));
    row->SetField(kReceiveDroppedField, Shown(packets.receiveDropped));
    row->SetField(kTransmitDroppedField, Shown(packets.transmitDropped));
    auto result = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    result->Add(row);
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network port filter stats get

CORVEX_DEFINE_NEW(PortFilterStatsGet)

PortFilterStatsGet::PortFilterStatsGet() {
  SetDescription("Filter statistics for a given port.");
  SetDefaultOutputFormatter("simple");
  SetDefaultOutputParameter("header:" + kFilterStruct, "Filter statistics for %Filter name%");
  std::vector<std::string> fields = {kFilterDirectionField};
  for (const FilterCounter& counter : kFilterCounters)
    fields.push_back(counter.field);
  SetDefaultOutputParameter("fields:" + kFilterStruct, JoinFields(fields));
}

PortFilterStatsGet::~PortFilterStatsGet() = default;

std::shared_ptr<InputSpec> PortFilterStatsGet::GetInputSpecInternal() {
  return MakeInputSpec(kFilterStatsParameters);
}

std::shared_ptr<MetaStruct> PortFilterStatsGet::GetOutputStructure() {
  auto structure = MetaStruct::New(kFilterStruct);
  structure->SetField(kFilterNameField, MetaString::New());
  structure->SetField(kFilterDirectionField, MetaString::New());
  for (const FilterCounter& counter : kFilterCounters)
    structure->SetField(counter.field, MetaInt::New());
  return structure;
}

std::shared_ptr<OutputSpec> PortFilterStatsGet::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void PortFilterStatsGet::ExecuteInternal(const std::shared_ptr<Input>& input,
                                         const std::shared_ptr<Output>& output) {
  try {
    std::unique_ptr<Port> port = FindPort(RequestedPort(*input));
    if (!port) {
      output->AddErrorMessage("Couldn't find requested port");
      return;
    }
    std::vector<std::unique_ptr<FilterStats>> filters = port->GetFilterStats();
    std::sort(filters.begin(), filters.end(),
              [](const auto& a, const auto& b) { return sortFilterStats(*a, *b); });
    bool reversed = port->GetType() == kReversedPortKind;
    auto result = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const auto& filter : filters) {
      if (!filter->active)
        continue;
      auto row = GetOutputStructure();
      row->SetField(kFilterNameField, filter->name);
      row->SetField(kFilterDirectionField, filter->direction == reversed ? "Receive" : "Transmit");
      for (const FilterCounter& counter : kFilterCounters)
        if (!counter.extended || filter->extended)
          row->SetField(counter.field, Shown((*filter).*counter.counter));
      result->Add(row);
    }
    output->SetRootObject(result);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
