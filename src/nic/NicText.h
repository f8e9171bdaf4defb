//===- NicText.h - Texts of NIC record codes ------------------------------===//
//
// Conversions from the codes of the host's NIC records to the texts that the
// NIC information, statistics and SR-IOV commands show, shared by their
// family files and tested on their own.
//
//===----------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>

namespace HostCtl::Network {
struct PnicLinkMode;
} // namespace HostCtl::Network

namespace CorvexCli::NetworkNamespace {

/// A supported port code as text ("TP" ... "BACKPLANE", else "UNKNOWN").
std::string PortToString(uint32_t code);
/// The cable type of a port code ("Twisted Pair" ... "BACKPLANE", else "").
std::string CableTypeToString(uint32_t code);
/// A wake-on mode code as text (else "None").
std::string WakeOnToString(uint32_t code);
/// An advertised link mode: "Auto" for speed 0, else speed, media name, "/"
/// and duplex word, such as "1000BaseT/Full".
std::string LinkModeToString(const HostCtl::Network::PnicLinkMode& mode);
/// The "vf-id" text read as base-10 strtol does (blanks and a sign allowed,
/// stops at the first non-digit, no digits give 0).
long ParseVfId(const std::string& text);

} // namespace CorvexCli::NetworkNamespace
