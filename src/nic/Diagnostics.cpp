//===- Diagnostics.cpp - EEPROM, registers and self test of a NIC ---------===//
//
// network nic eeprom dump|change, network nic register dump and
// network nic selftest run. The dumps turn raw bytes or register words into
// rows of a hexadecimal table (EepromDumpRows, RegisterDumpRows).
//
//===----------------------------------------------------------------------===//
#include "nic.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Network/PnicHwRecords.h"
#include "TvkCtl/Network/NetworkInfoImpl.h"
#include "common/IntFit.h"
#include "nic/HwCommon.h"

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::Pnic;
using HostCtl::Network::PnicSelfTestResult;

namespace {

constexpr auto kString = Fabrik::CallSpec::String;
constexpr auto kInteger = Fabrik::CallSpec::Integer;

const std::string kVmnic = "vmnic";
const std::string kOffset = "offset";
const std::string kLength = "length";
const std::string kValue = "value";
const std::string kFile = "file";
const std::string kMagic = "magic";
const std::string kOnline = "online";

const std::string kEepromStruct = "EepromDump";
const std::string kRegisterStruct = "RegisterDump";
const std::string kOffsetField = "Offset";
const std::string kValueField = "Value";
const std::string kItemField = "Item";
const std::string kResult = "Result";
const std::string kInfo = "Info";
const std::string kPassed = "Passed";
const std::string kFailed = "Failed";

const std::string* const kDumpFields[] = {&kOffsetField, &kValueField};
const std::string* const kSelfTestFields[] = {&kItemField, &kValueField};

/// Offsets, lengths, values and the magic key are unsigned 32-bit numbers.
const IntFit kEepromFits[] = {
    {kOffset, 0, kUint32Max},
    {kLength, 0, kUint32Max},
    {kValue, 0, kUint32Max},
    {kMagic, 0, kUint32Max},
};

/// Bytes and registers per dump row.
constexpr std::size_t kRowWidth = 16;

const ParameterDef kEepromDumpParams[] = {
    {kVmnic, "n", kString, true, "The name of pnic to dump EEPROM"},
    {kOffset, "o", kInteger, false, "Offset of EEPROM starting to dump"},
    {kLength, "l", kInteger, false, "Bytes of EEPROM to dump"},
};

const ParameterDef kEepromChangeParams[] = {
    {kVmnic, "n", kString, true, "Name of vmnic to change EEPROM."},
    {kOffset, "o", kInteger, false, "Offset of EEPROM to change"},
    {kValue, "v", kInteger, false, "New EEPROM value in double word"},
    {kFile, "f", kString, false, "File name of new EEPROM content"},
    {kMagic, "m", kInteger, true, "Magic key of EEPROM"},
};

const ParameterDef kRegisterDumpParams[] = {
    {kVmnic, "n", kString, true, "The name of pnic to dump registers"}};

const ParameterDef kSelfTestParams[] = {
    {kVmnic, "n", kString, true, "The name of pnic to dump EEPROM"},
    {kOnline, "o", kInteger, false,
     "Performing limited set of tests do not inetrrupt normal adapter operation, default is "
     "offline",
     ParameterCheck::Range(0, 1)},
};

/// The NIC named by `vmnic`, or null after adding the error.
std::unique_ptr<Pnic> FindNic(TvkCtl::Network::NetworkInfoImpl& info, const Input& input,
                              Output& output) {
  return NicHw::FindNic(info, input, kVmnic, NicHw::PnicNotFound, output);
}

/// A list of Offset/Value rows.
std::shared_ptr<MetaList> DumpList(const std::string& structName,
                                   const std::vector<HexDumpRow>& rows) {
  auto list =
      MetaList::New(Fabrik::MetaObj::Struct, NicHw::StringStructure(structName, kDumpFields));
  for (const HexDumpRow& row : rows) {
    auto item = NicHw::StringStructure(structName, kDumpFields);
    item->SetField(kOffsetField, row.offset);
    item->SetField(kValueField, row.value);
    list->Add(item);
  }
  return list;
}

} // namespace

std::vector<HexDumpRow> EepromDumpRows(const std::vector<uint8_t>& data, uint32_t offset) {
  std::vector<HexDumpRow> rows;
  uint64_t address = offset;
  uint64_t lead = address % kRowWidth;
  HexDumpRow row{NicHw::Hex(address - lead, 4), std::string(3 * lead, ' ')};
  std::size_t inRow = lead;
  for (uint8_t byte : data) {
    if (inRow == kRowWidth) {
      uint64_t next = (address - lead) + kRowWidth * (rows.size() + 1);
      rows.push_back(std::move(row));
      row = {NicHw::Hex(next, 4), std::string()};
      inRow = 0;
    }
    row.value += NicHw::Hex(byte, 2) + " ";
    ++inRow;
  }
  rows.push_back(std::move(row));
  return rows;
}

std::vector<HexDumpRow> RegisterDumpRows(const std::vector<uint32_t>& words) {
  std::vector<HexDumpRow> rows;
  for (std::size_t i = 0; i < words.size(); ++i) {
    if (i % kRowWidth == 0)
      rows.push_back({NicHw::Hex(i, 4), std::string()});
    rows.back().value += NicHw::Hex(words[i], 2) + " ";
  }
  return rows;
}

// network nic eeprom dump

CORVEX_DEFINE_NEW(NicEepromDump)

NicEepromDump::NicEepromDump() {
  SetDescription("Dump device EEPROM");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kEepromStruct, NicHw::JoinFields(kDumpFields));
}

NicEepromDump::~NicEepromDump() = default;

std::shared_ptr<InputSpec> NicEepromDump::GetInputSpecInternal() {
  return MakeInputSpec(kEepromDumpParams);
}

std::shared_ptr<MetaStruct> NicEepromDump::GetOutputStructure() {
  return NicHw::StringStructure(kEepromStruct, kDumpFields);
}

std::shared_ptr<OutputSpec> NicEepromDump::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicEepromDump::ExecuteInternal(const std::shared_ptr<Input>& input,
                                    const std::shared_ptr<Output>& output) {
  try {
    RequireFit(*input, kEepromFits);
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<Pnic> nic = FindNic(info, *input, *output);
    if (!nic)
      return;
    uint32_t offset =
        input->HasParameter(kOffset) ? static_cast<uint32_t>(input->GetParameterInt(kOffset)) : 0;
    uint32_t length =
        input->HasParameter(kLength) ? static_cast<uint32_t>(input->GetParameterInt(kLength)) : 0;
    std::vector<uint8_t> data;
    nic->GetEepromDump(data, length, offset);
    output->SetRootObject(DumpList(kEepromStruct, EepromDumpRows(data, offset)));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic eeprom change

CORVEX_DEFINE_NEW(NicEepromChange)

NicEepromChange::NicEepromChange() {
  SetDescription("Change EEPROM on a nic");
}

NicEepromChange::~NicEepromChange() = default;

std::shared_ptr<InputSpec> NicEepromChange::GetInputSpecInternal() {
  return MakeInputSpec(kEepromChangeParams);
}

std::shared_ptr<OutputSpec> NicEepromChange::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void NicEepromChange::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    RequireFit(*input, kEepromFits);
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<Pnic> nic = FindNic(info, *input, *output);
    if (!nic)
      return;
    uint32_t magic = static_cast<uint32_t>(input->GetParameterInt(kMagic));
    bool hasOffset = input->HasParameter(kOffset);
    bool hasValue = input->HasParameter(kValue);
    if (!input->HasParameter(kFile)) {
      if (!hasOffset || !hasValue)
        throw HostCtlException("Need to specify atleast one of --offset, --value or --file");
      nic->SetEepromValue(magic, static_cast<uint32_t>(input->GetParameterInt(kOffset)),
                          static_cast<uint32_t>(input->GetParameterInt(kValue)));
    } else {
      if (hasOffset || hasValue)
        throw HostCtlException(
            "Parameter --file can't be specified together with --offset and --value");
      nic->SetEepromFromFile(magic, input->GetParameter(kFile));
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic register dump

CORVEX_DEFINE_NEW(NicRegisterDump)

NicRegisterDump::NicRegisterDump() {
  SetDescription("Dump device registers");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kRegisterStruct, NicHw::JoinFields(kDumpFields));
}

NicRegisterDump::~NicRegisterDump() = default;

std::shared_ptr<InputSpec> NicRegisterDump::GetInputSpecInternal() {
  return MakeInputSpec(kRegisterDumpParams);
}

std::shared_ptr<MetaStruct> NicRegisterDump::GetOutputStructure() {
  return NicHw::StringStructure(kRegisterStruct, kDumpFields);
}

std::shared_ptr<OutputSpec> NicRegisterDump::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicRegisterDump::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<Pnic> nic = FindNic(info, *input, *output);
    if (!nic)
      return;
    std::vector<uint32_t> words;
    nic->GetRegisterDump(words);
    output->SetRootObject(DumpList(kRegisterStruct, RegisterDumpRows(words)));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network nic selftest run

CORVEX_DEFINE_NEW(NicSelfTestRun)

NicSelfTestRun::NicSelfTestRun() {
  SetDescription("Run self test");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:" + kEepromStruct, NicHw::JoinFields(kSelfTestFields));
}

NicSelfTestRun::~NicSelfTestRun() = default;

std::shared_ptr<InputSpec> NicSelfTestRun::GetInputSpecInternal() {
  return MakeInputSpec(kSelfTestParams);
}

std::shared_ptr<MetaStruct> NicSelfTestRun::GetOutputStructure() {
  return NicHw::StringStructure(kEepromStruct, kSelfTestFields);
}

std::shared_ptr<OutputSpec> NicSelfTestRun::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void NicSelfTestRun::ExecuteInternal(const std::shared_ptr<Input>& input,
                                     const std::shared_ptr<Output>& output) {
  try {
    TvkCtl::Network::NetworkInfoImpl info;
    std::unique_ptr<Pnic> nic = FindNic(info, *input, *output);
    if (!nic)
      return;
    bool online = input->HasParameter(kOnline) && input->GetParameterInt(kOnline) != 0;
    PnicSelfTestResult result{};
    nic->RunSelfTest(result, online);
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    auto addRow = [&](const std::string& item, const std::string& value) {
      auto row = GetOutputStructure();
      row->SetField(kItemField, item);
      row->SetField(kValueField, value);
      list->Add(row);
    };
    addRow(kResult, result.failed ? kFailed : kPassed);
    for (const std::string& line : result.info)
      addRow(kInfo, line);
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
