#include "tests/migrator/MigratorFixture.h"

// The step of 7A241: no notes with the hosted service.

namespace accounts {
namespace {

class HostedNotesStepTest : public StepTest {
 protected:
  static AccountDictionary hosted() {
    return anAccount("V", kVelmoraAccountType, "VelmoraAccount");
  }
  std::optional<TextList> storedAfterTheStep(const AccountDictionary& builder) {
    openStoreWith({builder});
    EXPECT_TRUE(migrator._migrateAccountsFrom7A241(*store));
    return storedEnabled(0);
  }
};

TEST_F(HostedNotesStepTest, NotesAreTakenOffAHostedServiceAccount) {
  EXPECT_EQ(storedAfterTheStep(hosted().enabledFor(
                {kAccountDataclassMail, kAccountDataclassCalendars, kAccountDataclassNotes})),
            dataclasses({kAccountDataclassMail, kAccountDataclassCalendars}));
}

TEST_F(HostedNotesStepTest, NotesOfAnotherTypeAreLeft) {
  EXPECT_EQ(
      storedAfterTheStep(
          anAccount("M", kMailAccountType, "IMAPAccount").enabledFor({kAccountDataclassNotes})),
      dataclasses({kAccountDataclassNotes}));
}

TEST_F(HostedNotesStepTest, TheStoredListBecomesTheEffectiveOne) {
  EXPECT_EQ(
      storedAfterTheStep(hosted()
                             .enabledFor({kAccountDataclassCalendars, "unknown",
                                          kAccountDataclassBookmarks, kAccountDataclassMail})
                             .provisionedFor({kAccountDataclassMail, kAccountDataclassCalendars})),
      dataclasses({kAccountDataclassMail, kAccountDataclassCalendars}));
}

TEST_F(HostedNotesStepTest, WithNotesAloneAnEmptyListStays) {
  EXPECT_EQ(storedAfterTheStep(hosted().enabledFor({kAccountDataclassNotes})), dataclasses({}));
}

TEST_F(HostedNotesStepTest, WithoutAListNoneIsStored) {
  EXPECT_EQ(storedAfterTheStep(hosted()), std::nullopt);
  EXPECT_FALSE(account(0).properties().contains(kAccountEnabledDataclasses));
}

TEST_F(HostedNotesStepTest, EveryAccountKeepsItsPlace) {
  openStoreWith({hosted(), anAccount("M", kMailAccountType, "IMAPAccount"),
                 anAccount("V2", kVelmoraAccountType, "MarrowAccount")});

  migrator._migrateAccountsFrom7A241(*store);

  EXPECT_EQ(identifiers(), (TextList{"V", "M", "V2"}));
}

TEST_F(HostedNotesStepTest, AnEntryThatIsNoListIsRemoved) {
  storedAfterTheStep(hosted().with(kAccountEnabledDataclasses, "no list"));

  EXPECT_FALSE(account(0).properties().contains(kAccountEnabledDataclasses));
}

TEST_F(HostedNotesStepTest, OfAccountsWithOneIdentifierTheLastTakesTheirPlacesAndTheOthersFollow) {
  const auto named = [](std::string_view name) { return hosted().with(kAccountDisplayName, name); };
  openStoreWith({named("one"), anAccount("M", kMailAccountType, "IMAPAccount"), named("two")});

  migrator._migrateAccountsFrom7A241(*store);

  ASSERT_EQ(identifiers(), (TextList{"V", "M", "V", "V"}));
  EXPECT_EQ(account(0).displayName(), "two");
  EXPECT_EQ(account(2).displayName(), "two");
  EXPECT_EQ(account(3).displayName(), "one");
}

}  // namespace
}  // namespace accounts
