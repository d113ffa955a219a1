#include "platform/linux/LinuxPreferenceDomain.h"

#include <string>

#include "vocabulary/DevicePath.h"

namespace accounts {

void LinuxPreferenceDomain::synchronize(std::string_view /*domain*/) {
  // Nothing is kept between reads that could be out of date.
}

std::optional<PropertyValue> LinuxPreferenceDomain::copyValue(std::string_view key,
                                                              std::string_view domain) {
  if (domain.find('/') != std::string_view::npos) {
    return std::nullopt;
  }
  const std::string file = std::string(domain) + ".plist";
  const auto preferences = propertyLists_.readDictionary(
      joinedPath(joinedPath(home_.path(), "Library/Preferences"), file));
  const PropertyValue* value = preferences ? preferences->find(key) : nullptr;
  return value != nullptr ? std::optional(*value) : std::nullopt;
}

}  // namespace accounts
