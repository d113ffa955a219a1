#pragma once

#include <sys/types.h>

#include <map>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/ConsoleLog.h"
#include "platform/FrameworkLoader.h"
#include "platform/linux/DeviceRoot.h"

namespace accounts {

/// The name of the function that a framework registers its classes with.
inline constexpr const char* kFrameworkEntryPoint = "RegisterClasses";

/// Frameworks as shared objects beneath the device root. Loaded ones stay loaded as long as the
/// process lives, since their classes do.
class LinuxFrameworkLoader : public FrameworkLoader, private ClassRegistry {
 public:
  /// The log gets a line for a class that two frameworks bring.
  LinuxFrameworkLoader(const DeviceRoot& root, ConsoleLog& log) : root_(root), log_(log) {}

  Result loadFramework(std::string_view path) override;
  ClassRegistry& classes() override { return *this; }
  /// The names of all classes that were registered, sorted.
  [[nodiscard]] std::vector<std::string> classNames() const;

 private:
  void registerClass(std::string name, AccountClass accountClass) override;
  [[nodiscard]] const AccountClass* classNamed(std::string_view name) const override;

  struct Registered {
    AccountClass accountClass;
    /// The framework that brought it; empty for the system itself.
    std::string framework;
  };

  const DeviceRoot& root_;
  ConsoleLog& log_;
  /// Devices and inodes of the loaded frameworks, whatever names led to them.
  std::set<std::pair<dev_t, ino_t>> loaded_;
  std::map<std::string, Registered, std::less<>> classes_;
  /// The framework that registers its classes.
  std::string registering_;
};

}  // namespace accounts
