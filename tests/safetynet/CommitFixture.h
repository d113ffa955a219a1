#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "safetynet/Commit.h"
#include "tests/safetynet/FakeDevice.h"

namespace accounts {

/// A device with something at every place that a migration changes, and a proposal to change all.
class CommitTest : public testing::Test {
 protected:
  using Action = ProposedChange::Action;

  CommitTest() {
    for (const DevicePlace place :
         {DevicePlace::Settings, DevicePlace::LegacyExchange, DevicePlace::LegacyExchangeOriginal,
          DevicePlace::LegacyMail, DevicePlace::LegacyMailOriginal, DevicePlace::CopyAside,
          DevicePlace::AutoFetchEnabled}) {
      device.write(place, "old " + std::string(listed(place).name));
    }
    proposal.informationFileName = "AccountMigrationInformation-1.txt";
    propose(DevicePlace::Settings, Action::Write);
    for (const DevicePlace place :
         {DevicePlace::LegacyExchange, DevicePlace::LegacyExchangeOriginal, DevicePlace::LegacyMail,
          DevicePlace::LegacyMailOriginal, DevicePlace::AutoFetchEnabled}) {
      propose(place, Action::Remove);
    }
    propose(DevicePlace::CopyAside, Action::CopySettings);
    propose(DevicePlace::InformationDirectory, Action::Write);
    propose(DevicePlace::CommitRecord, Action::Write);
  }

  void propose(DevicePlace place, Action action) {
    proposal.changes.push_back({.place = place, .action = action});
  }
  void withdraw(DevicePlace place) {
    std::erase_if(proposal.changes, [&](const auto& each) { return each.place == place; });
    if (place == DevicePlace::InformationDirectory) {
      proposal.informationFileName.clear();
    }
  }
  /// The snapshot that the migration was made over.
  static DeviceSnapshot snapshotOf(FakeDevice& of) { return of.takeSnapshot().value(); }
  CommitOutcome commit(FakeDevice& to, const DeviceSnapshot& snapshot) const {
    KeptFolders folders(to, to);
    const ContentsOf contentsOf = [](const ProposedChange& change) {
      return std::make_unique<FakeBytes>("new " + std::string(listed(change.place).name));
    };
    return Commit(to, folders, snapshot, proposal, contentsOf, "20260102T030405Z").run();
  }
  CommitOutcome commit() { return commit(device, snapshotOf(device)); }

  static std::string kept(std::string_view name) {
    return std::string(kAccountMigrationDirectory) + "/Kept-20260102T030405Z/" + std::string(name);
  }

  FakeDevice device;
  Proposal proposal;
};

}  // namespace accounts
