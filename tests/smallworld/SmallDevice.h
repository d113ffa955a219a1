#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "platform/ExternalSyncSources.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {

/// A device of up to two accounts, and what its services answer.
struct SmallDevice {
  /// The bytes of its files; a place that is not here has none.
  std::map<DevicePlace, std::string> files = {};
  /// What it is, for whoever has to look at it.
  std::string description = {};
  /// A processor that runs one program at a time.
  bool runsOneProgram = false;
  bool savesInformation = false;
  /// A region where a mail service has another name.
  bool usesGoogleMail = false;
  /// The answer for each kind of data.
  ExternalSyncSourcesAnswer syncSources = {};
};

/// How many small devices there are.
std::uint64_t smallWorldSize();

/// One of them, by its number below that.
SmallDevice smallDevice(std::uint64_t number);

}  // namespace accounts
