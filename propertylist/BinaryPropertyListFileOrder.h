#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "propertylist/BinaryPropertyListCatalogue.h"

namespace accounts::binaryplist {

/// The order in which the parts of one value stand in a file: that in which a walk over the value
/// leaves them, whatever else the catalogue holds.
class FileOrder {
 public:
  /// `top` is the value's reference. The catalogue must outlive this and stay as it is.
  FileOrder(const Catalogue& catalogue, Catalogue::Reference top);

  /// The catalogue's numbers of what the file holds; the outermost container comes last.
  [[nodiscard]] const std::vector<Catalogue::Reference>& scalars() const { return scalars_; }
  [[nodiscard]] const std::vector<Catalogue::Reference>& containers() const { return containers_; }
  [[nodiscard]] std::size_t objectCount() const { return scalars_.size() + containers_.size(); }

  /// The object number in the file: containers come first, the outermost as 0.
  [[nodiscard]] std::uint32_t numberInFile(Catalogue::Reference reference) const {
    const auto containerCount = static_cast<std::uint32_t>(containers_.size());
    return (reference & Catalogue::kContainerBit) != 0
               ? containerCount - 1 - containerNumbers_[reference & ~Catalogue::kContainerBit]
               : containerCount + scalarNumbers_[reference];
  }

 private:
  void takeOrderOfCatalogue();
  void visit(Catalogue::Reference reference);

  const Catalogue& catalogue_;
  /// By the catalogue's number: the place among the scalars, or the containers, of the file.
  std::vector<Catalogue::Reference> scalarNumbers_;
  std::vector<Catalogue::Reference> containerNumbers_;
  /// Whether the keys with a number have their places.
  std::vector<bool> hasKeys_;
  std::vector<Catalogue::Reference> scalars_;
  std::vector<Catalogue::Reference> containers_;
};

}  // namespace accounts::binaryplist
