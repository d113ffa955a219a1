#include "tests/migrator/MigratorFixture.h"

// The step of 8A293: notes confined to the on-device account on the oldest processor.

namespace accounts {
namespace {

class OldestProcessorStepTest : public StepTest {
 protected:
  void runOn(PropertyValue architecture) {
    device.deviceInfoService.answers.insert_or_assign("CPUArchitecture", std::move(architecture));
    openStoreWith({
        anAccount("D", kOnMyDeviceAccountType, "DeviceLocalAccount")
            .enabledFor({kAccountDataclassContacts}),
        // A type of notes alone keeps them on every processor.
        anAccount("N", kIMAPNotesAccountType, "NotesAccount").enabledFor({kAccountDataclassNotes}),
        anAccount("M", kMailAccountType, "IMAPAccount").enabledFor({kAccountDataclassMail}),
    });
    EXPECT_TRUE(migrator._migrateAccountsFrom8A293(*store));
  }
  void expectNoChange() {
    EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassContacts}));
    EXPECT_EQ(storedEnabled(1), dataclasses({kAccountDataclassNotes}));
    EXPECT_EQ(storedEnabled(2), dataclasses({kAccountDataclassMail}));
    EXPECT_EQ(store->dataVersion(), 6u);
  }
};

TEST_F(OldestProcessorStepTest, NotesMoveToTheOnDeviceAccountThoughItsTypeDoesNotSupportThem) {
  runOn("armv6");

  ASSERT_FALSE(account(0).supportedDataclasses().containsText(kAccountDataclassNotes));
  EXPECT_EQ(storedEnabled(0), dataclasses({kAccountDataclassContacts, kAccountDataclassNotes}));
  EXPECT_EQ(storedEnabled(1), dataclasses({}));
  EXPECT_EQ(store->dataVersion(), 6u);
}

TEST_F(OldestProcessorStepTest, AnAccountWithoutNotesIsLeft) {
  runOn("armv6");

  EXPECT_EQ(account(2).properties(),
            anAccount("M", kMailAccountType, "IMAPAccount").enabledFor({kAccountDataclassMail}));
}

TEST_F(OldestProcessorStepTest, OnANewerProcessorNoAccountChanges) {
  runOn("armv7");

  expectNoChange();
}

TEST_F(OldestProcessorStepTest, AnAnswerOfTheWrongKindChangesNoAccount) {
  runOn(6);

  expectNoChange();
}

TEST_F(OldestProcessorStepTest, WithoutAnAnswerNoAccountChanges) {
  openStoreWith({anAccount("D", kOnMyDeviceAccountType, "DeviceLocalAccount")});

  EXPECT_TRUE(migrator._migrateAccountsFrom8A293(*store));

  EXPECT_EQ(storedEnabled(0), std::nullopt);
  EXPECT_EQ(store->dataVersion(), 6u);
}

}  // namespace
}  // namespace accounts
