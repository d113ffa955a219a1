#include "platform/linux/OpenInputs.h"

#include <sys/stat.h>

#include "platform/linux/OpenedBytes.h"

namespace accounts {

OpenInputs openInputsOf(const DeviceSnapshot& snapshot) {
  OpenInputs inputs;
  for (const PlaceState& place : snapshot.places) {
    const auto* const opened = dynamic_cast<const OpenedBytes*>(place.contents.get());
    struct stat status = {};
    if (opened != nullptr && ::fstat(opened->file().number(), &status) == 0) {
      inputs.descriptors.push_back(opened->file().number());
      inputs.size += static_cast<std::uint64_t>(status.st_size);
    }
  }
  return inputs;
}

}  // namespace accounts
