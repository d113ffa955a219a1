#include "safetynet/CommitRecord.h"

#include "safetynet/MigrationCheck.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>

#include "tests/fakes/FakeSnapshot.h"

namespace accounts {
namespace {

using Trace = CommitRecord::Trace;

const Trace kStoreTrace = {.exists = true, .size = 70, .modified = {1'700'000'000, 999'999'999}};
/// What shows that a settings file has the store's accounts.
using Proof = std::optional<CommitRecord::Proof>;
const Proof kProof = CommitRecord::Proof{.settingsSize = 512, .accounts = {"M", "with a blank"}};

CommitRecord recordOf(DevicePlace place, Trace store, Proof proof = kProof) {
  CommitRecord record;
  record.stores.push_back({place, store, std::move(proof)});
  return record;
}

TEST(CommitRecordTest, ATextSaysWhatItWasMadeOf) {
  constexpr std::int64_t kLeast = std::numeric_limits<std::int64_t>::min();
  CommitRecord record = recordOf(DevicePlace::LegacyMail, kStoreTrace);
  record.stores.push_back({DevicePlace::LegacyExchange,
                           {true, std::numeric_limits<std::uint64_t>::max(), {kLeast, 1}},
                           std::nullopt});
  record.stores.push_back({DevicePlace::LegacyExchange, kStoreTrace,
                           CommitRecord::Proof{.accounts = {"", std::string("\n\0\xff end", 7)}}});
  EXPECT_EQ(CommitRecord::parse(record.text()).stores, record.stores);
}

TEST(CommitRecordTest, TheTextIsOneThatAPersonCanRead) {
  EXPECT_EQ(recordOf(DevicePlace::LegacyMail, kStoreTrace).text() +
                recordOf(DevicePlace::LegacyExchange, kStoreTrace, std::nullopt).text(),
            "accounts-migration commit record 1\n"
            "LegacyMail 70 1700000000 999999999 512 =4d =77697468206120626c616e6b\n"
            "end\n"
            "accounts-migration commit record 1\n"
            "LegacyExchange 70 1700000000 999999999 any\n"
            "end\n");
}

TEST(CommitRecordTest, APartOfATextIsNoRecord) {
  const std::string text = recordOf(DevicePlace::LegacyMail, kStoreTrace).text();
  for (std::size_t size = 0; size < text.size(); ++size) {
    EXPECT_TRUE(CommitRecord::parse(text.substr(0, size)).stores.empty()) << size;
  }
  EXPECT_TRUE(CommitRecord::parse(text + "x").stores.empty());
}

TEST(CommitRecordTest, HostileTextsAreNoRecords) {
  const std::string first = "accounts-migration commit record 1\n";
  const std::string good = "LegacyMail 70 1 2 any\n";
  ASSERT_EQ(CommitRecord::parse(first + good + "end\n").stores.size(), 1u);
  for (const std::string& lines : {std::string("Settings 70 1 2 any\n"),
                                   std::string("CommitRecord none any\n"),
                                   std::string("Nothing 70 1 2 any\n"),
                                   std::string("\n"),
                                   std::string("LegacyMail\n"),
                                   std::string("LegacyMail 70 1\n"),
                                   std::string("LegacyMail 70 1 2\n"),
                                   std::string("LegacyMail 70 1 2 any any\n"),
                                   std::string("LegacyMail 70 1 2 any =4d\n"),
                                   std::string("LegacyMail 70 1 2 none\n"),
                                   std::string("LegacyMail -70 1 2 any\n"),
                                   std::string("LegacyMail 70 1 2x any\n"),
                                   std::string("LegacyMail  70 1 2 any\n"),
                                   std::string("LegacyMail 99999999999999999999 1 2 any\n"),
                                   std::string("LegacyMail 70 1 2 512 4d\n"),
                                   std::string("LegacyMail 70 1 2 512 =4\n"),
                                   std::string("LegacyMail 70 1 2 512 =4x\n"),
                                   std::string("LegacyMail 70 1 2 512  =4d\n"),
                                   std::string("LegacyMail 70 1 2 =4d\n"),
                                   std::string("end\n"),
                                   good + "end\n",
                                   good + std::string("Legacy\0Mail 70 1 2 any\n", 22)}) {
    EXPECT_TRUE(CommitRecord::parse(first + lines + "end\n").stores.empty()) << lines;
  }
  EXPECT_TRUE(
      CommitRecord::parse("accounts-migration commit record 2\n" + good + "end\n").stores.empty());
  EXPECT_TRUE(CommitRecord::parse("accounts-migration commit record 1\nend").stores.empty());
}

TEST(CommitRecordTest, NothingHasNoTrace) {
  EXPECT_EQ(CommitRecord::traceOf(FileIdentity()), Trace());
}

TEST(CommitRecordTest, ACopyWithTheSameSizeAndTimeHasTheSameTrace) {
  FileIdentity one;
  one.kind = EntryKind::RegularFile;
  one.size = 7;
  one.modified = {1, 2};
  FileIdentity other = one;
  other.inode = 99;
  other.mode = 0644;
  other.changed = {5, 5};
  EXPECT_EQ(CommitRecord::traceOf(one), CommitRecord::traceOf(other));
  other.modified.nanoseconds = 3;
  EXPECT_NE(CommitRecord::traceOf(one), CommitRecord::traceOf(other));
}

/// A device with a migrated settings file with one account, a store, and a record that names the
/// account.
class InterruptedCommitTest : public testing::Test {
 protected:
  InterruptedCommitTest() {
    setSettings(12, "M");
    snapshot.addFile(DevicePlace::LegacyMail, "store");
    snapshot.addFile(DevicePlace::RemovalSentinel, "removing");
  }
  void setSettings(int version, const char* identifier) {
    snapshot.addPropertyList(
        DevicePlace::Settings,
        PropertyDictionary{
            {"Version", version},
            {"Accounts", PropertyArray{PropertyDictionary{{"Identifier", identifier}}}}});
  }
  [[nodiscard]] Trace traceAt(DevicePlace place) const {
    return CommitRecord::traceOf(snapshot.at(place).identity);
  }
  void addRecord(const CommitRecord& record) {
    snapshot.addFile(DevicePlace::CommitRecord, record.text());
  }
  void addRecord() {
    addRecord(recordOf(DevicePlace::LegacyMail, traceAt(DevicePlace::LegacyMail)));
  }
  void expectStoreCounts(bool isCarriedOver) {
    Transaction transaction(snapshot, "/var/mobile");
    EXPECT_EQ(finishInterruptedCommit(transaction).stores.size(), isCarriedOver ? 1u : 0u);
    EXPECT_EQ(transaction.exists(DevicePlace::LegacyMail), !isCarriedOver);
    EXPECT_FALSE(transaction.exists(DevicePlace::RemovalSentinel));
    EXPECT_FALSE(transaction.exists(DevicePlace::CommitRecord));
  }

  FakeSnapshot snapshot;
};

TEST_F(InterruptedCommitTest, WithoutARecordNothingIsFinished) {
  Transaction transaction(snapshot, "/var/mobile");
  EXPECT_TRUE(finishInterruptedCommit(transaction).stores.empty());
  EXPECT_TRUE(transaction.changes().empty());
  EXPECT_TRUE(transaction.exists(DevicePlace::RemovalSentinel));
}

TEST_F(InterruptedCommitTest, AStoreOfTheRecordCountsAsRemoved) {
  addRecord();
  expectStoreCounts(true);
}

TEST_F(InterruptedCommitTest, AStoreThatAnotherProgramWroteIsConverted) {
  addRecord();
  snapshot[DevicePlace::LegacyMail].identity.modified.nanoseconds += 1;
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, AStoreThatCameBackFromABackupStillCounts) {
  addRecord();
  snapshot[DevicePlace::LegacyMail].identity.inode += 1;
  expectStoreCounts(true);
}

TEST_F(InterruptedCommitTest, AnotherStoreIsConverted) {
  addRecord(recordOf(DevicePlace::LegacyExchange, traceAt(DevicePlace::LegacyMail)));
  Transaction transaction(snapshot, "/var/mobile");
  const CommitRecord needed = finishInterruptedCommit(transaction);
  EXPECT_TRUE(transaction.exists(DevicePlace::LegacyMail));
  ASSERT_EQ(needed.stores.size(), 1u) << "the store that is gone may come back";
  EXPECT_EQ(needed.stores[0].place, DevicePlace::LegacyExchange);
}

TEST_F(InterruptedCommitTest, WithoutAnyOfTheRecordsAccountsTheStoreIsConverted) {
  addRecord();
  // That of before, or one that another program wrote after a run that was killed too early.
  setSettings(12, "another");
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, WithoutAccountsInTheRecordTheSizeOfTheSettingsFileCounts) {
  const std::uint64_t size = snapshot.at(DevicePlace::Settings).identity.size;
  for (const std::uint64_t recorded : {size, size + 1}) {
    addRecord(recordOf(DevicePlace::LegacyMail, traceAt(DevicePlace::LegacyMail),
                       CommitRecord::Proof{.settingsSize = recorded}));
    expectStoreCounts(recorded == size);
  }
}

TEST_F(InterruptedCommitTest, AStoreThatWasCarriedOverBeforeTheRecordNeedsNoProof) {
  addRecord(recordOf(DevicePlace::LegacyMail, traceAt(DevicePlace::LegacyMail), std::nullopt));
  setSettings(12, "another");
  expectStoreCounts(true);
}

TEST_F(InterruptedCommitTest, WithoutASettingsFileTheStoreIsConverted) {
  addRecord();
  snapshot.places[indexOf(DevicePlace::Settings)] = FakeSnapshot().at(DevicePlace::Settings);
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, WithASettingsFileOfAnotherVersionTheStoreIsConverted) {
  addRecord();
  setSettings(11, "M");
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, WithASettingsFileThatIsNoPropertyListTheStoreIsConverted) {
  addRecord();
  snapshot.addFile(DevicePlace::Settings, "no property list");
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, TheFileBesideAStoreThatWasCarriedOverGoesWithIt) {
  snapshot.addFile(DevicePlace::LegacyMailOriginal, "left by an older build");
  addRecord();
  Transaction transaction(snapshot, "/var/mobile");
  static_cast<void>(finishInterruptedCommit(transaction));
  EXPECT_FALSE(transaction.exists(DevicePlace::LegacyMailOriginal));
  EXPECT_TRUE(std::holds_alternative<Transaction::AsItWas>(
      transaction.at(DevicePlace::LegacyExchangeOriginal)));
}

TEST_F(InterruptedCommitTest, AMalformedRecordVouchesForNothingAndGoes) {
  snapshot.addFile(DevicePlace::CommitRecord, "malformed");
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, ARecordThatCannotBeReadIsAFailureAndNotAMissingOne) {
  snapshot.addFailingFile(DevicePlace::CommitRecord);
  Transaction transaction(snapshot, "/var/mobile");
  static_cast<void>(finishInterruptedCommit(transaction));
  EXPECT_TRUE(transaction.readFailure());
}

TEST(IsMigratedTest, OnlyTheCurrentVersionIs) {
  EXPECT_TRUE(isMigrated(PropertyDictionary{{"Version", 12}}));
  EXPECT_TRUE(isMigrated(PropertyDictionary{{"Version", "12"}}));
  EXPECT_FALSE(isMigrated(PropertyDictionary{{"Version", 11}}));
  EXPECT_FALSE(isMigrated(PropertyDictionary{{"Version", 13}}));
  EXPECT_FALSE(isMigrated(PropertyDictionary{{"Version", PropertyDictionary()}}));
  EXPECT_FALSE(isMigrated(PropertyDictionary()));
  EXPECT_FALSE(isMigrated(std::nullopt));
}

}  // namespace
}  // namespace accounts
