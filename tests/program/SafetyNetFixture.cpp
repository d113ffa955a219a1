#include "tests/program/SafetyNetFixture.h"
#include "tests/program/Programs.h"

#include <algorithm>
#include <filesystem>
#include <string_view>

namespace accounts {

PropertyDictionary SafetyNetFixture::legacyMail() {
  return {{"MailAccounts",
           PropertyArray{PropertyDictionary{{"AccountType", "IMAPAccount"}, {"uniqueId", "M"}}}}};
}

ProgramCall SafetyNetFixture::misbehavingCall(const std::string& behaviour) const {
  ProgramCall call = migrationCall({"--plugin", MISBEHAVING_BUNDLE, "--json"});
  call.environment["MISBEHAVIOUR"] = behaviour;
  return call;
}

ProgramResult SafetyNetFixture::migrateMisbehaving(const std::string& behaviour) const {
  return runProgram(misbehavingCall(behaviour));
}

ProgramResult SafetyNetFixture::restore(std::vector<std::string> arguments) const {
  arguments.insert(arguments.begin(), {"restore", "--root", root()});
  return runProgram({.program = migrationHost(), .arguments = arguments});
}

std::vector<std::string> SafetyNetFixture::hostFolders() const {
  std::vector<std::string> folders;
  if (exists(kAccountMigration)) {
    for (const auto& entry :
         std::filesystem::directory_iterator(onThisMachine(kAccountMigration))) {
      folders.push_back(std::string(kAccountMigration) + "/" + entry.path().filename().string());
    }
  }
  std::sort(folders.begin(), folders.end());
  return folders;
}

std::string SafetyNetFixture::onlyKeptFolder() const {
  const std::vector<std::string> folders = hostFolders();
  EXPECT_EQ(folders.size(), 1u);
  EXPECT_TRUE(folders.size() == 1 &&
              folders[0].starts_with(std::string(kAccountMigration) + "/Kept-20"));
  return folders.empty() ? "/no folder" : folders[0];
}

struct stat SafetyNetFixture::statusOf(std::string_view devicePath) const {
  struct stat status = {};
  EXPECT_EQ(lstat(onThisMachine(devicePath).c_str(), &status), 0) << devicePath;
  return status;
}

std::vector<std::string> SafetyNetFixture::accountIdentifiers() const {
  std::vector<std::string> identifiers;
  const PropertyArray accounts =
      readDictionary(kSettingsPath).arrayForKey("Accounts").value_or(PropertyArray());
  for (const PropertyValue& account : accounts) {
    identifiers.push_back(account.asDictionary()->textForKey("Identifier")->string());
  }
  return identifiers;
}

}  // namespace accounts
