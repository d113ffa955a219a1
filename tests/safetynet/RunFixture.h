#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "safetynet/MigrationRun.h"
#include "tests/safetynet/FakeDevice.h"
#include "tests/safetynet/MigrationFixture.h"

namespace accounts {

/// Locks that end waiting as a test says.
class FakeHostLocks final : public HostLocks {
 public:
  LockEnd root = LockEnd::Taken;
  LockEnd migration = LockEnd::Taken;
  bool isMigrationPossible = true;
  std::vector<std::string> calls;

  LockEnd takeRoot(std::optional<std::chrono::seconds> timeLimit) override {
    calls.push_back("takeRoot " + textOf(timeLimit));
    return root;
  }
  LockEnd takeMigration(std::optional<std::chrono::seconds> timeLimit) override {
    calls.push_back("takeMigration " + textOf(timeLimit));
    return migration;
  }
  bool canTakeMigration() override {
    calls.emplace_back("canTakeMigration");
    return isMigrationPossible;
  }
  void giveMigrationBack() override { calls.emplace_back("giveMigrationBack"); }
  [[nodiscard]] std::string reason() const override { return "why there is no lock"; }

 private:
  static std::string textOf(std::optional<std::chrono::seconds> timeLimit) {
    return timeLimit ? std::to_string(timeLimit->count()) : "without end";
  }
};

/// A worker that really migrates in memory, with a plug-in of a few lines: it gives the settings
/// file the current version, adds the accounts of the mail store under fresh identifiers, as a
/// conversion of accounts without identifiers does, and removes the store.
class FakeWorker final : public Worker {
 public:
  OrProgramError<HandedOver> work(const DeviceSnapshot& snapshot, const WorkerTask& task) override {
    MigrationInMemory migration(snapshot, "/var/mobile");
    if (task.purpose != RunPurpose::FinishingAlone) {
      runPlugin(migration.transaction());
    }
    migration.verify(task.purpose == RunPurpose::FinishingAlone ? PluginResult::NotAsked
                                                                : PluginResult::GaveTrue,
                     {});
    memoryFile.clear();
    const auto proposal = migration.proposal(task.keep, [this](std::string_view bytes) {
      memoryFile.append(bytes);
      return true;
    });
    return HandedOver{accounts::bytesOf(proposal.value()), memoryFile.size()};
  }
  std::unique_ptr<ReadableBytes> contentsOf(const ProposedChange& change) override {
    return std::make_unique<FakeBytes>(memoryFile.substr(change.offset, change.length));
  }

  std::string memoryFile;

 private:
  static void runPlugin(Transaction& transaction) {
    const auto before = transaction.dictionaryAt(DevicePlace::Settings).value_or(settingsWith(11));
    std::vector<PropertyValue> all;
    const PropertyArray accounts = before.arrayForKey("Accounts").value();
    for (const PropertyValue& each : accounts) {
      all.push_back(each);
    }
    if (transaction.exists(DevicePlace::LegacyMail)) {
      all.emplace_back(PropertyDictionary{{"Identifier", "mail"}});
      transaction.put(DevicePlace::LegacyMail, Transaction::Removed{});
    }
    const PropertyDictionary after = {{"Version", 12}, {"Accounts", PropertyArray(std::move(all))}};
    transaction.put(
        DevicePlace::Settings,
        Transaction::List{BinaryPropertyListSerializer().serialize(after).value(), std::nullopt});
    transaction.noteSave(LastSave::Written);
  }
};

/// A worker that does what a test says.
class ScriptedWorker final : public Worker {
 public:
  using Work = std::function<OrProgramError<HandedOver>(const WorkerTask& task)>;
  explicit ScriptedWorker(Work work) : work_(std::move(work)) {}

  OrProgramError<HandedOver> work(const DeviceSnapshot& /*snapshot*/,
                                  const WorkerTask& task) override {
    return work_(task);
  }
  std::unique_ptr<ReadableBytes> contentsOf(const ProposedChange& /*change*/) override {
    return std::make_unique<FakeBytes>("contents");
  }

 private:
  Work work_;
};

/// A device with an older settings file and a legacy mail store.
class RunTest : public testing::Test {
 protected:
  RunTest() {
    device.writePropertyList(DevicePlace::Settings, settingsWith(11, {"one"}));
    device.writePropertyList(DevicePlace::LegacyMail, mailStoreWith({"mail"}));
  }

  static RunMeans meansOf(FakeDevice& on, HostLocks& locks) {
    return {.locks = locks,
            .places = on,
            .files = on,
            .makeWorker = [] { return std::make_unique<FakeWorker>(); },
            .isStopped = [] { return false; },
            .tell = [](std::string_view) {},
            .time = "20260102T030405Z",
            .lockTimeout = std::chrono::seconds(7)};
  }
  RunConclusion run(RunPurpose purpose = RunPurpose::Migration,
                    KeepFiles keep = KeepFiles::WhenNeeded) {
    return MigrationRun(means).run(purpose, keep);
  }
  void useWorker(ScriptedWorker::Work work) {
    means.makeWorker = [work = std::move(work)] { return std::make_unique<ScriptedWorker>(work); };
  }
  /// The identifiers of the accounts in the settings file, in order.
  static std::vector<std::string> accountsOn(const FakeDevice& on) {
    std::vector<std::string> identifiers;
    const auto settings = readBinaryPropertyList(on.at(DevicePlace::Settings));
    if (!settings || settings->asDictionary() == nullptr) {
      return {"(no settings file)"};
    }
    const PropertyArray accounts = settings->asDictionary()->arrayForKey("Accounts").value();
    for (const PropertyValue& each : accounts) {
      identifiers.push_back(each.asDictionary()->textForKey("Identifier")->string());
    }
    return identifiers;
  }

  FakeDevice device;
  FakeHostLocks locks;
  RunMeans means = meansOf(device, locks);
};

}  // namespace accounts
