#include <gtest/gtest.h>

#include <algorithm>

#include "tests/accountsettings/TestRecords.h"

// The dataclass configuration, and the actions that it leaves of an account type's.

namespace accounts {
namespace {

constexpr const char* kConfigurationResource = "DataclassesProperties";

void configureContacts(FakePlatform& device, const PropertyDictionary& properties) {
  device.bundleResources.replaced[kConfigurationResource] =
      PropertyDictionary{{kAccountDataclassContacts, properties}};
}

void configureActions(FakePlatform& device, std::string_view key, const PropertyArray& actions) {
  configureType(device, kExchangeAccountType, {{key, actions}});
}

std::string actionsToEnableContacts() {
  return described(*BasicAccount::userActionsToEnableDataclass_forAccountType(
      kAccountDataclassContacts, kExchangeAccountType));
}

std::string actionsToDisableContacts() {
  return described(*BasicAccount::userActionsToDisableDataclass_forAccountType(
      kAccountDataclassContacts, kExchangeAccountType));
}

TEST(DataclassConfiguration, EachAnswerHasItsOwnEntry) {
  FakeProcess device;
  configureContacts(device, {{kDataclassSupportsMultipleStores, true},
                             {kDataclassDisplaySwitch, false},
                             {kDataclassRequiresUserConfirmation, true}});
  EXPECT_TRUE(BasicAccount::multipleStoresSupportedByDataclass(kAccountDataclassContacts));
  EXPECT_FALSE(BasicAccount::displayToggleForDataclass(kAccountDataclassContacts));
  EXPECT_TRUE(BasicAccount::userConfirmationIsRequiredByDataclass(kAccountDataclassContacts));
}

TEST(DataclassConfiguration, ASwitchIsDisplayedWhereTheEntrySaysSo) {
  FakeProcess device;
  configureContacts(device, {{kDataclassDisplaySwitch, true}});
  EXPECT_TRUE(BasicAccount::displayToggleForDataclass(kAccountDataclassContacts));
}

TEST(DataclassConfiguration, MissingEntriesAnswerFalse) {
  FakeProcess device;
  configureContacts(device, {});
  for (const std::string_view dataclass : {kAccountDataclassContacts, kAccountDataclassMail}) {
    EXPECT_FALSE(BasicAccount::multipleStoresSupportedByDataclass(dataclass));
    EXPECT_FALSE(BasicAccount::displayToggleForDataclass(dataclass));
    EXPECT_FALSE(BasicAccount::userConfirmationIsRequiredByDataclass(dataclass));
  }
}

TEST(DataclassConfiguration, AMissingResourceAnswersFalseWithoutAMessage) {
  FakeProcess device;
  device.bundleResources.replaced[kConfigurationResource] = std::nullopt;

  EXPECT_FALSE(BasicAccount::displayToggleForDataclass(kAccountDataclassContacts));

  EXPECT_TRUE(device.logSystem.channel.lines.empty());
  EXPECT_TRUE(device.consoleLog.lines.empty());
}

TEST(DataclassConfiguration, ItIsReadOnceEvenWhenItIsMissing) {
  FakeProcess device;
  device.bundleResources.replaced[kConfigurationResource] = std::nullopt;
  BasicAccount::displayToggleForDataclass(kAccountDataclassContacts);
  device.bundleResources.replaced.clear();

  EXPECT_FALSE(BasicAccount::displayToggleForDataclass(kAccountDataclassContacts));
}

TEST(DataclassConfiguration, ThePlainReadIsNotKept) {
  FakeProcess device;
  device.bundleResources.replaced[kConfigurationResource] = std::nullopt;
  EXPECT_EQ(BasicAccount::_dataclassesProperties(), std::nullopt);

  device.bundleResources.replaced.clear();
  EXPECT_NE(BasicAccount::_dataclassesProperties(), std::nullopt);
}

TEST(ToggleActions, ADataclassWithMultipleStoresKeepsAllActions) {
  FakeProcess device;
  configureContacts(device, {{kDataclassSupportsMultipleStores, true}});
  configureActions(device, kPropertiesEnableDataclassActions,
                   {"Keep Local Data", "Merge Local Data", "Keep Local Data"});
  EXPECT_EQ(actionsToEnableContacts(),
            R"(["Keep Local Data","Merge Local Data","Keep Local Data"])");
}

TEST(ToggleActions, ASingleStoreLosesTheLastKeepingOfLocalDataOnly) {
  FakeProcess device;
  configureContacts(device, {{kDataclassSupportsMultipleStores, false}});
  configureActions(device, kPropertiesEnableDataclassActions,
                   {"Keep Local Data", "Merge Local Data", "Keep Local Data"});
  EXPECT_EQ(actionsToEnableContacts(), R"(["Keep Local Data","Merge Local Data"])");
}

TEST(ToggleActions, ADataclassThatIsNotConfiguredHasASingleStore) {
  FakeProcess device;
  device.bundleResources.replaced[kConfigurationResource] = PropertyDictionary();
  configureActions(device, kPropertiesEnableDataclassActions,
                   {"Keep Local Data", "Merge Local Data"});
  EXPECT_EQ(actionsToEnableContacts(), R"(["Merge Local Data"])");
}

TEST(ToggleActions, SwitchingOffHasAListOfItsOwnUnderTheSameRule) {
  FakeProcess device;
  configureContacts(device, {{kDataclassSupportsMultipleStores, false}});
  configureActions(device, kPropertiesDisableDataclassActions,
                   {"Delete Sync Data", "Keep Local Data"});
  EXPECT_EQ(actionsToDisableContacts(), R"(["Delete Sync Data"])");
}

TEST(ToggleActions, AListWithoutKeepingOfLocalDataIsLeftAsItIs) {
  const PropertyArray actions = {"Merge Sync Data", "None"};
  EXPECT_EQ(BasicAccount::removeActionsIncompatibleWithSingleStoreDataclass(actions), actions);
}

TEST(ToggleActions, AnEmptyListStaysEmpty) {
  EXPECT_TRUE(BasicAccount::removeActionsIncompatibleWithSingleStoreDataclass({}).empty());
}

}  // namespace
}  // namespace accounts
