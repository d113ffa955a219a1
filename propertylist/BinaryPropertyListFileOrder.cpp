#include "propertylist/BinaryPropertyListFileOrder.h"

#include <numeric>

namespace accounts::binaryplist {

namespace {

constexpr Catalogue::Reference kNone = UINT32_MAX;

/// Gives an object the next place, unless it has one.
void leave(Catalogue::Reference object, std::vector<Catalogue::Reference>& numbers,
           std::vector<Catalogue::Reference>& order) {
  if (numbers[object] == kNone) {
    numbers[object] = static_cast<Catalogue::Reference>(order.size());
    order.push_back(object);
  }
}

}  // namespace

FileOrder::FileOrder(const Catalogue& catalogue, Catalogue::Reference top)
    : catalogue_(catalogue),
      scalarNumbers_(catalogue.scalarCount(), kNone),
      containerNumbers_(catalogue.containerCount(), kNone),
      hasKeys_(catalogue.keysCount(), false) {
  if (catalogue.holdsOneValue()) {
    takeOrderOfCatalogue();
  } else {
    scalars_.reserve(catalogue.scalarCount());
    containers_.reserve(catalogue.containerCount());
    visit(top);
  }
}

/// One walk alone left everything in this order already.
void FileOrder::takeOrderOfCatalogue() {
  std::iota(scalarNumbers_.begin(), scalarNumbers_.end(), Catalogue::Reference{0});
  std::iota(containerNumbers_.begin(), containerNumbers_.end(), Catalogue::Reference{0});
  scalars_ = scalarNumbers_;
  containers_ = containerNumbers_;
}

/// The recursion is as deep as the value, which the catalogue has bounded.
void FileOrder::visit(Catalogue::Reference reference) {
  if ((reference & Catalogue::kContainerBit) == 0) {
    leave(reference, scalarNumbers_, scalars_);
    return;
  }
  const Catalogue::Reference container = reference & ~Catalogue::kContainerBit;
  if (containerNumbers_[container] != kNone) {
    return;
  }
  const CatalogueContainer& visited = catalogue_.container(container);
  if (visited.isDictionary() && !hasKeys_[visited.keys]) {
    hasKeys_[visited.keys] = true;
    for (const Catalogue::Reference key : catalogue_.referencesOf(catalogue_.keys(visited.keys))) {
      visit(key);
    }
  }
  for (const Catalogue::Reference child : catalogue_.childrenOf(visited)) {
    visit(child);
  }
  leave(container, containerNumbers_, containers_);
}

}  // namespace accounts::binaryplist
