#include <string>

#include "fuzz/FuzzTarget.h"
#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

/// A value that is read, in either format, is written, and what is written reads as an equal value
/// and is written to the same bytes again.
void runOneInput(std::string_view bytes) {
  PropertyListError error;
  const std::optional<PropertyValue> value = readPropertyList(bytes, error);
  if (!value) {
    return;
  }
  const std::optional<std::string> written = writeBinaryPropertyList(*value, error);
  if (!written) {
    // A file that has more bytes than its values take may stand for more than one without them.
    require(error.text.find("more values than a file of its size") != error.text.npos,
            "what is read can be written");
    return;
  }
  const std::optional<PropertyValue> again = readPropertyList(*written, error);
  require(again.has_value(), "what is written can be read");
  require(*again == *value, "what is written reads as an equal value");
  require(writeBinaryPropertyList(*again, error) == written,
          "an equal value is written to the same bytes");
}

}  // namespace accounts
