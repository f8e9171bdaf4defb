//===- PseudoDevice.h - Vendor and device of a NIC without PCI function ---===//
#pragma once

#include <string>

namespace CorvexCli::NetworkNamespace {

/// Splits a pseudo-device description ("USB-NIC:vendor:device") into vendor
/// and device names. Only descriptions beginning with "USB-NIC", "ACPI-NIC"
/// or "PhyDev" name them; anything else gives "Unknown" for both, as does a
/// missing field.
void ParsePseudoDevice(const std::string& text, std::string& vendor, std::string& device);

} // namespace CorvexCli::NetworkNamespace
