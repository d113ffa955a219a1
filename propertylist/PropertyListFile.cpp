#include "propertylist/PropertyListFile.h"

#include "propertylist/binary/BinaryPropertyList.h"
#include "propertylist/xml/XMLPropertyList.h"

namespace accounts {

OrPropertyListError<PropertyValue> readPropertyList(std::string_view bytes) {
  if (bytes.empty()) {
    return PropertyListError{"property list: the file is empty"};
  }
  return isBinaryPropertyList(bytes) ? readBinaryPropertyList(bytes) : readXMLPropertyList(bytes);
}

}  // namespace accounts
