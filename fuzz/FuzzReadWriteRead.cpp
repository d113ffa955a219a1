#include <string>

#include "fuzz/FuzzTarget.h"
#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {

/// A value that is read, in either format, is written, and what is written reads as an equal value
/// and is written to the same bytes again.
void runOneInput(std::string_view bytes) {
  const auto value = readPropertyList(bytes);
  if (!value) {
    return;
  }
  const auto written = writeBinaryPropertyList(*value);
  if (!written) {
    // A file that has more bytes than its values take may stand for more than one without them.
    require(written.error().text.find("more values than a file of its size") != std::string::npos,
            "what is read can be written");
    return;
  }
  const auto again = readPropertyList(*written);
  require(again.has_value(), "what is written can be read");
  require(*again == *value, "what is written reads as an equal value");
  const auto writtenAgain = writeBinaryPropertyList(*again);
  require(writtenAgain.has_value() && *writtenAgain == *written,
          "an equal value is written to the same bytes");
}

}  // namespace accounts
