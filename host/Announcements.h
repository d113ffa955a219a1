#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/RecordingPreferencesBroadcast.h"

namespace accounts {

/// What a migration announces.
struct Announcements {
  std::vector<PreferencesChange> broadcasts;
  /// How often cloud tabs were announced to be on.
  std::size_t cloudTabs = 0;
};

/// Announcements as bytes for the host, and the announcements that bytes stand for; none when they
/// are no such bytes.
std::string bytesOf(const Announcements& announcements);
std::optional<Announcements> announcementsFrom(std::string_view bytes);

/// Announces on the system's D-Bus what a migration announced. A sentence when the bus cannot be
/// told, which is no more than a warning: the migration is done.
std::optional<std::string> broadcastOnDBus(const Announcements& announcements);

}  // namespace accounts
