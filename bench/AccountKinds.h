#pragma once

#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace accounts {

/// Whether a mail account says that it is used. An account that is not of mail says nothing.
enum class Activity { Unsaid, Active, Inactive };

/// Whose calendars a CalDAV account holds. Those of a web-mail account hold the calendars of the
/// account right before it, so that an upgrade folds the two into one.
enum class Calendars { None, OwnServer, GoogleOfPrevious, YahooOfPrevious };

/// The child accounts under an account.
enum class Children { None, Calendars, MailAndCalendars };

/// The identifiers that an account has.
enum class Identifiers {
  /// "Identifier" alone.
  Current,
  /// The oldest builds' "uniqueId" beside it, which replaces it.
  CurrentAndOldest
};

/// What the generated accounts of one kind have in common.
struct AccountKind {
  std::string_view type;
  std::string_view accountClass;
  std::string_view displayName;
  /// The server's name, and the start of the mail directory's name; empty for none.
  std::string_view host = {};
  std::string_view mailDirectoryPrefix = {};
  std::vector<std::string_view> enabledDataclasses = {};
  /// Empty for an account without a list, which is set up for all that its type supports.
  std::vector<std::string_view> provisionedDataclasses = {};
  Activity activity = Activity::Unsaid;
  Identifiers identifiers = Identifiers::Current;
  Calendars calendars = Calendars::None;
  Children children = Children::None;
  /// The status of a cloud account.
  std::optional<int> status = std::nullopt;
};

/// The kinds in the order in which generated accounts cycle through them.
std::span<const AccountKind> accountKinds();

/// The kind of the device's own account, of which there is one.
const AccountKind& deviceLocalAccountKind();

}  // namespace accounts
