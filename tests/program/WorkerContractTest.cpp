#include <fcntl.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <unistd.h>

#include <csignal>
#include <thread>

#include "platform/linux/FileDescriptor.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/ListedLocks.h"
#include "tests/program/Programs.h"
#include "tests/program/SmallDisk.h"

// What an engine that runs the host on thousands of images relies on.

namespace accounts {
namespace {

class WorkerContract : public DeviceRootFixture {
 protected:
  WorkerContract() { write(kSettingsPath, accountSettings(11)); }

  /// Holds the lock on something beneath the root, as another process would.
  [[nodiscard]] FileDescriptor locked(std::string_view devicePath, int flags) const {
    FileDescriptor file(open(onThisMachine(devicePath).c_str(), flags | O_CLOEXEC, 0600));
    EXPECT_EQ(flock(file.number(), LOCK_EX), 0);
    return file;
  }

  /// Starts the host and sends it a signal once it waits for the lock on something.
  [[nodiscard]] ProgramResult stopWhileItWaitsFor(std::string_view devicePath, int signal) const {
    const int output = memfd_create("output", MFD_CLOEXEC);
    const int errors = memfd_create("errors", MFD_CLOEXEC);
    const pid_t host = startProgram(migrationCall({"--json"}), output, errors);
    while (listedLockWaiters(onThisMachine(devicePath)) == 0) {
      std::this_thread::yield();
    }
    kill(host, signal);
    const int status = waitForEnd(host, std::chrono::seconds(60));
    return {WIFSIGNALED(status) ? -WTERMSIG(status) : WEXITSTATUS(status), textOf(output),
            textOf(errors)};
  }

 private:
  static std::string textOf(int file) {
    std::string text(65536, '\0');
    const ssize_t count = pread(file, text.data(), text.size(), 0);
    close(file);
    text.resize(count < 0 ? 0 : static_cast<std::size_t>(count));
    return text;
  }
};

TEST_F(WorkerContract, ARootThatAnotherHostHasMayPass) {
  const FileDescriptor other = locked("/", O_RDONLY | O_DIRECTORY);
  const std::vector<std::string> before = files();

  const ProgramResult result = migrate({"--json", "--lock-timeout", "0"});

  EXPECT_EQ(result.exitStatus, kMayPass);
  EXPECT_EQ(onlyObject(result)["exitStatus"], kMayPass);
  EXPECT_EQ(result.errors,
            "migration-host: Another process has had the device root for 0 seconds\n");
  EXPECT_EQ(files(), before);
}

TEST_F(WorkerContract, ARootThatIsFreeIsNotWaitedFor) {
  EXPECT_EQ(migrate({"--lock-timeout", "0"}).exitStatus, 0);
}

TEST_F(WorkerContract, AHostThatWaitsForTheRootIsStoppedWithNothingTouched) {
  const FileDescriptor other = locked("/", O_RDONLY | O_DIRECTORY);
  const std::vector<std::string> before = files();

  const ProgramResult result = stopWhileItWaitsFor("/", SIGTERM);

  EXPECT_EQ(result.exitStatus, kMayPass) << result.errors;
  EXPECT_EQ(onlyObject(result)["error"], "The host was asked to stop");
  EXPECT_EQ(files(), before);
}

TEST_F(WorkerContract, AMigrationThatWaitsIsStoppedAndReported) {
  const std::string settings = readText(kSettingsPath);
  {
    const FileDescriptor other = locked(kLockPath, O_RDWR | O_CREAT);
    const ProgramResult result = stopWhileItWaitsFor(kLockPath, SIGINT);
    EXPECT_EQ(result.exitStatus, kMayPass) << result.errors;
    EXPECT_EQ(onlyObject(result)["exitStatus"], kMayPass);
    EXPECT_EQ(onlyObject(result)["error"], "The host was asked to stop") << result.errors;
  }
  EXPECT_EQ(readText(kSettingsPath), settings);
  EXPECT_EQ(migrate().exitStatus, 0);
  EXPECT_EQ(readDictionary(kSettingsPath), accountSettings(12));
}

TEST_F(WorkerContract, ADiskWithoutRoomForKeptFilesMayPass) {
  SmallDisk disk(SmallDisk::Kind::Memory, onThisMachine("/var/mobile"));
  if (disk.reason()) {
    GTEST_SKIP() << *disk.reason();
  }
  write(kSettingsPath, accountSettings(11));
  disk.leaveInodes(0);
  EXPECT_EQ(migrate().exitStatus, kMayPass);
  disk.makeRoom();
  EXPECT_EQ(migrate().exitStatus, 0);
}

TEST_F(WorkerContract, TheStagesOfAMigrationAreReported) {
  const nlohmann::json steps = onlyObject(migrate({"--json"}))["steps"];
  const auto hasStep = [&](const char* name) {
    return std::find(steps.begin(), steps.end(), name) != steps.end();
  };
  EXPECT_TRUE(hasStep("_migrateAccountsFrom9B176:")) << steps;
  EXPECT_FALSE(hasStep("_migrateAccountsFrom9A334:")) << steps;
}

TEST_F(WorkerContract, ATimeoutThatIsNoNumberOfSecondsIsUnusable) {
  for (const char* value : {"-1", "soon", ""}) {
    const ProgramResult result = migrate({"--json", "--lock-timeout", value});
    EXPECT_EQ(result.exitStatus, 64) << value;
    EXPECT_EQ(onlyObject(result)["exitStatus"], 64);
  }
}

}  // namespace
}  // namespace accounts
