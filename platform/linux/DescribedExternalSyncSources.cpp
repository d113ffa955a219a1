#include "platform/linux/DescribedExternalSyncSources.h"

namespace accounts {

ExternalSyncSourcesAnswer DescribedExternalSyncSources::copyEnabledSources(SyncDataType dataType) {
  return description_.externalSyncSources.at(static_cast<std::size_t>(dataType));
}

}  // namespace accounts
