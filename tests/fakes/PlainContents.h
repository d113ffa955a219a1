#pragma once

#include <string_view>

#include "propertylist/value/SerializedPropertyList.h"

namespace accounts {

/// Contents of a file that are a text as it stands, for tests that look at what is written.
inline SerializedPropertyList plainContents(std::string_view text) {
  return {text, [](const PropertyValue& value, const SerializedPropertyList::Taker& take) {
            return take(*value.asText());
          }};
}

}  // namespace accounts
