#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/BundleResources.h"
#include "platform/linux/BundleFiles.h"

namespace accounts {

/// The property lists among the files of a bundle.
class LinuxBundleResources final : public BundleResources {
 public:
  /// `files` must outlive this.
  explicit LinuxBundleResources(const BundleFiles& files) : files_(files) {}

  bool hasPropertyList(std::string_view name) override;
  std::optional<PropertyDictionary> readPropertyList(std::string_view name) override;

 private:
  const BundleFiles& files_;
};

}  // namespace accounts
