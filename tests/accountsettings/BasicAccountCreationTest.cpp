#include <gtest/gtest.h>

#include "tests/accountsettings/TestRecords.h"

namespace accounts {
namespace {

using Lines = std::vector<std::string>;

constexpr const char* kFirstUUID = "00000000-0000-0000-0000-000000000001";

const AccountDictionary complete = anAccount("mail-1", "Mail", "IMAPAccount");

TEST(BasicAccountCreation, ACompleteDictionaryBecomesTheRecordAsItIs) {
  FakeProcess device;
  const BasicAccountReference account = BasicAccount::initWithProperties(complete);
  EXPECT_EQ(account->properties(), PropertyDictionary(complete));
  EXPECT_EQ(account->parentAccount(), nullptr);
}

TEST(BasicAccountCreation, ADictionaryWithAnIdentifierGetsNoSyncIdentifier) {
  FakeProcess device;
  const BasicAccountReference account = BasicAccount::initWithProperties(complete);
  EXPECT_FALSE(account->properties().contains(kAccountSyncIdentifier));
  EXPECT_EQ(account->syncStoreIdentifier(), std::nullopt);
}

TEST(BasicAccountCreation, ADictionaryWithoutIdentifierGetsAFreshOneForSyncingToo) {
  FakeProcess device;
  const auto account = BasicAccount::initWithProperties(complete.without(kAccountIdentifier));
  EXPECT_EQ(account->identifier(), kFirstUUID);
  EXPECT_EQ(account->syncStoreIdentifier(), kFirstUUID);
}

TEST(BasicAccountCreation, AnExistingSyncIdentifierIsKeptBesideAFreshIdentifier) {
  FakeProcess device;
  const auto account = BasicAccount::initWithProperties(
      complete.without(kAccountIdentifier).with(kAccountSyncIdentifier, "sync-1"));
  EXPECT_EQ(account->identifier(), kFirstUUID);
  EXPECT_EQ(account->syncStoreIdentifier(), "sync-1");
}

TEST(BasicAccountCreation, AnIdentifierThatIsNoTextIsReplaced) {
  FakeProcess device;
  const auto account = BasicAccount::initWithProperties(complete.with(kAccountIdentifier, 17));
  EXPECT_EQ(account->identifier(), kFirstUUID);
}

TEST(BasicAccountCreation, AnEmptyIdentifierIsKept) {
  FakeProcess device;
  const auto account = BasicAccount::initWithProperties(complete.with(kAccountIdentifier, ""));
  EXPECT_EQ(account->identifier(), "");
}

TEST(BasicAccountCreation, WithoutAUUIDTheRecordHasNoIdentifier) {
  FakeProcess device;
  device.uuidGenerator.canGenerate = false;
  const auto account = BasicAccount::initWithProperties(complete.without(kAccountIdentifier));
  EXPECT_EQ(account->identifier(), std::nullopt);
  EXPECT_EQ(account->properties(), PropertyDictionary(complete.without(kAccountIdentifier)));
}

TEST(BasicAccountCreation, TheSnapshotIsTheDictionaryAsGiven) {
  FakeProcess device;
  const PropertyDictionary given = complete.without(kAccountIdentifier);
  const auto account = BasicAccount::initWithProperties(given);
  EXPECT_EQ(account->originalProperties(), given);
}

TEST(BasicAccountCreation, ALaterChangeLeavesTheSnapshot) {
  FakeProcess device;
  const auto account = BasicAccount::initWithProperties(complete);
  account->setDisplayName("Home");
  EXPECT_EQ(account->originalProperties(), PropertyDictionary(complete));
}

TEST(BasicAccountCreation, MakingARecordChangesNoIdentifierOfAnother) {
  FakeProcess device;
  BasicAccount::initWithProperties(complete.without(kAccountIdentifier));
  EXPECT_EQ(device.process.identifierChanges, 0U);
}

TEST(BasicAccountCreation, AnUnknownTypeIsRejectedAndNamed) {
  FakeProcess device;
  EXPECT_EQ(BasicAccount::initWithProperties(complete.with(kAccountType, "X")), nullptr);
  EXPECT_EQ(device.logSystem.channel.linesWithoutNumbers(),
            Lines{"-[BasicAccount initWithProperties:] (N) \"Invalid account type: X\""});
}

TEST(BasicAccountCreation, AMissingTypeIsRejectedAsAnAbsentOne) {
  FakeProcess device;
  EXPECT_EQ(BasicAccount::initWithProperties(complete.without(kAccountType)), nullptr);
  EXPECT_EQ(device.logSystem.channel.linesWithoutNumbers(),
            Lines{"-[BasicAccount initWithProperties:] (N) \"Invalid account type: (null)\""});
}

TEST(BasicAccountCreation, AClassThatIsMissingEmptyOrNoTextIsRejected) {
  for (const AccountDictionary& properties :
       {complete.without(kAccountClass), complete.with(kAccountClass, ""),
        complete.with(kAccountClass, 1)}) {
    FakeProcess device;
    EXPECT_EQ(BasicAccount::initWithProperties(properties), nullptr);
    EXPECT_EQ(device.logSystem.channel.linesWithoutNumbers(),
              Lines{"-[BasicAccount initWithProperties:] (N) \"Missing account class.\""});
  }
}

TEST(BasicAccountCreation, BothFaultsOfOneDictionaryAreReported) {
  FakeProcess device;
  EXPECT_EQ(BasicAccount::initWithProperties({{kAccountType, "X"}}), nullptr);
  EXPECT_EQ(device.logSystem.channel.linesWithoutNumbers(),
            (Lines{"-[BasicAccount initWithProperties:] (N) \"Invalid account type: X\"",
                   "-[BasicAccount initWithProperties:] (N) \"Missing account class.\""}));
}

TEST(BasicAccountCreation, AnAcceptedDictionaryIsNotReported) {
  FakeProcess device;
  BasicAccount::initWithProperties(complete);
  EXPECT_EQ(device.logSystem.channel.lines, Lines{});
}

TEST(BasicAccountCreation, ATypeAndAClassAreEnoughForARecord) {
  FakeProcess device;
  const auto account = BasicAccount::accountWithType_class("CalDAV", "MobileCalDAVAccount");
  EXPECT_EQ(described(account->properties()),
            R"({"Class":"MobileCalDAVAccount",)"
            R"("Identifier":"00000000-0000-0000-0000-000000000001",)"
            R"("Sync Identifier":"00000000-0000-0000-0000-000000000001","Type":"CalDAV"})");
}

TEST(BasicAccountCreation, TheFactoryOfADictionaryRejectsWhatTheInitialiserRejects) {
  FakeProcess device;
  EXPECT_NE(BasicAccount::accountWithProperties(complete), nullptr);
  EXPECT_EQ(BasicAccount::accountWithProperties({}), nullptr);
}

TEST(BasicAccountCreationDeathTest, ATypeWithoutClassIsAProgrammingError) {
  FakeProcess device;
  EXPECT_DEATH(BasicAccount::_initWithType_class("Mail", std::nullopt),
               "The account class is required\\.");
  EXPECT_DEATH(BasicAccount::_initWithType_class("Mail", ""), "The account class is required\\.");
}

TEST(BasicAccountCreationDeathTest, AnUnknownTypeIsAProgrammingError) {
  FakeProcess device;
  EXPECT_DEATH(BasicAccount::_initWithType_class("X", "IMAPAccount"),
               R"(The account type \(X\) is not supported)");
  EXPECT_DEATH(BasicAccount::_initWithType_class(std::nullopt, "IMAPAccount"),
               R"(The account type \(\(null\)\) is not supported)");
}

TEST(BasicAccountCreationDeathTest, TheClassIsAskedForBeforeTheType) {
  FakeProcess device;
  EXPECT_DEATH(BasicAccount::_initWithType_class("X", ""), "The account class is required\\.");
}

TEST(BasicAccountCreationDeathTest, ThePlainInitialiserIsForbidden) {
  FakeProcess device;
  EXPECT_DEATH(BasicAccount::init(), R"(-\[BasicAccount init\].*Don't use this method)");
}

TEST(AccountIdentifiers, EachIsAFreshUUID) {
  FakeProcess device;
  const std::optional<Text> first = BasicAccount::createNewAccountUID();
  const std::optional<Text> second = BasicAccount::createNewAccountUID();
  EXPECT_EQ(first, kFirstUUID);
  EXPECT_NE(first, second);
}

TEST(AccountIdentifiers, ThereIsNoneWhenNoneCanBeMade) {
  FakeProcess device;
  device.uuidGenerator.canGenerate = false;
  EXPECT_EQ(BasicAccount::createNewAccountUID(), std::nullopt);
}

}  // namespace
}  // namespace accounts
