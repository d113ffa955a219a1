#pragma once

#include "propertylist/value/PropertyValue.h"
#include "propertylist/value/SerializedPropertyList.h"

namespace accounts::binaryplist {

/// Passes the file of a value to a taker as a serialised property list does. Containers come first
/// in its count of objects, the outermost as 0, and scalars first in the file. The value must have
/// passed every limit that tells of its parts; false also for a file with more objects or bytes
/// than the limits, or one too small for what it stands for, which is known at its end.
bool giveFile(const PropertyValue& value, const SerializedPropertyList::Taker& take);

}  // namespace accounts::binaryplist
