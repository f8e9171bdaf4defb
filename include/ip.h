//===- ip.h - IP stack command classes ------------------------------------===//
//
// The command classes of `network ip`: one block per class, grouped by
// family in the order of the family source files of src/ip/. Each class is
// defined in its family file.
//
//===----------------------------------------------------------------------===//
#pragma once

#include "CommandBase.h"

#include <cstdint>
#include <string>

namespace CorvexCli::NetworkNamespace {

// Kernel network interfaces (Interface.cpp).

/// network ip interface add
class IpInterfaceAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceAdd)
};

/// network ip interface remove
class IpInterfaceRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceRemove)
};

/// network ip interface list
class IpInterfaceList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip interface set
class IpInterfaceSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceSet)
};

// IPv4 settings (Ipv4.cpp).

/// network ip interface ipv4 get and network ip interface ipv4 address list
class IpInterfaceIpv4Get : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv4Get)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip interface ipv4 set
class IpInterfaceIpv4Set : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv4Set)
};

// IPv6 settings and addresses (Ipv6.cpp).

/// network ip interface ipv6 get
class IpInterfaceIpv6Get : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv6Get)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip interface ipv6 set
class IpInterfaceIpv6Set : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv6Set)
};

/// network ip interface ipv6 address list
class IpInterfaceIpv6AddressList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv6AddressList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip interface ipv6 address add
class IpInterfaceIpv6AddressAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv6AddressAdd)
};

/// network ip interface ipv6 address remove
class IpInterfaceIpv6AddressRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceIpv6AddressRemove)
};

// Interface tags (Tag.cpp).

/// network ip interface tag add
class IpInterfaceTagAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceTagAdd)
};

/// network ip interface tag remove
class IpInterfaceTagRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceTagRemove)
};

/// network ip interface tag get
class IpInterfaceTagGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpInterfaceTagGet)
  CORVEX_OUTPUT_STRUCTURE
};

// Netstack instances and global IP settings (Netstack.cpp).

/// network ip netstack list
class IpNetstackInstanceList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNetstackInstanceList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip netstack add
class IpNetstackInstanceAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNetstackInstanceAdd)
};

/// network ip netstack remove
class IpNetstackInstanceRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNetstackInstanceRemove)
};

/// network ip netstack get
class IpNetstackInstanceGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNetstackInstanceGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip netstack set
class IpNetstackInstanceSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNetstackInstanceSet)
};

/// network ip get
class IpGet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpGet)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip set
class IpSet : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpSet)
};

// Routes (Route.cpp).

/// network ip route ipv4 add
class IpRouteIpv4Add : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpRouteIpv4Add)
};

/// network ip route ipv4 remove
class IpRouteIpv4Remove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpRouteIpv4Remove)
};

/// network ip route ipv4 list
class IpRouteIpv4List : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpRouteIpv4List)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip route ipv6 add
class IpRouteIpv6Add : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpRouteIpv6Add)
};

/// network ip route ipv6 remove
class IpRouteIpv6Remove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpRouteIpv6Remove)
};

/// network ip route ipv6 list
class IpRouteIpv6List : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpRouteIpv6List)
  CORVEX_OUTPUT_STRUCTURE
};

// DNS servers and search domains (Dns.cpp).

/// network ip dns server list
class IpDNSServerList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpDNSServerList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip dns server add
class IpDNSServerAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpDNSServerAdd)
};

/// network ip dns server remove
class IpDNSServerRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpDNSServerRemove)
};

/// network ip dns search add
class IpDNSSearchAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpDNSSearchAdd)
};

/// network ip dns search remove
class IpDNSSearchRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpDNSSearchRemove)
};

/// network ip dns search list
class IpDNSSearchList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpDNSSearchList)
  CORVEX_OUTPUT_STRUCTURE
};

// Hosts entries (Hosts.cpp).

/// network ip hosts list
class IpHostsList : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpHostsList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip hosts add
class IpHostsAdd : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpHostsAdd)
};

/// network ip hosts remove
class IpHostsRemove : public Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpHostsRemove)
};

// Neighbours and connections (Neighbor.cpp).

/// network ip neighbor list
class IpNeighborList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNeighborList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip neighbor remove
class IpNeighborRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpNeighborRemove)
};

/// network ip connection list
class IpConnectionList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpConnectionList)
  CORVEX_OUTPUT_STRUCTURE
};

/// The name of TCP state \p state ("CLOSED" ... "TIME_WAIT"); "" above 10.
std::string TcpStateName(uint32_t state);

/// "address:port", or "[address]:port" for an address with colons (IPv6).
std::string ConnectionEndpointText(const std::string& address, uint16_t port);

// IPsec security associations and policies (Ipsec.cpp).

/// network ip ipsec sa add
class IpIpsecSAAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpIpsecSAAdd)
};

/// network ip ipsec sa remove
class IpIpsecSARemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpIpsecSARemove)
};

/// network ip ipsec sa list
class IpIpsecSAList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpIpsecSAList)
  CORVEX_OUTPUT_STRUCTURE
};

/// network ip ipsec sp add
class IpIpsecSPAdd : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpIpsecSPAdd)
};

/// network ip ipsec sp remove
class IpIpsecSPRemove : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpIpsecSPRemove)
};

/// network ip ipsec sp list
class IpIpsecSPList : public virtual Fabrik::AutoCli::Command {
  CORVEX_COMMAND(IpIpsecSPList)
  CORVEX_OUTPUT_STRUCTURE
};

/// Reads an SPI typed in hexadecimal (an optional "0x", then hex digits);
/// false for anything else, a sign or an overflow included.
bool ParseSpiText(const std::string& text, uint32_t& spi);

/// A lifetime as text: "infinite" for 0, else hours, minutes and seconds,
/// each part present only when not zero and followed by a blank ("1h 1m 1s ").
std::string ConvertToHrsMinsAndSecs(uint64_t seconds);

} // namespace CorvexCli::NetworkNamespace
