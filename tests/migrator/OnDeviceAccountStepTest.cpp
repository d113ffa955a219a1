#include "tests/migrator/MigratorFixture.h"

// The step of 7A153: the on-device account.

namespace accounts {
namespace {

class OnDeviceAccountStepTest : public StepTest {
 protected:
  void answer(SyncDataType dataType, std::optional<PropertyArray> sources,
              std::optional<std::string> error = std::nullopt) {
    device.externalSyncSources.answers[dataType] = {std::move(sources), std::move(error)};
  }
  /// The dataclasses of the rebuilt account, the only one of the store.
  std::optional<TextList> enabledAfterTheStep() {
    EXPECT_TRUE(migrator._migrateAccountsFrom7A153(*store));
    EXPECT_EQ(store->count(), 1u);
    return texts(account(0).enabledDataclasses());
  }
  const std::optional<TextList> all =
      dataclasses({kAccountDataclassContacts, kAccountDataclassCalendars,
                   kAccountDataclassBookmarks, kAccountDataclassNotes});
};

TEST_F(OnDeviceAccountStepTest, WithoutExternalSourcesEveryKindIsOn) {
  EXPECT_EQ(enabledAfterTheStep(), all);
}

TEST_F(OnDeviceAccountStepTest, EmptyListsAndEmptyErrorTextsAreNoSourcesAndNoErrors) {
  answer(SyncDataType::Calendars, PropertyArray(), "");

  EXPECT_EQ(enabledAfterTheStep(), all);
  EXPECT_TRUE(console().empty());
}

TEST_F(OnDeviceAccountStepTest, AnEmptyListOfSourcesLeavesAKindWithASingleStoreOn) {
  ASSERT_FALSE(BasicAccount::multipleStoresSupportedByDataclass(kAccountDataclassBookmarks));
  answer(SyncDataType::Bookmarks, PropertyArray());

  EXPECT_EQ(enabledAfterTheStep(), all);
}

TEST_F(OnDeviceAccountStepTest, OnlyKindsThatItsTypeSupportsAreOn) {
  device.deviceInfoService.answers.insert_or_assign("CPUArchitecture", "armv6");

  EXPECT_EQ(enabledAfterTheStep(),
            dataclasses({kAccountDataclassContacts, kAccountDataclassCalendars,
                         kAccountDataclassBookmarks}));
}

TEST_F(OnDeviceAccountStepTest, DeniedTetheringKeepsAKindOff) {
  answer(SyncDataType::Calendars, PropertyArray{"DenyTethered"});
  answer(SyncDataType::Contacts, PropertyArray{"A source", "DenyTethered"});

  EXPECT_EQ(enabledAfterTheStep(),
            dataclasses({kAccountDataclassBookmarks, kAccountDataclassNotes}));
}

TEST_F(OnDeviceAccountStepTest, AKindWithSeveralStoresStaysOnBesideASource) {
  ASSERT_TRUE(BasicAccount::multipleStoresSupportedByDataclass(kAccountDataclassContacts));
  answer(SyncDataType::Contacts, PropertyArray{"A source"});

  EXPECT_EQ(enabledAfterTheStep(), all);
}

TEST_F(OnDeviceAccountStepTest, AKindWithASingleStoreIsOffBesideASource) {
  ASSERT_FALSE(BasicAccount::multipleStoresSupportedByDataclass(kAccountDataclassBookmarks));
  answer(SyncDataType::Bookmarks, PropertyArray{"A source"});

  EXPECT_EQ(
      enabledAfterTheStep(),
      dataclasses({kAccountDataclassContacts, kAccountDataclassCalendars, kAccountDataclassNotes}));
}

TEST_F(OnDeviceAccountStepTest, AnErrorIsLoggedAndKeepsItsKindAloneOff) {
  answer(SyncDataType::Notes, PropertyArray(), "no connection");

  EXPECT_EQ(enabledAfterTheStep(),
            dataclasses({kAccountDataclassContacts, kAccountDataclassCalendars,
                         kAccountDataclassBookmarks}));
  EXPECT_EQ(console(),
            Lines{"[-[AccountsDataMigrator(Internal) _migrateAccountsFrom7A153:]]Error while "
                  "retreiving external sources for dataclass com.quarx.Dataclass.Notes "
                  "[no connection]"});
}

TEST_F(OnDeviceAccountStepTest, WithEveryKindOffNoListIsStored) {
  for (const SyncDataType dataType : {SyncDataType::Bookmarks, SyncDataType::Calendars,
                                      SyncDataType::Contacts, SyncDataType::Notes}) {
    answer(dataType, PropertyArray{"DenyTethered"});
  }

  EXPECT_EQ(enabledAfterTheStep(), std::nullopt);
}

TEST_F(OnDeviceAccountStepTest, TheOldAccountIsRebuiltWhateverItHeld) {
  openStoreWith({anAccount("DeviceLocalAccount", kOnMyDeviceAccountType, "DeviceLocalAccount")
                     .with("Old", "value")
                     .enabledFor({kAccountDataclassMail}),
                 anAccount("another", kOnMyDeviceAccountType, "DeviceLocalAccount"),
                 anAccount("M", kMailAccountType, "IMAPAccount")});

  migrator._migrateAccountsFrom7A153(*store);

  EXPECT_EQ(identifiers(), (TextList{"DeviceLocalAccount", "M"}));
  EXPECT_FALSE(account(0).properties().contains("Old"));
  EXPECT_EQ(account(0).accountClass(), "DeviceLocalAccount");
  EXPECT_EQ(texts(account(0).enabledDataclasses()), all);
}

TEST_F(OnDeviceAccountStepTest, ATypeUnknownToTheConfigurationLeavesTheStore) {
  device.bundleResources.replaced["AccountTypesProperties"] =
      PropertyDictionary{{kMailAccountType, PropertyDictionary()}};
  openStoreWith({anAccount("M", kMailAccountType, "IMAPAccount")});

  EXPECT_TRUE(migrator._migrateAccountsFrom7A153(*store));

  EXPECT_EQ(identifiers(), TextList{"M"});
  EXPECT_EQ(store->dataVersion(), 3u);
}

TEST(TetheredSourcesTest, OnlyTheExactTextDeniesTethering) {
  EXPECT_TRUE(AccountsDataMigrator::_tetheredDisabledInSources({"A source", "DenyTethered"}));
  EXPECT_FALSE(AccountsDataMigrator::_tetheredDisabledInSources({"denytethered", 5}));
  EXPECT_FALSE(AccountsDataMigrator::_tetheredDisabledInSources({}));
}

}  // namespace
}  // namespace accounts
