#include "accountsettings/DeviceLocalAccount.h"

#include <gtest/gtest.h>

#include "tests/accountsettings/TestRecords.h"

namespace accounts {
namespace {

/// Gives a key of the account's string table a text.
void translate(FakePlatform& device, const std::string& key, const std::string& text) {
  device.localizedStrings.texts[{"DeviceLocalAccount", key}] = text;
}

TEST(DeviceLocalAccount, ItIsMadeFromItsFixedDictionary) {
  FakeProcess device;
  translate(device, "ON_MY_DEVICE_TYPE_HANDRA", "On My Handra");
  EXPECT_EQ(described(DeviceLocalAccount::basicAccountProperties()),
            R"({"Class":"DeviceLocalAccount","Identifier":"DeviceLocalAccount",)"
            R"("Short Type String":"On My Handra","Type":"OnMyDevice",)"
            R"("Type String":"On My Handra"})");
}

TEST(DeviceLocalAccount, NoSyncIdentifierIsStoredYetItHasOne) {
  FakeProcess device;
  const auto account =
      DeviceLocalAccount::initWithProperties(DeviceLocalAccount::basicAccountProperties());
  EXPECT_FALSE(account->properties().contains(kAccountSyncIdentifier));
  EXPECT_EQ(account->syncStoreIdentifier(), "DeviceLocalAccount");
}

TEST(DeviceLocalAccount, StoredIdentifiersAndDisplayNameAreIgnored) {
  FakeProcess device;
  translate(device, "ON_MY_DEVICE_TYPE_HANDRA", "On My Handra");
  const BasicAccountReference account = DeviceLocalAccount::accountWithProperties(
      AccountDictionary(DeviceLocalAccount::basicAccountProperties())
          .with({{kAccountIdentifier, "other"},
                 {kAccountSyncIdentifier, "other"},
                 {kAccountDisplayName, "other"}}));
  EXPECT_EQ(account->identifier(), "DeviceLocalAccount");
  EXPECT_EQ(account->syncStoreIdentifier(), "DeviceLocalAccount");
  EXPECT_EQ(account->displayName(), "On My Handra");
}

TEST(DeviceLocalAccount, ItRejectsWhatEveryRecordRejects) {
  FakeProcess device;
  EXPECT_EQ(DeviceLocalAccount::initWithProperties({{kAccountType, "OnMyDevice"}}), nullptr);
}

TEST(DeviceLocalAccount, AnAccountRecordOfItsTypeIsNoDeviceLocalAccount) {
  FakeProcess device;
  const auto account = BasicAccount::initWithProperties(
      AccountDictionary(DeviceLocalAccount::basicAccountProperties())
          .with(kAccountIdentifier, "other"));
  EXPECT_EQ(account->identifier(), "other");
}

TEST(DeviceTypeString, WithoutADeviceClassItIsThatOfTheHandra) {
  FakeProcess device;
  EXPECT_EQ(DeviceLocalAccount::typeString(), "ON_MY_DEVICE_TYPE_HANDRA");
}

TEST(DeviceTypeString, TheDeviceClassIsPutIntoUpperCaseWithoutBlanks) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("DeviceClass", "Handra mini 2");
  EXPECT_EQ(DeviceLocalAccount::typeString(), "ON_MY_DEVICE_TYPE_HANDRA_MINI_2");
}

TEST(DeviceTypeString, EverySmallLetterOfTheDeviceClassIsPutIntoUpperCase) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("DeviceClass", "abcdefghijklmnopqrstuvwxyz");
  EXPECT_EQ(DeviceLocalAccount::typeString(), "ON_MY_DEVICE_TYPE_ABCDEFGHIJKLMNOPQRSTUVWXYZ");
}

TEST(DeviceTypeString, WhatIsNoSmallLetterStaysAsItIs) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("DeviceClass", "a{Z}1");
  EXPECT_EQ(DeviceLocalAccount::typeString(), "ON_MY_DEVICE_TYPE_A{Z}1");
}

TEST(DeviceTypeString, ADeviceClassThatIsNoTextIsNoAnswer) {
  FakeProcess device;
  device.deviceInfoService.answers.emplace("DeviceClass", 5);
  EXPECT_EQ(DeviceLocalAccount::typeString(), "ON_MY_DEVICE_TYPE_HANDRA");
}

TEST(DeviceTypeString, TheDeviceIsAskedAfreshOnEveryCall) {
  FakeProcess device;
  DeviceLocalAccount::typeString();
  device.deviceInfoService.answers.emplace("DeviceClass", "Other");
  EXPECT_EQ(DeviceLocalAccount::typeString(), "ON_MY_DEVICE_TYPE_OTHER");
}

}  // namespace
}  // namespace accounts
