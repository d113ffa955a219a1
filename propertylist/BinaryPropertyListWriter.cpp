#include <utility>

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
  return top ? std::optional(File(catalogue, *top).bytes().whole()) : std::nullopt;
}

BinaryPropertyListWriter::BinaryPropertyListWriter() = default;

BinaryPropertyListWriter::~BinaryPropertyListWriter() = default;

std::optional<BytesInPieces> BinaryPropertyListWriter::write(const PropertyValue& value,
                                                             PropertyListError& error) {
  if (file_ != nullptr && value == lastValue_) {
    return file_->bytes();
  }
  const std::size_t lastObjectCount = file_ != nullptr ? file_->objectCount() : 0;
  file_.reset();
  // Kept again only once the value is in it: nothing that ends halfway leaves half of it here.
  std::unique_ptr<Catalogue> catalogue = std::move(catalogue_);
  // More than as much again that only earlier values had is not worth its memory.
  const bool isFirst = catalogue == nullptr || catalogue->objectCount() > 2 * lastObjectCount;
  if (isFirst) {
    catalogue = std::make_unique<Catalogue>();
  }
  const std::optional<Catalogue::Reference> top = catalogue->add(value, error);
  if (!top) {
    // What was written before may have used up the room for objects.
    return isFirst ? std::nullopt : write(value, error);
  }
  file_ = std::make_unique<File>(*catalogue, *top);
  catalogue_ = std::move(catalogue);
  lastValue_ = value;
  return file_->bytes();
}

}  // namespace accounts
