#pragma once

#include <vector>

#include "platform/CloudTabService.h"

namespace accounts {

/// Keeps the announcements for the host's report.
class RecordingCloudTabService final : public CloudTabService {
 public:
  void announce(CloudTabs state) override;

  /// All announcements so far, in order.
  [[nodiscard]] const std::vector<CloudTabs>& announcements() const { return announcements_; }

 private:
  std::vector<CloudTabs> announcements_;
};

}  // namespace accounts
