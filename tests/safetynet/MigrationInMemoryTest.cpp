#include "safetynet/MigrationInMemory.h"

#include "safetynet/CommitRecord.h"
#include "tests/safetynet/MigrationFixture.h"

namespace accounts {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using Action = ProposedChange::Action;

class MigrationInMemoryTest : public MigrationTest {
 protected:
  /// A device with one account in the settings file and one in the mail store.
  MigrationInMemoryTest() {
    snapshot.addPropertyList(DevicePlace::Settings, settingsWith(11, {"one"}));
    snapshot.addPropertyList(DevicePlace::LegacyMail, mailStoreWith({"mail"}));
  }
  /// What a plug-in does that migrates everything.
  MigrationInMemory& migrate() {
    MigrationInMemory& migration = begin();
    save(settingsWith(12, {"one", "mail"}));
    remove(DevicePlace::LegacyMail);
    migration.verify(PluginResult::GaveTrue, {});
    return migration;
  }
  [[nodiscard]] CommitRecord proposedRecord() {
    return CommitRecord::parse(contentsOf(proposal().changeOf(DevicePlace::CommitRecord)));
  }
  /// A record of an earlier run, whose settings file is current by now.
  void addInterruptedCommit() {
    snapshot.addPropertyList(DevicePlace::Settings, settingsWith(12, {"one", "mail"}));
    CommitRecord record;
    record.stores.push_back({DevicePlace::LegacyMail,
                             CommitRecord::traceOf(snapshot.at(DevicePlace::LegacyMail).identity),
                             CommitRecord::Proof{.accounts = {"mail"}}});
    snapshot.addFile(DevicePlace::CommitRecord, record.text());
  }
};

TEST_F(MigrationInMemoryTest, AMigrationThatLostNothingMayBeCommitted) {
  const MigrationInMemory& migration = migrate();
  EXPECT_FALSE(migration.error());
  EXPECT_THAT(migration.ledger().losses(), IsEmpty());
  EXPECT_THAT(migration.warnings(), IsEmpty());
  EXPECT_EQ(proposal().status, ExitStatus::Success);
  EXPECT_FALSE(proposal().keepsFiles);
  EXPECT_FALSE(proposal().recordStays);
}

TEST_F(MigrationInMemoryTest, NewContentsStandInTheMemoryFileOneAfterTheOther) {
  migrate();
  transaction().makeInformationDirectory();
  transaction().putInformationFile(
      "AccountMigrationInformation-1.txt",
      BinaryPropertyListSerializer().serialize(PropertyDictionary{{"a", 1}}).value());

  const Proposal proposed = proposal();

  EXPECT_EQ(contentsOf(proposed.changeOf(DevicePlace::Settings)),
            writeBinaryPropertyList(settingsWith(12, {"one", "mail"})));
  EXPECT_EQ(contentsOf(proposed.changeOf(DevicePlace::InformationDirectory)),
            writeBinaryPropertyList(PropertyDictionary{{"a", 1}}));
  EXPECT_EQ(proposed.informationFileName, "AccountMigrationInformation-1.txt");
  EXPECT_EQ(proposed.changeOf(DevicePlace::LegacyMail)->action, Action::Remove);
  EXPECT_TRUE(proposalFrom(bytesOf(proposed), memoryFile.size())) << "and is one that is taken";
}

TEST_F(MigrationInMemoryTest, AnInformationDirectoryWithoutAFileIsProposedAlone) {
  migrate();
  transaction().makeInformationDirectory();

  const Proposal proposed = proposal();

  EXPECT_EQ(proposed.changeOf(DevicePlace::InformationDirectory)->action, Action::MakeDirectory);
  EXPECT_EQ(proposed.informationFileName, "");
  EXPECT_TRUE(proposalFrom(bytesOf(proposed), memoryFile.size())) << "and is one that is taken";
}

TEST_F(MigrationInMemoryTest, AMemoryFileThatTakesNoMoreMeansNoProposal) {
  EXPECT_FALSE(migrate().proposal(KeepFiles::WhenNeeded, [](std::string_view) { return false; }));
}

TEST_F(MigrationInMemoryTest, APluginThatFailedChangesNothing) {
  MigrationInMemory& migration = begin();
  save(settingsWith(12, {"one", "mail"}));
  migration.verify(PluginResult::GaveFalse, {});
  ASSERT_TRUE(migration.error());
  EXPECT_EQ(migration.error()->exitStatus, ExitStatus::MigrationFailed);
  EXPECT_EQ(proposal().status, ExitStatus::MigrationFailed);
  EXPECT_THAT(proposal().changes, IsEmpty());
}

TEST_F(MigrationInMemoryTest, AResultThatCannotBeVerifiedChangesNothing) {
  MigrationInMemory& migration = begin();
  save(settingsWith(11, {"one"}));
  migration.verify(PluginResult::GaveTrue, {});
  ASSERT_TRUE(migration.error());
  EXPECT_EQ(migration.error()->exitStatus, ExitStatus::NotVerified);
  EXPECT_EQ(migration.error()->message,
            "The plug-in reported success but the settings file has not the current version; "
            "nothing is changed");
  EXPECT_THAT(proposal().changes, IsEmpty());
}

TEST_F(MigrationInMemoryTest, AFileThatCannotBeReadChangesNothing) {
  snapshot.addFailingFile(DevicePlace::LegacyMail);
  MigrationInMemory& migration = begin();
  static_cast<void>(transaction().dictionaryAt(DevicePlace::LegacyMail));
  save(settingsWith(12, {"one"}));
  migration.verify(PluginResult::GaveTrue, {});
  ASSERT_TRUE(migration.error());
  EXPECT_EQ(migration.error()->exitStatus, ExitStatus::InputOutputError);
  EXPECT_THAT(migration.error()->message, HasSubstr("Cannot read "));
  EXPECT_THAT(proposal().changes, IsEmpty());
}

TEST_F(MigrationInMemoryTest, AStoreThatIsReadForTheCheckAloneCannotFailUnseen) {
  snapshot.addFailingFile(DevicePlace::LegacyMail);
  MigrationInMemory& migration = begin();
  save(settingsWith(12, {"one"}));
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_TRUE(migration.error());
}

TEST_F(MigrationInMemoryTest, AFileThatIsNoPropertyListIsALoss) {
  snapshot.addFile(DevicePlace::LegacyMail, "no property list");
  MigrationInMemory& migration = begin();
  save(settingsWith(12, {"one"}));
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_THAT(migration.ledger().losses(),
              testing::Contains(snapshot.pathOf(DevicePlace::LegacyMail) +
                                " could not be read as a property list"));
}

TEST_F(MigrationInMemoryTest, ALossIsToldAndTheFilesAreKept) {
  MigrationInMemory& migration = begin();
  save(settingsWith(12, {"one"}));
  remove(DevicePlace::LegacyMail);
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_FALSE(migration.error());
  EXPECT_EQ(migration.ledger().losses().size(), 1u);
  EXPECT_TRUE(proposal().keepsFiles);
}

TEST_F(MigrationInMemoryTest, FilesAreKeptWhereThatIsAskedFor) {
  migrate();
  EXPECT_TRUE(proposal(KeepFiles::Always).keepsFiles);
}

TEST_F(MigrationInMemoryTest, TheRecordNamesEachStoreAndTheAccountsThatTheSettingsFileGot) {
  migrate();
  const CommitRecord record = proposedRecord();
  ASSERT_EQ(record.stores.size(), 1u);
  EXPECT_EQ(record.stores[0].place, DevicePlace::LegacyMail);
  EXPECT_EQ(record.stores[0].store,
            CommitRecord::traceOf(snapshot.at(DevicePlace::LegacyMail).identity));
  const CommitRecord::Proof proof = record.stores[0].proof.value();
  EXPECT_THAT(proof.accounts, ElementsAre("mail"));
  EXPECT_EQ(proof.settingsSize, contentsOf(proposal().changeOf(DevicePlace::Settings)).size());
}

TEST_F(MigrationInMemoryTest, WithoutStoresThereIsNoRecord) {
  snapshot.places[indexOf(DevicePlace::LegacyMail)] = FakeSnapshot().at(DevicePlace::LegacyMail);
  begin();
  save(settingsWith(12, {"one"}));
  EXPECT_EQ(proposal().changeOf(DevicePlace::CommitRecord), nullptr);
}

TEST_F(MigrationInMemoryTest, ARemovalWithoutASaveVouchesForWhatAnEarlierRunCarriedOver) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(12, {"one", "mail"}));
  snapshot.addFile(DevicePlace::RemovalSentinel, "removing");
  MigrationInMemory& migration = begin();
  remove(DevicePlace::LegacyMail);
  remove(DevicePlace::RemovalSentinel);
  migration.verify(PluginResult::GaveTrue, {});
  ASSERT_EQ(proposedRecord().stores.size(), 1u);
  EXPECT_FALSE(proposedRecord().stores[0].proof);
}

TEST_F(MigrationInMemoryTest, AStoreThatThePluginCouldNotRemoveIsForeseenAndTheRecordStays) {
  snapshot[DevicePlace::LegacyMail].whyNotRemoved = Failure{EPERM, "Cannot remove it: why"};
  MigrationInMemory& migration = begin();
  save(settingsWith(12, {"one", "mail"}));
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_THAT(migration.warnings(),
              ElementsAre(snapshot.pathOf(DevicePlace::LegacyMail) +
                          " stays, although it is carried over; a later run removes it: Cannot "
                          "remove it: why"));
  EXPECT_EQ(proposal().changeOf(DevicePlace::LegacyMail), nullptr);
  EXPECT_TRUE(proposal().recordStays);
}

TEST_F(MigrationInMemoryTest, AnyOtherFileThatCannotBeRemovedIsProposedAllTheSame) {
  snapshot.addFile(DevicePlace::AutoFetchEnabled, "");
  snapshot[DevicePlace::AutoFetchEnabled].whyNotRemoved = Failure{EPERM, "Cannot remove it"};
  migrate();
  remove(DevicePlace::AutoFetchEnabled);
  const Proposal proposed = proposal();
  ASSERT_NE(proposed.changeOf(DevicePlace::AutoFetchEnabled), nullptr);
  EXPECT_EQ(proposed.changeOf(DevicePlace::AutoFetchEnabled)->action, Action::Remove);
}

TEST_F(MigrationInMemoryTest, ANewRecordTakesThePlaceOfAStaleOneAtOnce) {
  snapshot.addFile(DevicePlace::CommitRecord, "malformed");
  migrate();
  const Proposal proposed = proposal();
  EXPECT_EQ(std::ranges::count(proposed.changes, DevicePlace::CommitRecord, &ProposedChange::place),
            1);
  EXPECT_EQ(proposed.changeOf(DevicePlace::CommitRecord)->action, Action::Write);
}

TEST_F(MigrationInMemoryTest, AnInterruptedCommitIsFinishedBeforeThePluginSeesTheDevice) {
  addInterruptedCommit();
  begin();
  EXPECT_FALSE(transaction().exists(DevicePlace::LegacyMail));
}

TEST_F(MigrationInMemoryTest, AnInterruptedCommitIsFinishedWithoutThePlugin) {
  addInterruptedCommit();
  MigrationInMemory& migration = begin();
  migration.verify(PluginResult::NotAsked, {});
  EXPECT_FALSE(migration.error());
  const Proposal proposed = proposal();
  EXPECT_EQ(proposed.changeOf(DevicePlace::LegacyMail)->action, Action::Remove);
  EXPECT_EQ(proposed.changeOf(DevicePlace::CommitRecord)->action, Action::Remove)
      << "which is done last";
  EXPECT_EQ(proposed.changeOf(DevicePlace::Settings), nullptr);
}

TEST_F(MigrationInMemoryTest, AStoreThatWasCarriedOverBeforeIsVouchedForAgain) {
  addInterruptedCommit();
  snapshot[DevicePlace::LegacyMail].whyNotRemoved = Failure{EPERM, "Cannot remove it: why"};
  MigrationInMemory& migration = begin();
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_FALSE(migration.error());
  EXPECT_THAT(migration.ledger().losses(), IsEmpty());
  EXPECT_EQ(migration.warnings().size(), 1u);
  EXPECT_NE(proposal().changeOf(DevicePlace::CommitRecord)->action, Action::Write)
      << "since it says the same";
  EXPECT_TRUE(proposal().recordStays);
}

TEST_F(MigrationInMemoryTest, ARecordVouchesForAnAccountThatIsNoLongerInTheSettingsFile) {
  addInterruptedCommit();
  // As a person may have deleted one of them since.
  snapshot.addPropertyList(DevicePlace::LegacyMail, mailStoreWith({"mail", "deleted since"}));
  CommitRecord record;
  record.stores.push_back({DevicePlace::LegacyMail,
                           CommitRecord::traceOf(snapshot.at(DevicePlace::LegacyMail).identity),
                           CommitRecord::Proof{.accounts = {"mail", "deleted since"}}});
  snapshot.addFile(DevicePlace::CommitRecord, record.text());
  MigrationInMemory& migration = begin();
  migration.verify(PluginResult::GaveTrue, {});

  EXPECT_THAT(migration.ledger().losses(), IsEmpty());
  const std::vector<LedgerEntry>& entries = migration.ledger().entries;
  ASSERT_GE(entries.size(), 2u);
  EXPECT_EQ(entries[0].fate, AccountFate::CarriedOverEarlier);
  EXPECT_THAT(entries[0].now, ElementsAre(LedgerPlace{1}));
  EXPECT_EQ(entries[1].fate, AccountFate::CarriedOverEarlier);
  EXPECT_THAT(entries[1].now, IsEmpty());
  EXPECT_EQ(entries[1].reason, "");
}

TEST_F(MigrationInMemoryTest, WhatCouldNotBeReadOfAStoreThatWasCarriedOverIsNotToldAgain) {
  snapshot.addPropertyList(DevicePlace::Settings, settingsWith(12, {"one", "mail"}));
  snapshot.addFile(DevicePlace::LegacyMail, "no property list");
  CommitRecord record;
  record.stores.push_back({DevicePlace::LegacyMail,
                           CommitRecord::traceOf(snapshot.at(DevicePlace::LegacyMail).identity),
                           CommitRecord::Proof{.accounts = {"mail"}}});
  snapshot.addFile(DevicePlace::CommitRecord, record.text());
  MigrationInMemory& migration = begin();
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_THAT(migration.ledger().losses(), IsEmpty());
}

TEST_F(MigrationInMemoryTest, AStaleRecordEndsWithThisRun) {
  snapshot.addFile(DevicePlace::CommitRecord, "malformed");
  snapshot.places[indexOf(DevicePlace::LegacyMail)] = FakeSnapshot().at(DevicePlace::LegacyMail);
  MigrationInMemory& migration = begin();
  save(settingsWith(12, {"one"}));
  migration.verify(PluginResult::GaveTrue, {});
  EXPECT_EQ(proposal().changeOf(DevicePlace::CommitRecord)->action, Action::Remove);
}

}  // namespace
}  // namespace accounts
