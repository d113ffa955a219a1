#include <gtest/gtest.h>

#include "tests/accountsettings/TestRecords.h"

namespace accounts {
namespace {

void restrict(FakePlatform& device, RestrictedFeature feature) {
  device.profileRestrictions.answers[feature] = RestrictionAnswer::ExplicitlyNotAllowed;
}

class HiddenByProfiles
    : public testing::TestWithParam<std::pair<RestrictedFeature, std::string_view>> {};

TEST_P(HiddenByProfiles, AFeatureThatIsNotAllowedHidesItsDataclasses) {
  FakeProcess device;
  restrict(device, GetParam().first);
  EXPECT_EQ(shortNames(BasicAccount::_profileRestrictedDataclasses()), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(
    EachFeature, HiddenByProfiles,
    testing::Values(std::pair(RestrictedFeature::CloudDocumentSync, "Ubiquity KeyValue"),
                    std::pair(RestrictedFeature::PhotoStream, "MediaStream"),
                    std::pair(RestrictedFeature::SharedPhotoStreams, "SharedStreams"),
                    std::pair(RestrictedFeature::CloudBackup, "Backup"),
                    std::pair(RestrictedFeature::CardsAndPassesWhileLocked, "Shoebox")));

TEST(ProfileRestrictions, NoSettingAndExplicitPermissionHideNothing) {
  FakeProcess device;
  device.profileRestrictions.answers[RestrictedFeature::CloudBackup] =
      RestrictionAnswer::ExplicitlyAllowed;
  EXPECT_EQ(shortNames(BasicAccount::_profileRestrictedDataclasses()), "");
}

TEST(ProfileRestrictions, SeveralFeaturesHideTheDataclassesOfAll) {
  FakeProcess device;
  restrict(device, RestrictedFeature::CloudBackup);
  restrict(device, RestrictedFeature::PhotoStream);
  EXPECT_EQ(shortNames(BasicAccount::_profileRestrictedDataclasses()), "MediaStream Backup");
}

TEST(ProfileRestrictions, AHiddenDataclassIsNeitherProvisionedNorEnabledButStaysStored) {
  FakeProcess device;
  restrict(device, RestrictedFeature::CloudBackup);
  const PropertyArray dataclasses = {kAccountDataclassMail, kAccountDataclassBackup};
  const auto account = cloudAccount(
      {{kAccountEnabledDataclasses, dataclasses}, {kAccountProvisionedDataclasses, dataclasses}});

  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "Mail");
  EXPECT_EQ(shortNames(account->enabledDataclasses()), "Mail");
  EXPECT_EQ(account->properties().arrayForKey(kAccountEnabledDataclasses), dataclasses);
}

TEST(ProfileRestrictions, AHiddenDataclassIsStillSupportedAndCanBeSwitchedOn) {
  FakeProcess device;
  restrict(device, RestrictedFeature::CloudBackup);
  const auto account = cloudAccount();
  account->setEnabled_forDataclass(true, kAccountDataclassBackup);
  EXPECT_EQ(shortNames(account->properties().arrayForKey(kAccountEnabledDataclasses)), "Backup");
}

TEST(ProfileRestrictions, TheyAreAskedAfreshOnEveryCall) {
  FakeProcess device;
  const auto account =
      cloudAccount({{kAccountProvisionedDataclasses, PropertyArray{kAccountDataclassBackup}}});
  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "Backup");

  restrict(device, RestrictedFeature::CloudBackup);

  EXPECT_EQ(shortNames(account->provisionedDataclasses()), "");
}

}  // namespace
}  // namespace accounts
