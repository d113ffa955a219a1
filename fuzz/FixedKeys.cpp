#include "propertylist/value/KeyedHash.h"

namespace accounts {

// In the place of the definition that makes keys: under keys of chance an input would take another
// way through the tables in each run, and no two runs would learn the same from it.
KeyedHash::KeyedHash() : first_(0x9E3779B97F4A7C15), second_(0xC2B2AE3D27D4EB4F) {}

}  // namespace accounts
