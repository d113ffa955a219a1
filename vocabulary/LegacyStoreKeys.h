#pragma once

#include <array>
#include <string_view>

namespace accounts {

// The keys of the legacy stores that more than one part of the system reads.

// The mail application's account preferences.
/// Arrays of descriptions of incoming and of outgoing accounts.
inline constexpr std::string_view kLegacyIncomingAccounts = "MailAccounts";
inline constexpr std::string_view kLegacyOutgoingAccounts = "DeliveryAccounts";
// Of a description.
inline constexpr std::string_view kLegacyMailClass = "AccountType";
inline constexpr std::string_view kLegacyMailDisplayName = "AccountName";
/// The oldest settings files have it as well.
inline constexpr std::string_view kLegacyMailIdentifier = "uniqueId";

// The Exchange account file.
/// Array of descriptions.
inline constexpr std::string_view kLegacyExchangeAccounts = "DAAccountsKey";
// Of a description.
inline constexpr std::string_view kLegacyExchangeClass = "DAAccountConfigurationClass";
inline constexpr std::string_view kLegacyExchangeDisplayName = "DAAccountDescription";
inline constexpr std::string_view kLegacyExchangeIdentifier = "DAAccountConfigurationAccountID";

/// Booleans that switch dataclasses: calendars, contacts, mail, contacts search.
inline constexpr std::array<std::string_view, 4> kLegacyExchangeSwitches = {
    "DAAccountEnabledForCalendar", "DAAccountEnabledForContacts", "DAAccountEnabledForEmail",
    "DAAccountEnabledForContactsSearch"};

// The migration-information file: the files as they were and as they are.
inline constexpr std::string_view kInformationOldMailAccounts = "OldMailAccounts";
inline constexpr std::string_view kInformationOldExchangeAccounts = "OldExchangeAccount";
inline constexpr std::string_view kInformationOldSettings = "OldAccountSettings";
// Kept on purpose: one letter short of "Account". Readers of information files look for this key.
inline constexpr std::string_view kInformationNewSettings = "NewAccounSettings";

}  // namespace accounts
