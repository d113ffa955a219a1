#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/PreferencesBroadcast.h"

namespace accounts {

/// One announcement that an application's preferences changed.
struct PreferencesChange {
  std::string application;
  std::string key;

  friend bool operator==(const PreferencesChange&, const PreferencesChange&) = default;
};

/// Keeps the announcements for the host's report.
class RecordingPreferencesBroadcast final : public PreferencesBroadcast {
 public:
  void announceChange(std::string_view application, std::string_view key) override;

  /// All announcements so far, in order.
  [[nodiscard]] const std::vector<PreferencesChange>& changes() const { return changes_; }

 private:
  std::vector<PreferencesChange> changes_;
};

}  // namespace accounts
