#include "propertylist/value/ContentTable.h"

#include <utility>

namespace accounts {

void ContentTable::grow() {
  const std::vector<Slot> old = std::exchange(slots_, std::vector<Slot>(2 * slots_.size()));
  for (const Slot& slot : old) {
    if (slot.numberPlusOne != 0) {
      std::size_t place = firstPlace(slot.hash);
      while (slots_[place].numberPlusOne != 0) {
        place = placeAfter(place);
      }
      slots_[place] = slot;
    }
  }
}

}  // namespace accounts
