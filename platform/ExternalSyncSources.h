#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The kinds of data that external sources may sync.
enum class SyncDataType : std::uint8_t { Bookmarks, Calendars, Contacts, Notes };

/// What the service answers for one kind of data. Both parts may be missing; only a non-empty error
/// text reports an error.
struct ExternalSyncSourcesAnswer {
  std::optional<PropertyArray> sources;
  std::optional<std::string> error;
};

/// Tells which external sync sources are enabled.
class ExternalSyncSources {
 public:
  virtual ~ExternalSyncSources() = default;

  virtual ExternalSyncSourcesAnswer copyEnabledSources(SyncDataType dataType) = 0;
};

}  // namespace accounts
