#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/BundleResources.h"

namespace accounts {

/// The Resources directory of a bundle, on the host, outside any device root.
class LinuxBundleResources final : public BundleResources {
 public:
  explicit LinuxBundleResources(std::string resourcesDirectory);

  bool hasPropertyList(std::string_view name) override;
  std::optional<PropertyDictionary> readPropertyList(std::string_view name) override;

 private:
  std::string resourcesDirectory_;
};

}  // namespace accounts
