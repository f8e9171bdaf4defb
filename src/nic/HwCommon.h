//===- HwCommon.h - Shared pieces of the NIC hardware command families ----===//
//
// The hardware families (offloads, coalescing, rings, NetQueue, software
// simulation, diagnostics, capabilities) declare their parameters
// (common/ParameterTable.h) and result fields from tables. This header holds
// what turns their field tables and results into specifications, plus the NIC
// selection the list commands share.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "Fabrik/Call.h"
#include "Fabrik/MetaObj.h"
#include "HostCtl/Network/NetworkInfo.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"

#include <functional>
#include <memory>
#include <span>
#include <string>
#include <vector>

namespace CorvexCli::NetworkNamespace::NicHw {

/// A structure template named \p name with one empty string field per name.
std::shared_ptr<Fabrik::MetaObj::MetaStruct>
StringStructure(const std::string& name, std::span<const std::string* const> fields);

/// Joins \p names with commas.
std::string JoinFields(std::span<const std::string* const> names);

/// "Pnic with name " + name + " not found".
std::string PnicNotFound(const std::string& name);

/// Makes the error text for a NIC name that finds no NIC.
using NotFoundText = std::string (*)(const std::string& name);

/// The NICs a list command works on: every NIC (GetPnics with selector 1)
/// when \p input lacks the string parameter \p param, else the one NIC it
/// names. A name that finds no NIC adds notFound(name) to \p output and gives
/// false.
bool SelectNics(HostCtl::Network::NetworkInfo& info, const Fabrik::CallSpec::Input& input,
                const std::string& param, NotFoundText notFound, Fabrik::CallSpec::Output& output,
                std::vector<std::unique_ptr<HostCtl::Network::Pnic>>& nics);

/// Like SelectNics for a string-list parameter: every NIC when it is absent,
/// else the NICs it names, in the order given; the first name that finds no
/// NIC adds notFound(name) and gives false.
bool SelectNicList(HostCtl::Network::NetworkInfo& info, const Fabrik::CallSpec::Input& input,
                   const std::string& param, NotFoundText notFound,
                   Fabrik::CallSpec::Output& output,
                   std::vector<std::unique_ptr<HostCtl::Network::Pnic>>& nics);

/// The NIC named by the string parameter \p param, or null after adding
/// notFound(name) to \p output.
std::unique_ptr<HostCtl::Network::Pnic> FindNic(HostCtl::Network::NetworkInfo& info,
                                                const Fabrik::CallSpec::Input& input,
                                                const std::string& param, NotFoundText notFound,
                                                Fabrik::CallSpec::Output& output);

/// Hexadecimal text of \p value with lowercase digits, no prefix, padded with
/// zeros to at least \p width digits.
std::string Hex(uint64_t value, int width);

} // namespace CorvexCli::NetworkNamespace::NicHw

namespace CorvexCli::NetworkNamespace {

/// The cell of load-balancer setting \p index in `network nic queue
/// loadbalancer list`: "S" or "U" by \p supported ("N" for the settings whose
/// support is not shown), then "A" or "D" by \p allowed.
std::string NetqueueLbSettingCell(std::size_t index, bool supported, bool allowed);

/// One row of a hexadecimal dump.
struct HexDumpRow {
  std::string offset; ///< The "Offset" cell.
  std::string value;  ///< The "Value" cell.
};

/// Rows of `network nic eeprom dump` for \p data read from byte \p offset.
std::vector<HexDumpRow> EepromDumpRows(const std::vector<uint8_t>& data, uint32_t offset);

/// Rows of `network nic register dump` for \p words.
std::vector<HexDumpRow> RegisterDumpRows(const std::vector<uint32_t>& words);

/// The capability text of `network nic hwCap ... list`: the name of each set
/// bit from 0 to 30, each followed by three blanks; \p name gives a bit's name.
std::string HwCapText(uint64_t mask, std::string (*name)(int bit));

} // namespace CorvexCli::NetworkNamespace
