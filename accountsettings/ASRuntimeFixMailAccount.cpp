#include "accountsettings/ASRuntimeFixMailAccount.h"

#include <algorithm>

#include "accountsettings/Log.h"
#include "accountsettings/Process.h"
#include "vocabulary/AccountClasses.h"
#include "vocabulary/DeviceServices.h"

void reportMailAccountClassFound() {}

namespace accounts {

namespace {

/// The mail account classes that need no fixing.
constexpr std::array<std::string_view, 8> _supportedMailClasses = {
    kMarrowAccountClass, kVelmoraAccountClass,   kPOPAccountClass,   kIMAPAccountClass,
    kAOLAccountClass,    kLocalMailAccountClass, kGmailAccountClass, kYahooAccountClass};

constexpr std::string_view kAccountPathKey = "AccountPath";

template <std::size_t count>
bool contains(const std::array<std::string_view, count>& texts, const std::optional<Text>& text) {
  return text && std::find(texts.begin(), texts.end(), text->view()) != texts.end();
}

}  // namespace

const std::array<std::string_view, 2>& ASRuntimeFixMailAccount::supportedAccountTypes() {
  static const std::array<std::string_view, 2> types = {kVelmoraAccountType, kMailAccountType};
  return types;
}

FixResult ASRuntimeFixMailAccount::fixBasicAccountIfNeeded_loggingMessage(
    BasicAccount& account, std::string_view /*loggingMessage*/) {
  if (!contains(supportedAccountTypes(), account.type()) ||
      contains(_supportedMailClasses, account.accountClass())) {
    return FixResult::Unchanged;
  }
  _shouldNotifyMobileMail = true;
  return _cleanupAccountClass(account) ? FixResult::Changed : FixResult::CannotBeKept;
}

void ASRuntimeFixMailAccount::accountsHaveBeenSaved(bool saved) {
  if (_shouldNotifyMobileMail && saved) {
    Process::current().platform.preferencesBroadcast.announceChange(kMailApplication,
                                                                    kMailAccountsPreference);
  }
  _shouldNotifyMobileMail = false;
}

bool ASRuntimeFixMailAccount::_cleanupAccountClass(BasicAccount& account) {
  const MailDirectoryMarkers& markers = Process::current().mailDirectoryMarkers.get(
      [] { return makeMailDirectoryMarkers(MailServices::current()); });
  const Text path = account.textPropertyForKey(kAccountPathKey).value_or(Text());
  const std::string_view accountClass = mailClassForDirectory(markers, path);
  if (accountClass.empty()) {
    logToChannel("-[ASRuntimeFixMailAccount(Internal) _cleanupAccountClass:]",
                 "Could not fix the class of the mail account: %@",
                 [&] { return logArguments(account.properties()); });
    return false;
  }
  account.setAccountClass(accountClass);
  return true;
}

}  // namespace accounts
