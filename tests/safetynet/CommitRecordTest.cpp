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
const Trace kSettingsTrace = {.exists = true, .size = 0, .modified = {-1, 0}};

CommitRecord recordOf(DevicePlace place, Trace store, Trace settings = {}) {
  CommitRecord record;
  record.stores.push_back({place, store, settings});
  return record;
}

void expectSame(const CommitRecord& read, const CommitRecord& written) {
  ASSERT_EQ(read.stores.size(), written.stores.size());
  for (std::size_t index = 0; index < read.stores.size(); ++index) {
    EXPECT_EQ(read.stores[index].place, written.stores[index].place);
    EXPECT_EQ(read.stores[index].store, written.stores[index].store);
    EXPECT_EQ(read.stores[index].settingsBefore, written.stores[index].settingsBefore);
  }
}

TEST(CommitRecordTest, ATextSaysWhatItWasMadeOf) {
  constexpr std::int64_t kLeast = std::numeric_limits<std::int64_t>::min();
  CommitRecord record = recordOf(DevicePlace::LegacyMail, kStoreTrace, kSettingsTrace);
  record.stores.push_back({DevicePlace::LegacyExchange,
                           {true, std::numeric_limits<std::uint64_t>::max(), {kLeast, 1}},
                           Trace()});
  expectSame(CommitRecord::parse(record.text()), record);
}

TEST(CommitRecordTest, TheTextIsOneThatAPersonCanRead) {
  EXPECT_EQ(recordOf(DevicePlace::LegacyMail, kStoreTrace).text(),
            "accounts-migration commit record 1\n"
            "LegacyMail 70 1700000000 999999999 none\n"
            "end\n");
}

TEST(CommitRecordTest, APartOfATextIsNoRecord) {
  const std::string text = recordOf(DevicePlace::LegacyMail, kStoreTrace, kSettingsTrace).text();
  for (std::size_t size = 0; size < text.size(); ++size) {
    EXPECT_TRUE(CommitRecord::parse(text.substr(0, size)).stores.empty()) << size;
  }
  EXPECT_TRUE(CommitRecord::parse(text + "x").stores.empty());
}

TEST(CommitRecordTest, HostileTextsAreNoRecords) {
  const std::string first = "accounts-migration commit record 1\n";
  const std::string good = "LegacyMail 70 1 2 none\n";
  ASSERT_EQ(CommitRecord::parse(first + good + "end\n").stores.size(), 1u);
  for (const std::string& lines :
       {std::string("Settings 70 1 2 none\n"), std::string("CommitRecord none none\n"),
        std::string("Nothing 70 1 2 none\n"), std::string("\n"), std::string("LegacyMail\n"),
        std::string("LegacyMail 70 1\n"), std::string("LegacyMail 70 1 2\n"),
        std::string("LegacyMail 70 1 2 none none\n"), std::string("LegacyMail -70 1 2 none\n"),
        std::string("LegacyMail 70 1 2x none\n"), std::string("LegacyMail  70 1 2 none\n"),
        std::string("LegacyMail 99999999999999999999 1 2 none\n"), std::string("end\n"),
        good + "end\n", good + std::string("Legacy\0Mail 70 1 2 none\n", 23)}) {
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

/// A device with migrated settings, a store and a record that says it was carried over from older
/// settings.
class InterruptedCommitTest : public testing::Test {
 protected:
  InterruptedCommitTest() {
    snapshot.addPropertyList(DevicePlace::Settings, PropertyDictionary{{"Version", 12}});
    snapshot.addFile(DevicePlace::LegacyMail, "store");
    snapshot.addFile(DevicePlace::RemovalSentinel, "removing");
  }
  [[nodiscard]] Trace traceAt(DevicePlace place) const {
    return CommitRecord::traceOf(snapshot.at(place).identity);
  }
  void addRecord(const CommitRecord& record) {
    snapshot.addFile(DevicePlace::CommitRecord, record.text());
  }
  void addRecord() {
    addRecord(recordOf(DevicePlace::LegacyMail, traceAt(DevicePlace::LegacyMail), kStoreTrace));
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
  addRecord(recordOf(DevicePlace::LegacyExchange, traceAt(DevicePlace::LegacyMail), kStoreTrace));
  Transaction transaction(snapshot, "/var/mobile");
  const CommitRecord needed = finishInterruptedCommit(transaction);
  EXPECT_TRUE(transaction.exists(DevicePlace::LegacyMail));
  ASSERT_EQ(needed.stores.size(), 1u) << "the store that is gone may come back";
  EXPECT_EQ(needed.stores[0].place, DevicePlace::LegacyExchange);
}

TEST_F(InterruptedCommitTest, AStoreOfWhichTheSettingsFileHasNoAccountIsConverted) {
  const auto namedMail = [](const char* identifierKey, const char* arrayKey) {
    return PropertyDictionary{{"Version", 12},
                              {arrayKey, PropertyArray{PropertyDictionary{{identifierKey, "M"}}}}};
  };
  snapshot.addPropertyList(DevicePlace::LegacyMail, namedMail("uniqueId", "MailAccounts"));
  addRecord();
  // Another program may have written the settings file after a run that was killed too early.
  expectStoreCounts(false);
  snapshot.addPropertyList(DevicePlace::Settings, namedMail("Identifier", "Accounts"));
  expectStoreCounts(true);
}

TEST_F(InterruptedCommitTest, WithTheOldSettingsFileTheStoreIsConverted) {
  addRecord(recordOf(DevicePlace::LegacyMail, traceAt(DevicePlace::LegacyMail),
                     traceAt(DevicePlace::Settings)));
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, WithoutASettingsFileTheStoreIsConverted) {
  addRecord();
  snapshot.places[indexOf(DevicePlace::Settings)] = FakeSnapshot().at(DevicePlace::Settings);
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, WithASettingsFileOfAnotherVersionTheStoreIsConverted) {
  addRecord();
  snapshot.addPropertyList(DevicePlace::Settings, PropertyDictionary{{"Version", 11}});
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, WithASettingsFileThatIsNoPropertyListTheStoreIsConverted) {
  addRecord();
  snapshot.addFile(DevicePlace::Settings, "no property list");
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, AMalformedRecordVouchesForNothingAndGoes) {
  snapshot.addFile(DevicePlace::CommitRecord, "malformed");
  expectStoreCounts(false);
}

TEST_F(InterruptedCommitTest, ARecordWithAnAbsentStoreVouchesForNothing) {
  addRecord(recordOf(DevicePlace::LegacyMail, Trace(), kStoreTrace));
  snapshot.places[indexOf(DevicePlace::LegacyMail)] = FakeSnapshot().at(DevicePlace::LegacyMail);
  Transaction transaction(snapshot, "/var/mobile");
  EXPECT_TRUE(finishInterruptedCommit(transaction).stores.empty());
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
