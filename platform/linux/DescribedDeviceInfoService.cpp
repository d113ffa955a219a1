#include "platform/linux/DescribedDeviceInfoService.h"

namespace accounts {

std::optional<PropertyValue> DescribedDeviceInfoService::copyAnswer(std::string_view question) {
  const PropertyValue* answer = description_.deviceInfo.find(question);
  return answer != nullptr ? std::optional(*answer) : std::nullopt;
}

}  // namespace accounts
