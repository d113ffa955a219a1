#pragma once

#include <optional>
#include <string_view>

#include "platform/HomeDirectory.h"
#include "platform/PreferenceDomain.h"
#include "platform/PropertyLists.h"

namespace accounts {

/// Preferences as property lists, Library/Preferences/DOMAIN.plist in the home directory. Every
/// value is read from the file afresh. The arguments must outlive this.
class LinuxPreferenceDomain final : public PreferenceDomain {
 public:
  LinuxPreferenceDomain(PropertyLists& propertyLists, HomeDirectory& home)
      : propertyLists_(propertyLists), home_(home) {}

  void synchronize(std::string_view domain) override;
  std::optional<PropertyValue> copyValue(std::string_view key, std::string_view domain) override;

 private:
  PropertyLists& propertyLists_;
  HomeDirectory& home_;
};

}  // namespace accounts
