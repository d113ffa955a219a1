#pragma once

#include <cstddef>
#include <cstdint>

#include "propertylist/value/PropertyValue.h"

namespace accounts {

/// The contents of an account settings file with a number of top-level accounts, in the layout of
/// the oldest builds, so that every upgrade step from any stored version finds work: all account
/// types, mail accounts with calendars of their own, hosted-service and cloud accounts in each of
/// their states, child accounts under every fourth. The first account is the one of the device
/// itself. Deterministic; an account is the same however many follow it.
PropertyDictionary generatedAccountSettings(std::size_t accountCount, std::int64_t version);

/// The contents of a mail application's legacy account preferences: a number of incoming accounts
/// and an outgoing account for every second of them, at least one.
PropertyDictionary generatedLegacyMailAccounts(std::size_t accountCount);

/// The contents of a groupware service's legacy account file with a number of accounts.
PropertyDictionary generatedLegacyExchangeAccounts(std::size_t accountCount);

}  // namespace accounts
