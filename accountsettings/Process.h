#pragma once

#include <cstdint>
#include <mutex>
#include <optional>
#include <utility>

#include "accountsettings/MailDirectoryMarkers.h"
#include "accountsettings/MailServices.h"
#include "platform/Platform.h"
#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// A value that is computed on first use and then kept. Any thread may ask; concurrent first users
/// wait for one computation.
template <class Value>
class Once {
 public:
  /// The value; `make` is called for it the first time only.
  template <class Make>
  const Value& get(Make&& make) {
    std::call_once(flag_, [&] { value_.emplace(std::forward<Make>(make)()); });
    return *value_;
  }

 private:
  std::once_flag flag_;
  std::optional<Value> value_;
};

/// All state that belongs to the process as a whole: the platform, every value that is computed
/// once per process, and the process-wide switch of the store. The plug-in's entry point makes the
/// one of a real process; a test makes its own for a scope. The newest one alive is the current
/// one.
class Process {
 public:
  explicit Process(Platform& platformOfTheProcess);
  Process(const Process&) = delete;
  Process& operator=(const Process&) = delete;
  ~Process();

  /// The current process. There must be one.
  static Process& current();

  Platform& platform;

  Once<LogChannel*> logChannel;
  Once<PropertyDictionary> accountTypesTable;
  Once<PropertyDictionary> orderedSupportedDataclasses;
  Once<std::optional<PropertyDictionary>> dataclassesTable;
  Once<PropertyArray> canonicalDataclasses;
  Once<std::optional<PropertyDictionary>> accountCreationMap;
  Once<MailServices> mailServices;
  Once<MailDirectoryMarkers> mailDirectoryMarkers;
  Once<bool> usesGoogleMail;
  Once<bool> savesMigrationInformation;

  /// While true, a successful save sends no change notifications.
  bool shouldSkipNotifications = false;

  /// How many accounts that are told of this process made.
  std::uint32_t madeAccounts = 0;

  /// Counts the changes of account identifiers, so that an index by identifier knows when it is out
  /// of date.
  std::uint64_t identifierChanges = 0;
  /// The same for sync identifiers.
  std::uint64_t syncIdentifierChanges = 0;

 private:
  Process* previous_;
};

}  // namespace accounts
