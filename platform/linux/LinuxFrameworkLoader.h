#pragma once

#include <map>
#include <set>
#include <string>
#include <string_view>

#include "platform/FrameworkLoader.h"
#include "platform/linux/DeviceRoot.h"

namespace accounts {

/// Frameworks as shared objects beneath the device root. Loaded ones stay loaded as long as the
/// process lives, since their classes do.
class LinuxFrameworkLoader : public FrameworkLoader, private ClassRegistry {
 public:
  explicit LinuxFrameworkLoader(const DeviceRoot& root) : root_(root) {}

  Result loadFramework(std::string_view path) override;
  ClassRegistry& classes() override { return *this; }

 private:
  void registerClass(std::string name, AccountClass accountClass) override;
  [[nodiscard]] const AccountClass* classNamed(std::string_view name) const override;

  const DeviceRoot& root_;
  /// The device paths of the loaded frameworks.
  std::set<std::string, std::less<>> loaded_;
  std::map<std::string, AccountClass, std::less<>> classes_;
};

}  // namespace accounts
