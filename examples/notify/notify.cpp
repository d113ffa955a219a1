#include <cstdio>
#include <string>

#include "accountsettings/AccountsManager.h"
#include "accountsettings/Process.h"
#include "platform/linux/LinuxPlatform.h"

// Opens the account settings of a device outside a migration, renames the first Yahoo account,
// deletes the first Exchange account, adds a mail account, saves, and so shows what the notifiers
// of the device's frameworks are told. The lines on standard output are the notifiers' own.

namespace {

using namespace accounts;

/// An account of the mail application with mail on.
BasicAccountReference newMailAccount() {
  return BasicAccount::accountWithProperties(
      {{kAccountType, kMailAccountType},
       {kAccountClass, "IMAPAccount"},
       {kAccountIdentifier, "NOTIFY-NEW"},
       {kAccountDisplayName, "New mail account"},
       {kAccountEnabledDataclasses, PropertyArray{kAccountDataclassMail}}});
}

/// Renames the first account of a type, announcing the change of a dataclass before and after.
void renameFirst(AccountsManager& store, std::string_view type, std::string_view dataclass) {
  for (const BasicAccountReference& account : store.basicAccountsWithTypes({type})) {
    AccountsManager::accountWillChange_forDataclass(*account, dataclass);
    account->setDisplayName(Text("Renamed"));
    AccountsManager::accountDidChange_forDataclass(*account, dataclass);
    return;
  }
}

void deleteFirst(AccountsManager& store, std::string_view type) {
  const AccountsManager::Accounts candidates = store.basicAccountsWithTypes({type});
  if (!candidates.empty()) {
    store.deleteAccount(candidates.front());
  }
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fputs("Usage: notify ROOT BUNDLE\n", stderr);
    return 64;
  }
  LinuxPlatformOptions options;
  options.rootDirectory = argv[1];
  options.bundleResourcesDirectory = std::string(argv[2]) + "/Resources";

  const auto platform = LinuxPlatform::create(options);
  if (!platform) {
    std::fprintf(stderr, "notify: %s\n", platform.error().failure.text.c_str());
    return 1;
  }
  Process process((*platform)->platform());
  const std::unique_ptr<AccountsManager> store = AccountsManager::init();
  renameFirst(*store, kYahooAccountType, kAccountDataclassMail);
  deleteFirst(*store, kExchangeAccountType);
  store->insertAccount(newMailAccount());
  store->saveAllAccounts();
  return 0;
}
