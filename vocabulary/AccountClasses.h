#pragma once

#include <string_view>

namespace accounts {

// Account classes: the values of "Class" by which the rules know an account.
inline constexpr std::string_view kGmailAccountClass = "GmailAccount";
inline constexpr std::string_view kYahooAccountClass = "YahooAccount";
inline constexpr std::string_view kAOLAccountClass = "AOLAccount";
inline constexpr std::string_view kIMAPAccountClass = "IMAPAccount";
inline constexpr std::string_view kPOPAccountClass = "POPAccount";
inline constexpr std::string_view kGenericMailAccountClass = "MailAccount";
inline constexpr std::string_view kSMTPAccountClass = "SMTPAccount";
inline constexpr std::string_view kDeliveryAccountClass = "DeliveryAccount";
inline constexpr std::string_view kDataAccessMailAccountClass = "DAMailAccount";
inline constexpr std::string_view kTolvaneIMAPAccountClass = "TolvaneIMAPAccount";
inline constexpr std::string_view kLocalMailAccountClass = "LocalAccount";
/// The hosted mail service under its current and its earliest name.
inline constexpr std::string_view kVelmoraAccountClass = "VelmoraAccount";
inline constexpr std::string_view kMarrowAccountClass = "MarrowAccount";
/// The maker's primary cloud account.
inline constexpr std::string_view kCloudAccountClass = "ZQAccount";
/// A stand-alone calendar account.
inline constexpr std::string_view kCalDAVAccountClass = "MobileCalDAVAccount";
/// The device's own account; its identifier, too.
inline constexpr std::string_view kDeviceLocalAccountClass = "DeviceLocalAccount";

/// Boolean of a mail account. What its absence means differs from step to step.
inline constexpr std::string_view kIsActiveKey = "IsActive";

/// The hosted mail service's records of subscribed calendars.
inline constexpr std::string_view kExoSubscribedCalendarsKey = "DAExoSubscribedCalendarInfos";

}  // namespace accounts
