#pragma once

#include <cstddef>
#include <span>

#include "propertylist/BinaryPropertyListCatalogue.h"
#include "propertylist/BinaryPropertyListFileOrder.h"
#include "propertylist/SerializedPropertyList.h"

namespace accounts::binaryplist {

class Output;

/// The file that holds a value of a catalogue. Containers come first in the count of objects, the
/// outermost as 0, and scalars first in the file.
class File {
 public:
  /// `top` is the value's reference. The catalogue must outlive this and stay as it is.
  File(const Catalogue& catalogue, Catalogue::Reference top);

  [[nodiscard]] std::size_t objectCount() const { return order_.objectCount(); }
  /// How many bytes it has.
  [[nodiscard]] std::size_t size() const;
  /// Passes the bytes to a taker as a serialised property list does.
  [[nodiscard]] bool giveTo(const SerializedPropertyList::Taker& take) const;

 private:
  class EncodedKeys;
  void write(Output& output) const;
  template <std::size_t OffsetSize>
  void writeObjectsAndTable(Output& output) const;
  void putReferences(Output& output, std::span<const Catalogue::Reference> references) const;
  void storeReferences(char* place, std::span<const Catalogue::Reference> references) const;

  const Catalogue& catalogue_;
  FileOrder order_;
  std::size_t referenceSize_;
  /// Where the table of offsets begins.
  std::size_t table_;
  std::size_t offsetSize_;
};

}  // namespace accounts::binaryplist
