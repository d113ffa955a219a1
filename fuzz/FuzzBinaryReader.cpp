#include "fuzz/FuzzTarget.h"
#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

/// Any bytes give the binary reader a value or an error text, and the reader of either format
/// leaves to it what begins as a binary property list.
void runOneInput(std::string_view bytes) {
  const auto value = readBinaryPropertyList(bytes);
  require(value || !value.error().text.empty(), "an error has a text");
  require(!value || isBinaryPropertyList(bytes), "what is read begins as a binary property list");

  if (isBinaryPropertyList(bytes)) {
    const auto ofEither = readPropertyList(bytes);
    require(ofEither.has_value() == value.has_value() &&
                (value || ofEither.error().text == value.error().text),
            "the reader of either format says what the binary reader says");
  }
}

}  // namespace accounts
