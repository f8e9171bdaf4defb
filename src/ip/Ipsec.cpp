//===- Ipsec.cpp - network ip ipsec sa|sp add, remove, list ---------------===//
//
// The IPsec commands translate the user's text into the host library's SA and
// SP records and back. Keys are taken from the command line and never shown.
//
//===----------------------------------------------------------------------===//
#include "ip.h"

#include "HostCtl/Lib.h"
#include "HostCtl/Misc.h"
#include "HostCtl/Network/Address.h"
#include "TvkCtl/Network/IpSecConfigImpl.h"
#include "common/FieldTable.h"
#include "common/ParameterTable.h"
#include "ip/IpCommon.h"

#include <sstream>

namespace CorvexCli::NetworkNamespace {

using Fabrik::CallSpec::Input;
using Fabrik::CallSpec::InputSpec;
using Fabrik::CallSpec::Output;
using Fabrik::CallSpec::OutputSpec;
using Fabrik::MetaObj::MetaBool;
using Fabrik::MetaObj::MetaList;
using Fabrik::MetaObj::MetaStruct;
using HostCtl::Lib::HostCtlException;
using HostCtl::Network::IpSecSadParam;
using HostCtl::Network::IpSecSpdParam;
using TvkCtl::Network::IpSecConfigImpl;

namespace {

const EnumChoice kModeChoices[] = {{"transport"}, {"tunnel"}};
const EnumChoice kEncryptionChoices[] = {{"null"}, {"3des-cbc"}, {"aes128-cbc"}};
const EnumChoice kIntegrityChoices[] = {{"hmac-sha1"}, {"hmac-sha2-256"}};
const EnumChoice kActionChoices[] = {{"none"}, {"discard"}, {"ipsec"}};
const EnumChoice kUpperLayerChoices[] = {{"any"}, {"tcp"}, {"udp"}, {"icmp6"}};
const EnumChoice kFlowChoices[] = {{"in"}, {"out"}};

// Fields of "SecurityAssociation" and "SecurityPolicy".
const std::string kName = "Name";
const std::string kSourceAddress = "Source Address";
const std::string kDestinationAddress = "Destination Address";
const std::string kState = "State";
const std::string kSpi = "SPI";
const std::string kMode = "Mode";
const std::string kEncryptionAlgorithm = "Encryption Algorithm";
const std::string kIntegrityAlgorithm = "Integrity Algorithm";
const std::string kLifetime = "Lifetime";
const std::string kSourcePort = "Source Port";
const std::string kDestinationPort = "Destination Port";
const std::string kProtocol = "Protocol";
const std::string kFlow = "Flow";
const std::string kAction = "Action";
const std::string kSaName = "SA Name";

const std::string kUnknownSa = "UNKNOWN";
const std::string kSaRemoveUsage =
    "Can not figure out which operation you want to perform.\n"
    "Remove a unique SA: Only specify the '--sa-name' option to remove a normal SA.\n"
    "Remove an auto SA: Set the '--sa-name' to 'auto'. You should also specify '--sa-source', "
    "'--sa-destination' and '--sa-spi' and omit '--remove-all' when removing an auto SA.\n"
    "Remove all SAs: You should only set the flag '--remove-all' to remove all SAs.";

/// The entry of \p table for \p code, or "" for a code outside it.
template <std::size_t N> std::string CodeText(const std::array<std::string, N>& table, int code) {
  return code >= 0 && static_cast<std::size_t>(code) < N ? table[code] : std::string();
}

/// The text of an optional string parameter ("" when absent).
std::string Optional(const Input& input, const char* name) {
  return input.HasParameter(name) ? input.GetParameter(name) : std::string();
}

/// The SPI of \p input's "sa-spi"; nothing (with the error added) when it is
/// not a hexadecimal number.
bool ReadSpi(const Input& input, Output& output, uint32_t& spi) {
  const std::string& text = input.GetParameter("sa-spi");
  if (ParseSpiText(text, spi))
    return true;
  output.AddErrorMessage("Check the input value for '--sa-spi'. Should be hex integer. Got " +
                         text);
  return false;
}

/// Address text and prefix length of an SP end: "any" or an IPv6 network.
void ReadPolicyNetwork(const std::string& text, std::string& address, int& prefix) {
  HostCtl::Network::Ipv6Network network;
  if (text != "any")
    network = HostCtl::Network::Ipv6Network(text);
  address = network.GetAddress().GetStringAddress();
  prefix = network.GetNetmask();
}

} // namespace

bool ParseSpiText(const std::string& text, uint32_t& spi) {
  // Read as the stream reads a hex number: leading blanks and a "+" are
  // taken, but a "-" is refused rather than wrapped around to a large SPI.
  if (text.find('-') != std::string::npos)
    return false;
  std::istringstream stream(text);
  uint32_t value = 0;
  stream >> std::hex >> value;
  if (stream.fail() || stream.peek() != std::char_traits<char>::eof())
    return false;
  spi = value;
  return true;
}

std::string ConvertToHrsMinsAndSecs(uint64_t seconds) {
  if (seconds == 0)
    return "infinite";
  uint64_t hours = seconds / 3600;
  uint64_t rest = seconds % 3600;
  std::string text;
  if (seconds >= 3600)
    text += std::to_string(hours) + "h ";
  if (rest >= 60)
    text += std::to_string(rest / 60) + "m ";
  if (rest % 60 != 0)
    text += std::to_string(rest % 60) + "s ";
  return text;
}

// network ip ipsec sa add

CORVEX_DEFINE_NEW(IpIpsecSAAdd)

IpIpsecSAAdd::IpIpsecSAAdd() {
  SetDescription("Add a Security Association.");
}

IpIpsecSAAdd::~IpIpsecSAAdd() = default;

std::shared_ptr<InputSpec> IpIpsecSAAdd::GetInputSpecInternal() {
  using Fabrik::CallSpec::String;
  return MakeInputSpec({
      {"sa-name", "n", String, true, "Name for the Security Association to be added."},
      {"sa-source", "s", String, true,
       "Ipv6 address of Security Association source. Can be specified a correct IPv6 address."},
      {"sa-destination", "d", String, true,
       "Ipv6 address of Security Association destination. Can be specified a correct IPv6 "
       "address."},
      {"sa-mode", "m", String, false, "Security Association mode. Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kModeChoices)},
      {"sa-spi", "p", String, true, "SPI value for the Security Association(hex)."},
      {"encryption-algorithm", "e", String, true,
       "Encryption algorithm for the Security Association. Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kEncryptionChoices)},
      {"encryption-key", "k", String, false,
       "Encryption key(ASCII or hex). Length of hex key is dependent upon algorithm used. "
       "Required when a encryption algorithm has been specified."},
      {"integrity-algorithm", "i", String, true,
       "Integrity algorithm for the Security Association. Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kIntegrityChoices)},
      {"integrity-key", "K", String, true,
       "Integrity key(ASCII or hex). Length of hex key is dependent upon algorithm used."},
  });
}

std::shared_ptr<OutputSpec> IpIpsecSAAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpIpsecSAAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                   const std::shared_ptr<Output>& output) {
  try {
    IpSecConfigImpl ipsec;
    IpSecSadParam sa;
    sa.name = input->GetParameter("sa-name");
    sa.srcAddress =
        HostCtl::Network::Ipv6Address(input->GetParameter("sa-source")).GetStringAddress();
    sa.dstAddress =
        HostCtl::Network::Ipv6Address(input->GetParameter("sa-destination")).GetStringAddress();
    if (!ReadSpi(*input, *output, sa.spi))
      return;
    sa.mode = IpSecConfigImpl::StringToIpSecMode(Optional(*input, "sa-mode"));
    const std::string& encryption = input->GetParameter("encryption-algorithm");
    sa.encryptionAlgorithm = IpSecConfigImpl::StringToIpSecEncyptAlgo(encryption);
    sa.integrityAlgorithm =
        IpSecConfigImpl::StringToIpSecAuthAlgo(input->GetParameter("integrity-algorithm"));
    sa.integrityKey = input->GetParameter("integrity-key");
    if (input->HasParameter("encryption-key")) {
      sa.encryptionKey = input->GetParameter("encryption-key");
    } else if (encryption != "null") {
      output->AddErrorMessage("Missing encryption key");
      return;
    }
    ipsec.AddSADConfig(sa);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip ipsec sa remove

CORVEX_DEFINE_NEW(IpIpsecSARemove)

IpIpsecSARemove::IpIpsecSARemove() {
  SetDescription("Operation to remove Security Association(s)");
}

IpIpsecSARemove::~IpIpsecSARemove() = default;

std::shared_ptr<InputSpec> IpIpsecSARemove::GetInputSpecInternal() {
  using Fabrik::CallSpec::Flag;
  using Fabrik::CallSpec::String;
  return MakeInputSpec({
      {"sa-name", "n", String, false,
       "Name for the Security Association to be removed. Specify 'auto' to remove an auto SA."},
      {"remove-all", "a", Flag, false, "Set to remove all Security Associations."},
      {"sa-source", "s", String, false,
       "Ipv6 address of Security Association source. This option needs to be specified when "
       "removing an auto SA."},
      {"sa-destination", "d", String, false,
       "Ipv6 address of Security Association destination. This option needs to be specified "
       "when removing an auto SA."},
      {"sa-spi", "p", String, false,
       "SPI value for the Security Association (hex). This option needs to be specified when "
       "removing an auto SA"},
  });
}

std::shared_ptr<OutputSpec> IpIpsecSARemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpIpsecSARemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    bool hasName = input->HasParameter("sa-name");
    bool all = input->IsFlagSet("remove-all");
    bool hasSource = input->HasParameter("sa-source");
    bool hasDestination = input->HasParameter("sa-destination");
    bool hasSpi = input->HasParameter("sa-spi");
    bool anyAutoPart = hasSource || hasDestination || hasSpi;
    bool isAuto = hasName && input->GetParameter("sa-name") == "auto";
    IpSecConfigImpl ipsec;
    if (hasName && !isAuto && !all && !anyAutoPart) {
      ipsec.RemoveSADConfig(input->GetParameter("sa-name"));
    } else if (isAuto && hasSource && hasDestination && hasSpi && !all) {
      IpSecSadParam sa;
      sa.name = "auto";
      sa.srcAddress = input->GetParameter("sa-source");
      sa.dstAddress = input->GetParameter("sa-destination");
      // A text that is not hexadecimal would name some other SA: refuse it.
      if (!ReadSpi(*input, *output, sa.spi))
        return;
      ipsec.RemoveAutoSADConfig(sa);
    } else if (all && !hasName && !anyAutoPart) {
      ipsec.FlushSADConfig();
    } else {
      output->AddErrorMessage(kSaRemoveUsage);
      return;
    }
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip ipsec sa list

CORVEX_DEFINE_NEW(IpIpsecSAList)

IpIpsecSAList::IpIpsecSAList() {
  SetDescription("List configured Security Associations");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:SecurityAssociation",
                            kName + "," + kSourceAddress + "," + kDestinationAddress + "," +
                                kState + "," + kSpi + "," + kMode + "," + kEncryptionAlgorithm +
                                "," + kIntegrityAlgorithm + "," + kLifetime);
}

IpIpsecSAList::~IpIpsecSAList() = default;

std::shared_ptr<InputSpec> IpIpsecSAList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> IpIpsecSAList::GetOutputStructure() {
  using Fabrik::MetaObj::String;
  return MakeStructure("SecurityAssociation", {{kName, FieldKind::String},
                                               {kSourceAddress, FieldKind::String},
                                               {kDestinationAddress, FieldKind::String},
                                               {kState, FieldKind::String},
                                               {kSpi, FieldKind::String},
                                               {kMode, FieldKind::String},
                                               {kEncryptionAlgorithm, FieldKind::String},
                                               {kIntegrityAlgorithm, FieldKind::String},
                                               {kLifetime, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpIpsecSAList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpIpsecSAList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                    const std::shared_ptr<Output>& output) {
  try {
    IpSecConfigImpl ipsec;
    std::vector<IpSecSadParam> sas;
    ipsec.GetSADConfigList(sas);
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    for (const IpSecSadParam& sa : sas) {
      auto row = GetOutputStructure();
      row->SetField(kName, sa.name);
      row->SetField(kSourceAddress, sa.srcAddress);
      row->SetField(kDestinationAddress, sa.dstAddress);
      row->SetField(kState, CodeText(IpSecConfigImpl::SA_STATE, sa.state));
      row->SetField(kSpi, HostCtl::Misc::StrPrintf("0x%x", sa.spi));
      row->SetField(kMode, CodeText(IpSecConfigImpl::SA_MODE, sa.mode));
      row->SetField(kEncryptionAlgorithm,
                    CodeText(IpSecConfigImpl::SA_ENCPT_ALG, sa.encryptionAlgorithm));
      row->SetField(kIntegrityAlgorithm,
                    CodeText(IpSecConfigImpl::SA_AUTH_ALG, sa.integrityAlgorithm));
      row->SetField(kLifetime, ConvertToHrsMinsAndSecs(sa.lifetime));
      list->Add(row);
    }
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip ipsec sp add

CORVEX_DEFINE_NEW(IpIpsecSPAdd)

IpIpsecSPAdd::IpIpsecSPAdd() {
  SetDescription("Add a Security Policy.");
}

IpIpsecSPAdd::~IpIpsecSPAdd() = default;

std::shared_ptr<InputSpec> IpIpsecSPAdd::GetInputSpecInternal() {
  using Fabrik::CallSpec::Integer;
  using Fabrik::CallSpec::String;
  return MakeInputSpec({
      {"sp-name", "n", String, true, "Name for the Security Policy to be added."},
      {"sa-name", "a", String, false,
       "Name for the Security Association. Not being Specified lets tarvik automatically choose "
       "an Security Association. If no applicable Security Association exists, then tarvik may "
       "request one using IKE."},
      {"sp-source", "s", String, true,
       "Ipv6 address and prefix length of Security Policy source. Can be specified as 'any' or a "
       "correct IPv6 network address."},
      {"sp-destination", "d", String, true,
       "Ipv6 address and prefix length of Security Policy destination. Can be specified as 'any' "
       "or a correct Ipv6 network address."},
      {"sp-mode", "m", String, false, "Security Policy mode. Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kModeChoices)},
      {"source-port", "p", Integer, true, "Source Port for Security Policy. '0' stands for 'any'"},
      {"destination-port", "P", Integer, true,
       "Destination Port for Security Policy. '0' stands for 'any'"},
      {"action", "A", String, false, "Action for Security Policy. Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kActionChoices)},
      {"upper-layer-protocol", "u", String, false,
       "Upper layer protocol for Security Policy, Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kUpperLayerChoices)},
      {"flow-direction", "w", String, false,
       "Flow direction for Security Policy. Should be one in set %ENUM%.",
       ParameterCheck::OneOf(kFlowChoices)},
  });
}

std::shared_ptr<OutputSpec> IpIpsecSPAdd::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpIpsecSPAdd::ExecuteInternal(const std::shared_ptr<Input>& input,
                                   const std::shared_ptr<Output>& output) {
  try {
    IpSecConfigImpl ipsec;
    IpSecSpdParam sp;
    ReadPolicyNetwork(input->GetParameter("sp-source"), sp.srcAddress, sp.srcPrefixLength);
    long sourcePort = input->GetParameterInt("source-port");
    ReadPolicyNetwork(input->GetParameter("sp-destination"), sp.dstAddress, sp.dstPrefixLength);
    long destinationPort = input->GetParameterInt("destination-port");
    if (sourcePort < 0 || sourcePort > 65535 || destinationPort < 0 || destinationPort > 65535)
      throw HostCtlException("Ports must be in the range 0 to 65535");
    sp.srcPort = static_cast<uint32_t>(sourcePort);
    sp.dstPort = static_cast<uint32_t>(destinationPort);
    sp.ulProto =
        IpSecConfigImpl::StringToIpSecULProtoType(Optional(*input, "upper-layer-protocol"));
    sp.direction = IpSecConfigImpl::StringToIpSecDirection(Optional(*input, "flow-direction"));
    std::string action = Optional(*input, "action");
    sp.action = IpSecConfigImpl::StringToIpSecAction(action);
    if (action == "ipsec") {
      sp.mode = IpSecConfigImpl::StringToIpSecMode(Optional(*input, "sp-mode"));
      sp.saName = Optional(*input, "sa-name");
    }
    sp.name = input->GetParameter("sp-name");
    ipsec.AddSPDConfig(sp);
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip ipsec sp remove

CORVEX_DEFINE_NEW(IpIpsecSPRemove)

IpIpsecSPRemove::IpIpsecSPRemove() {
  SetDescription("Operation to remove Security Policy");
}

IpIpsecSPRemove::~IpIpsecSPRemove() = default;

std::shared_ptr<InputSpec> IpIpsecSPRemove::GetInputSpecInternal() {
  return MakeInputSpec({
      {"sp-name", "n", Fabrik::CallSpec::String, false,
       "Name for the Security Policy to be removed."},
      {"remove-all", "a", Fabrik::CallSpec::Flag, false, "Set to remove all Security Policys"},
  });
}

std::shared_ptr<OutputSpec> IpIpsecSPRemove::GetOutputSpecInternal() {
  return BoolResultSpec();
}

void IpIpsecSPRemove::ExecuteInternal(const std::shared_ptr<Input>& input,
                                      const std::shared_ptr<Output>& output) {
  try {
    bool hasName = input->HasParameter("sp-name");
    bool all = input->IsFlagSet("remove-all");
    IpSecConfigImpl ipsec;
    if (hasName && !all)
      ipsec.RemoveSPDConfig(input->GetParameter("sp-name"));
    else if (all && !hasName)
      ipsec.FlushSPDConfig();
    else
      output->AddErrorMessage("You should specify exactly one of : --remove-all, --sa-name");
    output->SetRootObject(MetaBool::New(true));
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

// network ip ipsec sp list

CORVEX_DEFINE_NEW(IpIpsecSPList)

IpIpsecSPList::IpIpsecSPList() {
  SetDescription("List configured Security Policys");
  SetDefaultOutputFormatter("table");
  SetDefaultOutputParameter("fields:SecurityPolicy",
                            kName + "," + kSourceAddress + "," + kSourcePort + "," +
                                kDestinationAddress + "," + kDestinationPort + "," + kProtocol +
                                "," + kFlow + "," + kAction + "," + kMode + "," + kSaName);
}

IpIpsecSPList::~IpIpsecSPList() = default;

std::shared_ptr<InputSpec> IpIpsecSPList::GetInputSpecInternal() {
  return InputSpec::New();
}

std::shared_ptr<MetaStruct> IpIpsecSPList::GetOutputStructure() {
  using Fabrik::MetaObj::Integer;
  using Fabrik::MetaObj::String;
  return MakeStructure("SecurityPolicy", {{kName, FieldKind::String},
                                          {kSourceAddress, FieldKind::String},
                                          {kSourcePort, FieldKind::Integer},
                                          {kDestinationAddress, FieldKind::String},
                                          {kDestinationPort, FieldKind::Integer},
                                          {kProtocol, FieldKind::String},
                                          {kFlow, FieldKind::String},
                                          {kAction, FieldKind::String},
                                          {kMode, FieldKind::String},
                                          {kSaName, FieldKind::String}});
}

std::shared_ptr<OutputSpec> IpIpsecSPList::GetOutputSpecInternal() {
  return ListResultSpec(GetOutputStructure());
}

void IpIpsecSPList::ExecuteInternal(const std::shared_ptr<Input>& /*input*/,
                                    const std::shared_ptr<Output>& output) {
  try {
    IpSecConfigImpl ipsec;
    std::vector<IpSecSpdParam> sps;
    ipsec.GetSPDConfigList(sps);
    auto list = MetaList::New(Fabrik::MetaObj::Struct, GetOutputStructure());
    bool lostSa = false;
    for (const IpSecSpdParam& sp : sps) {
      auto row = GetOutputStructure();
      row->SetField(kName, sp.name);
      row->SetField(kSourceAddress, sp.srcAddress + "/" + std::to_string(sp.srcPrefixLength));
      row->SetField(kSourcePort, static_cast<long>(sp.srcPort));
      row->SetField(kDestinationAddress, sp.dstAddress + "/" + std::to_string(sp.dstPrefixLength));
      row->SetField(kDestinationPort, static_cast<long>(sp.dstPort));
      row->SetField(kProtocol, CodeText(IpSecConfigImpl::SP_UL_PROTO_TYPE, sp.ulProto));
      row->SetField(kFlow, CodeText(IpSecConfigImpl::SP_DIRECTION, sp.direction));
      row->SetField(kAction, CodeText(IpSecConfigImpl::SP_ACTION, sp.action));
      row->SetField(kMode, CodeText(IpSecConfigImpl::SA_MODE, sp.mode));
      if (sp.saName == kUnknownSa) {
        row->SetField(kSaName, kUnknownSa + "*");
        lostSa = true;
      } else {
        row->SetField(kSaName, sp.saName);
      }
      list->Add(row);
    }
    if (lostSa)
      output->AddErrorMessage("*Some SPs with unique but deleted SAs were found. Please remove "
                              "these SPs as they cannot be used anymore.");
    output->SetRootObject(list);
  } catch (const HostCtlException& e) {
    output->AddErrorMessage(e.what());
  }
}

} // namespace CorvexCli::NetworkNamespace
