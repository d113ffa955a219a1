#include "platform/linux/RecordingCloudTabService.h"

namespace accounts {

void RecordingCloudTabService::announce(CloudTabs state) {
  announcements_.push_back(state);
}

}  // namespace accounts
