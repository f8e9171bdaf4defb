//===- HostCtl/SmartNic.h - DPUs that back physical NICs -------------------===//
#pragma once

#include <memory>
#include <string>

namespace HostCtl::SmartNic {

/// A DPU (data processing unit) backing a physical NIC.
class SmartNic {
public:
  virtual ~SmartNic() = default;
  virtual std::string GetId() const = 0;
};

class SmartNicInfo {
public:
  /// The DPU that backs the NIC of that name, or null.
  static std::unique_ptr<SmartNic> GetSmartNicByPnic(const std::string& pnicName);
};

} // namespace HostCtl::SmartNic
