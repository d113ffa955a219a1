#include "safetynet/AccountFiles.h"

namespace accounts {

AccountFiles accountFilesInHome(std::string_view home) {
  const std::string library = pathIn(home, "Library");
  return {.settings = "/var/mobile/Library/Preferences/com.quarx.accountsettings.plist",
          .legacyMail = pathIn(library, "Mail/Accounts.plist"),
          .legacyExchange = pathIn(library, "Preferences/com.quarx.DataAccess.plist"),
          .removalSentinel = pathIn(library, "Preferences/.removingOldAccounts")};
}

std::string_view directoryOf(std::string_view path) {
  return path.substr(0, path.rfind('/'));
}

std::string_view nameOf(std::string_view path) {
  return path.substr(path.rfind('/') + 1);
}

std::string pathIn(std::string_view directory, std::string_view name) {
  std::string path(directory);
  if (!path.ends_with('/')) {
    path += '/';
  }
  return path.append(name);
}

}  // namespace accounts
