#pragma once

#include <algorithm>
#include <array>
#include <span>
#include <string_view>

#include "accountsettings/BasicAccount.h"

namespace accounts {

// Account classes: the values of "Class" by which the conversions and the upgrade steps know an
// account.
inline constexpr std::string_view gmailAccountClass = "GmailAccount";
inline constexpr std::string_view yahooAccountClass = "YahooAccount";
inline constexpr std::string_view aolAccountClass = "AOLAccount";
inline constexpr std::string_view imapAccountClass = "IMAPAccount";
inline constexpr std::string_view popAccountClass = "POPAccount";
inline constexpr std::string_view genericMailAccountClass = "MailAccount";
inline constexpr std::string_view smtpAccountClass = "SMTPAccount";
inline constexpr std::string_view deliveryAccountClass = "DeliveryAccount";
inline constexpr std::string_view dataAccessMailAccountClass = "DAMailAccount";
inline constexpr std::string_view tolvaneIMAPAccountClass = "TolvaneIMAPAccount";
/// The hosted mail service under its current and its earliest name.
inline constexpr std::string_view velmoraAccountClass = "VelmoraAccount";
inline constexpr std::string_view marrowAccountClass = "MarrowAccount";
/// The maker's primary cloud account.
inline constexpr std::string_view cloudAccountClass = "ZQAccount";
/// A stand-alone calendar account.
inline constexpr std::string_view calDAVAccountClass = "MobileCalDAVAccount";

/// Boolean of a mail account. What its absence means differs from step to step.
inline constexpr std::string_view isActiveKey = "IsActive";

/// Whether an account's class is one of these, compared exactly.
inline bool hasClassAmong(const BasicAccount& account, std::span<const std::string_view> classes) {
  const std::optional<Text> accountClass = account.accountClass();
  return accountClass && std::ranges::find(classes, accountClass->view()) != classes.end();
}

inline bool hasClass(const BasicAccount& account, std::string_view accountClass) {
  return hasClassAmong(account, std::array{accountClass});
}

}  // namespace accounts
