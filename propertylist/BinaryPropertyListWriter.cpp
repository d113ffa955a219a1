#include "propertylist/BinaryPropertyList.h"
#include "propertylist/BinaryPropertyListCatalogue.h"
#include "propertylist/BinaryPropertyListFile.h"

namespace accounts {

using binaryplist::Catalogue;
using binaryplist::File;

std::optional<std::string> writeBinaryPropertyList(const PropertyValue& value,
                                                   PropertyListError& error) {
  Catalogue catalogue;
  const std::optional<Catalogue::Reference> top = catalogue.add(value, error);
  if (!top) {
    return std::nullopt;
  }
  const File file(catalogue, *top);
  std::string bytes;
  bytes.reserve(file.size());
  static_cast<void>(file.giveTo([&bytes](std::string_view piece) {
    bytes.append(piece);
    return true;
  }));
  return bytes;
}

bool giveBinaryPropertyList(const PropertyValue& value, const SerializedPropertyList::Taker& take) {
  PropertyListError error;
  Catalogue catalogue;
  const std::optional<Catalogue::Reference> top = catalogue.add(value, error);
  return top && File(catalogue, *top).giveTo(take);
}

}  // namespace accounts
