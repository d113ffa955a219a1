#include "fuzz/FuzzTarget.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

/// Any bytes give the XML reader a value that can be written, or an error text.
void runOneInput(std::string_view bytes) {
  PropertyListError error;
  const std::optional<PropertyValue> value = readXMLPropertyList(bytes, error);
  require(value.has_value() || !error.text.empty(), "an error has a text");
  if (value) {
    require(writeBinaryPropertyList(*value, error).has_value(), "what is read can be written");
  }
}

}  // namespace accounts
