#include "platform/linux/RecordingPreferencesBroadcast.h"

namespace accounts {

void RecordingPreferencesBroadcast::announceChange(std::string_view application,
                                                   std::string_view key) {
  changes_.push_back({std::string(application), std::string(key)});
}

}  // namespace accounts
