#pragma once

#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "platform/FrameworkLoader.h"

namespace accounts {

/// Frameworks without shared objects: a test says which classes a path brings, or how loading it
/// fails.
class FakeFrameworkLoader : public FrameworkLoader, public ClassRegistry {
 public:
  /// The classes that the framework at a path brings. Any path not named here loads and brings
  /// none.
  std::map<std::string, std::map<std::string, AccountClass>, std::less<>> frameworks;
  /// The loader's error texts for paths that cannot be loaded.
  std::map<std::string, std::string, std::less<>> errors;
  /// Every path asked for, in order.
  std::vector<std::string> loads;

  Result loadFramework(std::string_view path) override;
  ClassRegistry& classes() override { return *this; }

  void registerClass(std::string name, AccountClass accountClass) override;
  [[nodiscard]] const AccountClass* classNamed(std::string_view name) const override;

 private:
  std::map<std::string, AccountClass, std::less<>> classes_;
};

}  // namespace accounts
