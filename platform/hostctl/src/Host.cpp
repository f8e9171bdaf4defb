//===- Host.cpp - The host root ---------------------------------------------===//
#include "HostCtl/Host.h"

#include "TvkCtl/Network/NetworkInfoImpl.h"

namespace HostCtl {

namespace {

class HostImpl : public Host {
public:
  std::unique_ptr<Network::NetworkInfo> GetNetworkInfo() override {
    return std::make_unique<TvkCtl::Network::NetworkInfoImpl>();
  }
};

} // namespace

std::unique_ptr<Host> HostFactory::GetHost() {
  return std::make_unique<HostImpl>();
}

} // namespace HostCtl
