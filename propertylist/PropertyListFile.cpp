#include "propertylist/PropertyListFile.h"

#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

std::optional<PropertyValue> readPropertyList(std::string_view bytes, PropertyListError& error) {
  if (bytes.empty()) {
    error.text = "property list: the file is empty";
    return std::nullopt;
  }
  return isBinaryPropertyList(bytes) ? readBinaryPropertyList(bytes, error)
                                     : readXMLPropertyList(bytes, error);
}

}  // namespace accounts
