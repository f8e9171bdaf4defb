//===- PnicHw.cpp - Hardware settings of a physical NIC -------------------===//
//
// Offloads, interrupt coalescing, rings, NetQueue, software simulation,
// EEPROM, registers, self test and hardware capabilities of the simulated
// NICs. Each operation checks for a declared fault, then reads or changes the
// NIC's record in one transaction; the host refuses what a real NIC refuses.
//
//===----------------------------------------------------------------------===//
#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "model/NicHwModel.h"
#include "sim/PnicImpl.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <iterator>
#include <sys/stat.h>

namespace Sim {

using HostCtl::Lib::HostCtlException;
using HostCtl::Misc::StrPrintf;
using Model::Store;
using namespace HostCtl::Network;

namespace {

/// What a NIC without a record of a kind answers.
struct MissingText {
  const char* kind; ///< Record kind.
  const char* text; ///< Follows the NIC name.
};

constexpr MissingText kMissingTexts[] = {
    {"offload", " does not report offload settings"},
    {"coalesce", " does not support interrupt coalescing"},
    {"ring", " does not report ring buffer parameters"},
    {"netqueue", " does not support NetQueue"},
    {"softwareSimulation", " does not support software simulation of offloads"},
    {"eeprom", " has no EEPROM that can be accessed"},
    {"registers", " does not support register dumps"},
    {"selfTest", " does not support self tests"},
    {"hwCap", " does not report hardware capabilities"},
};

/// The record of kind \p kind of NIC \p nic; call inside a transaction.
template <typename Record>
Record LoadRecord(Store& store, const std::string& nic, const char* kind) {
  if (!Model::NicHwPnicExists(store, nic))
    throw HostCtlException("There is no physical NIC named " + nic + " on this host");
  std::string text;
  if (!Model::LoadNicHwRecord(store, nic, kind, text)) {
    const MissingText* missing =
        std::find_if(std::begin(kMissingTexts), std::end(kMissingTexts),
                     [&](const MissingText& m) { return std::strcmp(m.kind, kind) == 0; });
    throw HostCtlException(nic + missing->text);
  }
  Record record{};
  try {
    Model::Decode(nlohmann::ordered_json::parse(text), nic + "." + kind, record);
  } catch (const std::exception& e) {
    throw HostCtlException("The stored " + std::string(kind) + " record of " + nic +
                           " is damaged: " + e.what());
  }
  return record;
}

/// Reads a record in a read transaction, after the fault check of \p operation.
template <typename Record>
Record ReadRecord(const char* operation, const std::string& nic, const char* kind) {
  Store& store = Store::Host();
  store.CheckFault(operation, nic);
  return store.Read([&] { return LoadRecord<Record>(store, nic, kind); });
}

/// Changes a record in one write transaction: \p change edits it (and may
/// throw to refuse), then it is stored.
template <typename Record, typename Change>
void ChangeRecord(const char* operation, const std::string& nic, const char* kind, Change change) {
  Store& store = Store::Host();
  store.CheckFault(operation, nic);
  store.Write([&] {
    Record record = LoadRecord<Record>(store, nic, kind);
    change(record);
    Model::SaveNicHwRecord(store, nic, kind, Model::Encode(record));
  });
}

/// An offload flag and the mask bit that selects it.
struct OffloadFlag {
  uint8_t bit;                     ///< PnicOffloadMask bit.
  bool PnicOffloadSettings::*flag; ///< The flag.
};

constexpr OffloadFlag kOffloadFlags[] = {
    {OffloadRxChecksum, &PnicOffloadSettings::rxChecksum},
    {OffloadTxChecksum, &PnicOffloadSettings::txChecksum},
    {OffloadScatterGather, &PnicOffloadSettings::scatterGather},
    {OffloadTso, &PnicOffloadSettings::tso},
};

constexpr uint8_t kOffloadMaskAll =
    OffloadRxChecksum | OffloadTxChecksum | OffloadScatterGather | OffloadTso;

/// Checks a NetQueue count against the NIC's limit.
void CheckQueueCount(const std::string& nic, const char* direction, uint32_t count, uint32_t max) {
  if (max == 0)
    throw HostCtlException(nic + " has no " + direction + " netqueues to configure");
  if (count < 1 || count > max)
    throw HostCtlException(StrPrintf("The %s netqueue count of %s must be between 1 and %u, not %u",
                                     direction, nic.c_str(), max, count));
}

/// Refuses a wrong EEPROM key.
void CheckMagic(const std::string& nic, const Model::EepromState& eeprom, uint32_t magic) {
  if (magic != eeprom.magic)
    throw HostCtlException("Wrong magic key for the EEPROM of " + nic);
}

/// The contents of the EEPROM image file \p file, at most \p limit bytes.
std::vector<uint8_t> ReadEepromFile(const std::string& nic, const std::string& file,
                                    std::size_t limit) {
  struct stat info {};
  if (::stat(file.c_str(), &info) != 0)
    throw HostCtlException("Cannot read EEPROM file " + file + ": " + std::strerror(errno));
  if (!S_ISREG(info.st_mode))
    throw HostCtlException("Cannot read EEPROM file " + file + ": not a regular file");
  if (static_cast<uint64_t>(info.st_size) > limit)
    throw HostCtlException(StrPrintf("EEPROM file %s holds %llu bytes; the EEPROM of %s has %zu",
                                     file.c_str(), static_cast<unsigned long long>(info.st_size),
                                     nic.c_str(), limit));
  std::ifstream in(file, std::ios::binary);
  if (!in)
    throw HostCtlException("Cannot read EEPROM file " + file + ": " + std::strerror(errno));
  std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)),
                             std::istreambuf_iterator<char>());
  if (in.bad())
    throw HostCtlException("Cannot read EEPROM file " + file);
  if (bytes.size() > limit)
    throw HostCtlException(StrPrintf("EEPROM file %s holds more than the %zu bytes of the EEPROM "
                                     "of %s",
                                     file.c_str(), limit, nic.c_str()));
  return bytes;
}

} // namespace

// --- Offloads.

void PnicImpl::GetOffloadSettings(PnicOffloadSettings& settings) const {
  settings = ReadRecord<PnicOffloadSettings>("GetOffloadSettings", GetName(), "offload");
  settings.mask = kOffloadMaskAll;
}

void PnicImpl::SetOffloadSettings(const PnicOffloadSettings& settings) {
  if (settings.mask & ~kOffloadMaskAll)
    throw HostCtlException(
        StrPrintf("Unknown offload mask bits 0x%02x", settings.mask & ~kOffloadMaskAll));
  ChangeRecord<PnicOffloadSettings>("SetOffloadSettings", GetName(), "offload",
                                    [&](PnicOffloadSettings& stored) {
                                      for (const OffloadFlag& f : kOffloadFlags)
                                        if (settings.mask & f.bit)
                                          stored.*f.flag = settings.*f.flag;
                                    });
}

// --- Interrupt coalescing.

void PnicImpl::GetCoalesceParams(PnicCoalesceParams& params) const {
  params = ReadRecord<PnicCoalesceParams>("GetCoalesceParams", GetName(), "coalesce");
}

void PnicImpl::SetCoalesceParams(const PnicCoalesceParams& params) {
  ChangeRecord<PnicCoalesceParams>(
      "SetCoalesceParams", GetName(), "coalesce", [&](PnicCoalesceParams& stored) {
        std::string problem = Model::CoalesceProblem(GetName(), params);
        if (!problem.empty())
          throw HostCtlException(problem);
        stored = params;
      });
}

// --- Rings.

void PnicImpl::GetRingParams(PnicRingParams& maximums, PnicRingParams& current) const {
  Model::RingState state = ReadRecord<Model::RingState>("GetRingParams", GetName(), "ring");
  maximums = state.maximums;
  current = state.current;
}

void PnicImpl::SetRingParams(const PnicRingParams& params) {
  const std::string nic = GetName();
  ChangeRecord<Model::RingState>("SetRingParams", nic, "ring", [&](Model::RingState& state) {
    // A size of 0 leaves that ring as it is, so one ring can be resized alone.
    for (const Model::RingSlot& slot : Model::kRingSlots) {
      uint32_t size = params.*slot.member;
      uint32_t max = state.maximums.*slot.member;
      if (size == 0)
        continue;
      if (max == 0)
        throw HostCtlException(
            StrPrintf("%s has no %s ring; its size cannot be set", nic.c_str(), slot.name));
      if (size > max)
        throw HostCtlException(StrPrintf("The %s ring of %s takes at most %u entries, not %u",
                                         slot.name, nic.c_str(), max, size));
    }
    for (const Model::RingSlot& slot : Model::kRingSlots)
      if (params.*slot.member != 0)
        state.current.*slot.member = params.*slot.member;
  });
}

// --- NetQueue.

void PnicImpl::GetNetqueueInfo(PnicNetqueueInfo& info) const {
  info = ReadRecord<Model::NetqueueState>("GetNetqueueInfo", GetName(), "netqueue").info;
}

void PnicImpl::SetNetqueueInfo(const PnicNetqueueInfo& info) {
  const std::string nic = GetName();
  if (info.settingMask >> kNetqueueSettingCount)
    throw HostCtlException(
        StrPrintf("Unknown NetQueue load balancer setting mask 0x%x", info.settingMask));
  ChangeRecord<Model::NetqueueState>(
      "SetNetqueueInfo", nic, "netqueue", [&](Model::NetqueueState& state) {
        PnicNetqueueInfo& stored = state.info;
        if (info.txCountSelected) {
          CheckQueueCount(nic, "TX", info.txQueueCount, state.maxTxQueues);
          stored.txQueueCount = info.txQueueCount;
        }
        if (info.rxCountSelected) {
          CheckQueueCount(nic, "RX", info.rxQueueCount, state.maxRxQueues);
          stored.rxQueueCount = info.rxQueueCount;
        }
        if (info.balancerStateSelected)
          stored.balancerEnabled = info.balancerEnabled;
        for (std::size_t i = 0; i < kNetqueueSettingCount; ++i) {
          if (!(info.settingMask & (1u << i)))
            continue;
          if (info.settingAllowed[i] && !stored.settingSupported[i])
            throw HostCtlException(nic + " does not support the NetQueue load balancer setting " +
                                   Model::kNetqueueSettingNames[i]);
          stored.settingAllowed[i] = info.settingAllowed[i];
        }
        if (info.pluginStateSelected) {
          for (const PnicNetqueuePluginInfo& change : info.changedPlugins) {
            auto same = [&](const PnicNetqueuePluginInfo& p) {
              return p.moduleName == change.moduleName && p.pluginName == change.pluginName;
            };
            auto known = std::find_if(stored.plugins.begin(), stored.plugins.end(), same);
            if (known == stored.plugins.end())
              throw HostCtlException(nic + " has no NetQueue balancer plugin " + change.pluginName +
                                     " in module " + change.moduleName);
            auto enabled =
                std::find_if(stored.changedPlugins.begin(), stored.changedPlugins.end(), same);
            if (info.pluginEnabled && enabled == stored.changedPlugins.end())
              stored.changedPlugins.push_back(*known);
            else if (!info.pluginEnabled && enabled != stored.changedPlugins.end())
              stored.changedPlugins.erase(enabled);
          }
        }
      });
}

// --- Software simulation.

void PnicImpl::GetSoftwareSimulation(PnicSoftwareSimulation& settings) const {
  settings =
      ReadRecord<PnicSoftwareSimulation>("GetSoftwareSimulation", GetName(), "softwareSimulation");
}

void PnicImpl::SetSoftwareSimulation(const PnicSoftwareSimulation& settings) {
  if (settings.mask >> kSoftwareFeatureCount)
    throw HostCtlException(StrPrintf("Unknown software simulation mask 0x%x", settings.mask));
  ChangeRecord<PnicSoftwareSimulation>("SetSoftwareSimulation", GetName(), "softwareSimulation",
                                       [&](PnicSoftwareSimulation& stored) {
                                         for (std::size_t i = 0; i < kSoftwareFeatureCount; ++i)
                                           if (settings.mask & (1u << i))
                                             stored.features[i] = settings.features[i];
                                       });
}

// --- EEPROM, registers, self test.

void PnicImpl::GetEepromDump(std::vector<uint8_t>& data, uint32_t length, uint32_t offset) const {
  const std::string nic = GetName();
  Model::EepromState eeprom = ReadRecord<Model::EepromState>("GetEepromDump", nic, "eeprom");
  uint64_t size = eeprom.data.size();
  if (uint64_t{offset} + length > size)
    throw HostCtlException(StrPrintf("The EEPROM of %s has %llu bytes; cannot read %u bytes at "
                                     "offset 0x%x",
                                     nic.c_str(), static_cast<unsigned long long>(size), length,
                                     offset));
  data.assign(eeprom.data.begin() + offset, eeprom.data.begin() + offset + length);
}

void PnicImpl::SetEepromValue(uint32_t magic, uint32_t offset, uint32_t value) {
  const std::string nic = GetName();
  ChangeRecord<Model::EepromState>(
      "SetEepromValue", nic, "eeprom", [&](Model::EepromState& eeprom) {
        CheckMagic(nic, eeprom, magic);
        if (uint64_t{offset} + 4 > eeprom.data.size())
          throw HostCtlException(
              StrPrintf("The EEPROM of %s has %zu bytes; cannot write a double word "
                        "at offset 0x%x",
                        nic.c_str(), eeprom.data.size(), offset));
        for (int i = 0; i < 4; ++i)
          eeprom.data[offset + i] = static_cast<uint8_t>(value >> (8 * i));
      });
}

void PnicImpl::SetEepromFromFile(uint32_t magic, const std::string& file) {
  const std::string nic = GetName();
  ChangeRecord<Model::EepromState>(
      "SetEepromFromFile", nic, "eeprom", [&](Model::EepromState& eeprom) {
        CheckMagic(nic, eeprom, magic);
        std::vector<uint8_t> bytes = ReadEepromFile(nic, file, eeprom.data.size());
        std::copy(bytes.begin(), bytes.end(), eeprom.data.begin());
      });
}

void PnicImpl::GetRegisterDump(std::vector<uint32_t>& words) const {
  words = ReadRecord<Model::RegisterState>("GetRegisterDump", GetName(), "registers").words;
}

void PnicImpl::RunSelfTest(PnicSelfTestResult& result, bool online) {
  Model::SelfTestState state =
      ReadRecord<Model::SelfTestState>("RunSelfTest", GetName(), "selfTest");
  result.failed = false;
  result.info.clear();
  for (const Model::SelfTestState::Test& test : state.tests) {
    if (online && !test.online)
      continue;
    result.failed = result.failed || !test.passed;
    result.info.push_back(test.name + (test.passed ? ": passed" : ": failed"));
  }
}

// --- Hardware capabilities.

void PnicImpl::GetHwCapabilities(PnicHwCapabilities& caps) const {
  caps = ReadRecord<PnicHwCapabilities>("GetHwCapabilities", GetName(), "hwCap");
}

std::string PnicImpl::GetHwCapName(int bit) {
  Store::Host().CheckFault("GetHwCapName", std::to_string(bit));
  const std::vector<std::string>& names = Model::HwCapNames();
  if (bit < 0 || static_cast<std::size_t>(bit) >= names.size())
    return "";
  return names[static_cast<std::size_t>(bit)];
}

} // namespace Sim
