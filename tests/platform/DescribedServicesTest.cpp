#include <gtest/gtest.h>

#include "platform/linux/DescribedCloudAccountService.h"
#include "platform/linux/DescribedDeviceInfoService.h"
#include "platform/linux/DescribedExternalSyncSources.h"
#include "platform/linux/DescribedPairingValueStore.h"
#include "platform/linux/DescribedProfileRestrictions.h"
#include "platform/linux/DeviceDescription.h"

namespace accounts {
namespace {

// Every service of one device.
struct Device {
  explicit Device(const PropertyDictionary& dictionary)
      : description(deviceDescriptionFromDictionary(dictionary)) {}

  const DeviceDescription description;
  DescribedDeviceInfoService deviceInfo{description};
  DescribedProfileRestrictions restrictions{description};
  DescribedPairingValueStore pairing{description};
  DescribedExternalSyncSources syncSources{description};
  DescribedCloudAccountService cloudAccount{description};
};

TEST(DescribedDeviceInfoServiceTest, AQuestionHasTheDescribedAnswer) {
  Device device({{"DeviceInfo", PropertyDictionary{{"DeviceClass", "Handra"},
                                                   {"RegionalBehaviorGoogleMail", true}}}});
  EXPECT_EQ(device.deviceInfo.copyAnswer("DeviceClass"), PropertyValue("Handra"));
  EXPECT_EQ(device.deviceInfo.copyAnswer("RegionalBehaviorGoogleMail"), PropertyValue(true));
}

TEST(DescribedDeviceInfoServiceTest, AnUndescribedQuestionHasNoAnswer) {
  Device device({{"DeviceInfo", PropertyDictionary{{"DeviceClass", "Handra"}}}});
  EXPECT_EQ(device.deviceInfo.copyAnswer("CPUArchitecture"), std::nullopt);
}

TEST(DescribedDeviceInfoServiceTest, AnswersOfTheWrongKindAltogetherAreNone) {
  Device device({{"DeviceInfo", "Handra"}});
  EXPECT_EQ(device.deviceInfo.copyAnswer("DeviceClass"), std::nullopt);
}

TEST(DescribedProfileRestrictionsTest, EachFeatureHasItsOwnKey) {
  struct Row {
    RestrictedFeature feature;
    Text key;
  };
  const Row rows[] = {
      {RestrictedFeature::CloudDocumentSync, "allowCloudDocumentSync"},
      {RestrictedFeature::PhotoStream, "allowPhotoStream"},
      {RestrictedFeature::SharedPhotoStreams, "allowSharedPhotoStreams"},
      {RestrictedFeature::CloudBackup, "allowCloudBackup"},
      {RestrictedFeature::CardsAndPassesWhileLocked, "allowCardsAndPassesWhileLocked"},
  };
  for (const Row& restricted : rows) {
    Device device({{"ProfileRestrictions", PropertyDictionary{{restricted.key, 2}}}});
    for (const Row& asked : rows) {
      const auto expected = asked.feature == restricted.feature
                                ? RestrictionAnswer::ExplicitlyNotAllowed
                                : RestrictionAnswer::NoSetting;
      EXPECT_EQ(device.restrictions.answerForFeature(asked.feature), expected)
          << restricted.key.view() << ", " << asked.key.view();
    }
  }
}

RestrictionAnswer answerFor(const PropertyValue& value) {
  Device device({{"ProfileRestrictions", PropertyDictionary{{"allowPhotoStream", value}}}});
  return device.restrictions.answerForFeature(RestrictedFeature::PhotoStream);
}

TEST(DescribedProfileRestrictionsTest, TheNumbersZeroToTwoAreTheAnswers) {
  EXPECT_EQ(answerFor(0), RestrictionAnswer::NoSetting);
  EXPECT_EQ(answerFor(1), RestrictionAnswer::ExplicitlyAllowed);
  EXPECT_EQ(answerFor(2), RestrictionAnswer::ExplicitlyNotAllowed);
}

TEST(DescribedProfileRestrictionsTest, OtherNumbersAndKindsAreNoSetting) {
  EXPECT_EQ(answerFor(3), RestrictionAnswer::NoSetting);
  EXPECT_EQ(answerFor(-1), RestrictionAnswer::NoSetting);
  EXPECT_EQ(answerFor(258), RestrictionAnswer::NoSetting);
  EXPECT_EQ(answerFor(PropertyArray{2}), RestrictionAnswer::NoSetting);
}

TEST(DescribedPairingValueStoreTest, WithoutPairingValuesConnectingFails) {
  EXPECT_FALSE(Device({}).pairing.connect());
  EXPECT_FALSE(Device({{"PairingValues", "wrong kind"}}).pairing.connect());
}

class DescribedPairingValuesTest : public testing::Test {
 protected:
  const PropertyDictionary calendars = {{"SyncingOS", "Windows"}};
  Device device{
      {{"PairingValues", PropertyDictionary{{"sync", PropertyDictionary{{"Calendars", calendars}}},
                                            {"broken", "wrong kind"}}}}};
  std::unique_ptr<PairingConnection> connection = device.pairing.connect();
};

TEST_F(DescribedPairingValuesTest, AKeyGivesItsValueInTheDomain) {
  EXPECT_EQ(connection->copyValue("sync", "Calendars"), PropertyValue(calendars));
}

TEST_F(DescribedPairingValuesTest, NoKeyGivesTheWholeDomain) {
  EXPECT_EQ(connection->copyValue("sync", std::nullopt),
            PropertyValue(PropertyDictionary{{"Calendars", calendars}}));
}

TEST_F(DescribedPairingValuesTest, AMissingKeyHasNoValue) {
  EXPECT_EQ(connection->copyValue("sync", "Notes"), std::nullopt);
}

TEST_F(DescribedPairingValuesTest, AMissingDomainOrOneOfTheWrongKindHasNoValues) {
  EXPECT_EQ(connection->copyValue("none", std::nullopt), std::nullopt);
  EXPECT_EQ(connection->copyValue("broken", std::nullopt), std::nullopt);
}

TEST(DescribedExternalSyncSourcesTest, EachKindOfDataHasItsOwnSources) {
  Device device(
      {{"ExternalSyncSources",
        PropertyDictionary{{"Bookmarks", PropertyDictionary{{"Sources", PropertyArray{"B"}}}},
                           {"Calendars", PropertyDictionary{{"Sources", PropertyArray{"K"}}}},
                           {"Contacts", PropertyDictionary{{"Sources", PropertyArray{"C"}}}},
                           {"Notes", PropertyDictionary{{"Error", "failed"}}}}}});
  EXPECT_EQ(device.syncSources.copyEnabledSources(SyncDataType::Bookmarks).sources,
            PropertyArray{"B"});
  EXPECT_EQ(device.syncSources.copyEnabledSources(SyncDataType::Calendars).sources,
            PropertyArray{"K"});
  EXPECT_EQ(device.syncSources.copyEnabledSources(SyncDataType::Contacts).sources,
            PropertyArray{"C"});
  EXPECT_EQ(device.syncSources.copyEnabledSources(SyncDataType::Contacts).error, std::nullopt);
  EXPECT_EQ(device.syncSources.copyEnabledSources(SyncDataType::Notes).sources, std::nullopt);
  EXPECT_EQ(device.syncSources.copyEnabledSources(SyncDataType::Notes).error, "failed");
}

TEST(DescribedExternalSyncSourcesTest, PartsOfTheWrongKindAreAbsent) {
  Device device(
      {{"ExternalSyncSources",
        PropertyDictionary{{"Notes", PropertyDictionary{{"Sources", "one"}, {"Error", 7}}}}}});
  const auto answer = device.syncSources.copyEnabledSources(SyncDataType::Notes);
  EXPECT_EQ(answer.sources, std::nullopt);
  EXPECT_EQ(answer.error, std::nullopt);
}

TEST(DescribedCloudAccountServiceTest, UndescribedNamesAreTheUsualOnes) {
  Device device({});
  EXPECT_EQ(device.cloudAccount.statusKey(), "status");
  EXPECT_EQ(device.cloudAccount.primaryAccountKey(), "primaryAccount");
  EXPECT_EQ(device.cloudAccount.accountTypeDisplayName(), "Stratix");
}

TEST(DescribedCloudAccountServiceTest, DescribedNamesReplaceTheUsualOnes) {
  Device device({{"CloudAccount",
                  PropertyDictionary{
                      {"StatusKey", "s"}, {"PrimaryAccountKey", "p"}, {"DisplayName", "Cloud"}}}});
  EXPECT_EQ(device.cloudAccount.statusKey(), "s");
  EXPECT_EQ(device.cloudAccount.primaryAccountKey(), "p");
  EXPECT_EQ(device.cloudAccount.accountTypeDisplayName(), "Cloud");
}

TEST(DescribedCloudAccountServiceTest, NamesOfTheWrongKindAreTheUsualOnes) {
  Device device({{"CloudAccount", PropertyDictionary{{"StatusKey", 1}, {"DisplayName", true}}}});
  EXPECT_EQ(device.cloudAccount.statusKey(), "status");
  EXPECT_EQ(device.cloudAccount.accountTypeDisplayName(), "Stratix");
}

}  // namespace
}  // namespace accounts
