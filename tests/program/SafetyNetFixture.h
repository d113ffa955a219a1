#pragma once

#include <sys/stat.h>

#include <string>
#include <string_view>
#include <vector>

#include "tests/program/DeviceRootFixture.h"

namespace accounts {

inline constexpr const char* kAccountMigration = "/var/mobile/Library/AccountMigration";

/// A device root, the real host, and the real plug-in or one that misbehaves.
class SafetyNetFixture : public DeviceRootFixture {
 protected:
  /// A legacy mail store with one account, "M".
  static PropertyDictionary legacyMail();

  /// Runs a plug-in that misbehaves in a way of tests/program/plugins/MisbehavingPlugin.cpp.
  [[nodiscard]] ProgramResult migrateMisbehaving(const std::string& behaviour) const;
  [[nodiscard]] ProgramCall misbehavingCall(const std::string& behaviour) const;
  /// Runs `migration-host restore --root` on the root with further arguments.
  [[nodiscard]] ProgramResult restore(std::vector<std::string> arguments = {}) const;

  /// The device paths of the host's folders, sorted.
  [[nodiscard]] std::vector<std::string> hostFolders() const;
  /// The device path of the one folder of kept files; a failure of the test when there is another
  /// number of them.
  [[nodiscard]] std::string onlyKeptFolder() const;
  /// What stat says of a file, a link not followed.
  [[nodiscard]] struct stat statusOf(std::string_view devicePath) const;
  /// The identifiers of the accounts in the settings file, in its order.
  [[nodiscard]] std::vector<std::string> accountIdentifiers() const;
};

}  // namespace accounts
