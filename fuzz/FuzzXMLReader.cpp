#include "fuzz/FuzzTarget.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

/// Any bytes give the XML reader a value that can be written, or an error text.
void runOneInput(std::string_view bytes) {
  const auto value = readXMLPropertyList(bytes);
  require(value || !value.error().text.empty(), "an error has a text");
  if (value) {
    require(writeBinaryPropertyList(*value).has_value(), "what is read can be written");
  }
}

}  // namespace accounts
