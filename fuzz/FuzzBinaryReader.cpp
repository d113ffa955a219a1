#include "fuzz/FuzzTarget.h"
#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

/// Any bytes give the binary reader a value or an error text, and the reader of either format
/// leaves to it what begins as a binary property list.
void runOneInput(std::string_view bytes) {
  PropertyListError error;
  const std::optional<PropertyValue> value = readBinaryPropertyList(bytes, error);
  require(value.has_value() || !error.text.empty(), "an error has a text");
  require(!value || isBinaryPropertyList(bytes), "what is read begins as a binary property list");

  if (isBinaryPropertyList(bytes)) {
    PropertyListError errorOfEither;
    const bool isRead = readPropertyList(bytes, errorOfEither).has_value();
    require(isRead == value.has_value() && errorOfEither.text == error.text,
            "the reader of either format says what the binary reader says");
  }
}

}  // namespace accounts
