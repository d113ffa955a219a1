#pragma once

#include <string_view>

#include "vocabulary/LegacyStoreKeys.h"

namespace accounts {

// What other services of a device are asked and told.

/// The mail application, and the preference of its that stands for all mail accounts.
inline constexpr std::string_view kMailApplication = "com.quarx.mobilemail";
inline constexpr std::string_view kMailAccountsPreference = kLegacyIncomingAccounts;

/// A question to the device, and the answer of those that run one program at a time.
inline constexpr std::string_view kArchitectureQuestion = "CPUArchitecture";
inline constexpr std::string_view kArchitectureWithoutMultitasking = "armv6";

/// The cloud account service's flag of the primary account.
inline constexpr std::string_view kPrimaryAccountKey = "primaryAccount";

}  // namespace accounts
