#include <fcntl.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <sys/stat.h>

#include <csignal>
#include <fstream>
#include <sstream>
#include <thread>

#include "tests/fleet/FleetFixture.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ListedLocks.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr int kImages = 50;
// Some of the images.
constexpr int kMissing = 7;
constexpr int kWithOnePlaceForTwo = 11;
constexpr int kWithBrokenDescription = 23;
constexpr int kBusy = 31;

/// GNU parallel and examples/fleet/migrate-fleet over 50 images.
class Parallel : public FleetFixture {
 protected:
  [[nodiscard]] ProgramCall fleetCall(std::vector<std::string> options = {}) const {
    options.insert(options.end(), {"--jobs", "4", (directory() / "roots.txt").string(), results()});
    return call(example("migrate-fleet"), options);
  }
  [[nodiscard]] ProgramResult migrateFleet(std::vector<std::string> options = {}) const {
    return runProgram(fleetCall(std::move(options)));
  }
  [[nodiscard]] std::string results() const { return (directory() / "results").string(); }
  [[nodiscard]] std::string textOf(const std::string& name) const {
    std::ostringstream text;
    text << std::ifstream(fs::path(results()) / name).rdbuf();
    return text.str();
  }
  [[nodiscard]] nlohmann::json summary() const {
    return onlyObject(
        runProgram(call("accountsctl", {"summarize", "--json", "--expected",
                                        std::to_string(kImages), results() + "/results.jsonl"})));
  }
  [[nodiscard]] std::size_t lineCount(const std::string& name) const {
    const std::string text = textOf(name);
    return static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
  }

  /// Holds the lock that the migration of an image waits for.
  [[nodiscard]] int holdMigrationLock(int number) const {
    const int lock = open(lockOf(number).c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    EXPECT_EQ(flock(lock, LOCK_EX), 0);
    return lock;
  }
  [[nodiscard]] fs::path lockOf(int number) const {
    return image(number) / fs::path(kLockPath).relative_path();
  }
  void expectMigratedBut(const std::set<int>& others) const {
    for (int number = 1; number <= kImages; ++number) {
      if (!others.contains(number)) {
        EXPECT_EQ(versionOf(number), 12) << number;
      }
    }
  }
};

TEST_F(Parallel, EachImageIsMigratedOnceAndTheBrokenOnesAreReported) {
  (void)makeImages(kImages);
  fs::remove_all(image(kMissing));
  fs::remove_all(image(kWithOnePlaceForTwo) / "var/mobile/Library/Logs/CrashReporter");
  fs::create_directories(image(kWithOnePlaceForTwo) / "var/mobile/Library/Logs");
  fs::create_directory_symlink(
      "../Preferences", image(kWithOnePlaceForTwo) / "var/mobile/Library/Logs/CrashReporter");
  std::ofstream(image(kWithBrokenDescription) / "etc/device.plist") << "broken";

  const ProgramResult first = migrateFleet();

  EXPECT_EQ(first.exitStatus, 1) << first.output << first.errors;
  expectMigratedBut({kMissing, kWithOnePlaceForTwo, kWithBrokenDescription});
  const nlohmann::json counted = summary();
  EXPECT_EQ(counted["images"], kImages);
  EXPECT_EQ(counted["unreadableLines"], 0);
  EXPECT_EQ(counted["outcomes"],
            nlohmann::json::parse(R"([{"exitStatus":0,"outcome":"migrated","images":47},
                                      {"exitStatus":66,"outcome":"missingInput","images":2},
                                      {"exitStatus":73,"outcome":"cannotCreate","images":1}])"));
  EXPECT_EQ(counted["retry"], nlohmann::json::array());

  EXPECT_NE(first.output.find("\nImages that need a person:\n"), std::string::npos);
  for (const auto& [number, reason] :
       {std::pair<int, std::string>(kMissing, "Cannot open the device root"),
        {kWithOnePlaceForTwo, kSettingsPath + std::string(" and ")},
        {kWithBrokenDescription, "Cannot read the property list /etc/device.plist"}}) {
    EXPECT_NE(first.output.find("\n" + image(number).string() + "\t" + reason), std::string::npos)
        << first.output;
  }
  EXPECT_EQ(lineCount("results.jsonl"), kImages);
}

TEST_F(Parallel, WhatAnotherRunCannotHelpIsNotRunAgainUnlessAskedFor) {
  (void)makeImages(2);
  fs::rename(image(2), directory() / "away");
  EXPECT_EQ(migrateFleet().exitStatus, 1);
  fs::rename(directory() / "away", image(2));

  EXPECT_EQ(migrateFleet().exitStatus, 1);
  EXPECT_EQ(versionOf(2), 11);
  EXPECT_EQ(migrateFleet({"--again"}).exitStatus, 0);
  EXPECT_EQ(versionOf(2), 12);
}

TEST_F(Parallel, AnImageOfWhichAnotherRunMayHelpIsRunAgain) {
  (void)makeImages(kImages);
  const int root = open(image(kBusy).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  ASSERT_EQ(flock(root, LOCK_EX), 0);
  environment["LOCK_TIMEOUT"] = "0";

  EXPECT_EQ(migrateFleet().exitStatus, 1);
  EXPECT_EQ(summary()["retry"], nlohmann::json::array({image(kBusy).string()}));
  EXPECT_EQ(versionOf(kBusy), 11);

  close(root);
  const ProgramResult resumed = migrateFleet();
  EXPECT_EQ(resumed.exitStatus, 0) << resumed.output << resumed.errors;
  expectMigratedBut({});
  EXPECT_EQ(lineCount("results.jsonl"), kImages);
}

TEST_F(Parallel, AFleetThatIsKilledIsResumed) {
  (void)makeImages(kImages);
  const int lock = holdMigrationLock(kBusy);
  ProgramCall killed = fleetCall();
  // In a process group of its own, all of which is killed.
  killed.arguments.insert(killed.arguments.begin(), killed.program);
  killed.program = "setsid";
  const int output = memfd_create("output", MFD_CLOEXEC);
  const pid_t fleet = startProgram(killed, output, output);
  while (listedLockWaiters(lockOf(kBusy)) == 0) {
    std::this_thread::yield();
  }
  ASSERT_EQ(kill(-fleet, SIGKILL), 0);
  waitForEnd(fleet, std::chrono::seconds(60));
  EXPECT_EQ(versionOf(kBusy), 11);
  close(lock);

  const ProgramResult resumed = migrateFleet();

  EXPECT_EQ(resumed.exitStatus, 0) << resumed.output << resumed.errors;
  expectMigratedBut({});
  const nlohmann::json counted = summary();
  EXPECT_EQ(counted["images"], kImages);
  EXPECT_EQ(counted["attention"], nlohmann::json::array());
  close(output);
}

}  // namespace
}  // namespace accounts
