#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <fstream>
#include <iostream>
#include <map>
#include <random>
#include <set>
#include <thread>

#include "tests/fakes/Sanitizers.h"
#include "tests/program/AttributedLog.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/InterruptedDevice.h"
#include "tests/program/ListedLocks.h"
#include "tests/program/Programs.h"
#include "tests/program/TracedProgram.h"

// Many processes on one device at once, some of them killed, and another program that looks on.

namespace accounts {
namespace {

constexpr int kProcesses = kWithSanitizers ? 16 : 64;
constexpr int kRounds = kWithSanitizers ? 5 : 30;
constexpr int kKillsInARound = kProcesses / 4;
// About as many lines as the processes of a round write.
constexpr std::size_t kLinesOfAProcess = 8;
constexpr unsigned kSeed = 2011;
constexpr std::chrono::seconds kTimeLimit(60);
/// Who is killed when a certain line was written.
enum class Victim : std::uint8_t {
  /// The process that wrote it and holds the lock.
  Writer,
  /// Its host, which takes it along.
  Host,
  /// Some host, whatever it does just then.
  Anybody
};

/// Victims by the number of a line.
using Victims = std::map<std::size_t, Victim>;

Victims randomVictims(std::mt19937& random) {
  Victims victims;
  while (victims.size() < kKillsInARound) {
    victims[random() % (kProcesses * kLinesOfAProcess)] = static_cast<Victim>(random() % 3);
  }
  return victims;
}

pid_t parentOf(pid_t process) {
  std::ifstream status("/proc/" + std::to_string(process) + "/status");
  const std::string key = "PPid:";
  for (std::string line; std::getline(status, line);) {
    if (line.starts_with(key)) {
      return std::stoi(line.substr(key.size()));
    }
  }
  return 0;
}

/// Expects that the plug-in's lines of each process stand together, none of another's between them:
/// all are written under the lock.
void expectSerialised(const std::vector<AttributedLog::Line>& lines) {
  std::set<pid_t> seen;
  pid_t last = 0;
  for (const AttributedLog::Line& line : lines) {
    // Its host's own lines come when it has ended.
    if (line.writer != last && !line.text.starts_with("migration-host: ")) {
      EXPECT_TRUE(seen.insert(line.writer).second) << "comes back with " << line.text;
      last = line.writer;
    }
  }
}

class Concurrency : public InterruptedDevice {
 protected:
  void SetUp() override { makeDevice(); }

  /// Runs one host for each process of a round to their ends, killing as planned, and gives their
  /// exit statuses (negative for a signal).
  std::vector<int> runRound(const Victims& victims, std::mt19937& random) {
    AttributedLog log;
    const ProgramCall call = migrationCall({"--bare", "--channel", "-"});
    const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
    std::vector<pid_t> hosts;
    for (int process = 0; process < kProcesses; ++process) {
      hosts.push_back(startProgram(call, nowhere, log.writer()));
    }
    log.closeWriter();
    close(nowhere);

    std::vector<AttributedLog::Line> lines;
    while (std::optional<AttributedLog::Line> line = log.next(kTimeLimit)) {
      const auto planned = victims.find(lines.size());
      if (planned != victims.end()) {
        killOne(planned->second, line->writer, hosts, random);
      }
      lines.push_back(*std::move(line));
    }
    expectSerialised(lines);
    lines_ += lines.size();

    std::vector<int> statuses;
    for (const pid_t host : hosts) {
      const int status = waitForEnd(host, kTimeLimit);
      statuses.push_back(WIFSIGNALED(status) ? -WTERMSIG(status) : WEXITSTATUS(status));
    }
    return statuses;
  }

  /// Looks on a round from another program that waits for migrations to finish, and expects that it
  /// sees the settings wholly old, and from some time on wholly new.
  template <class Round>
  void runObserved(Round round) {
    const std::string observed = onThisMachine("/observed").string();
    std::ofstream(observed).close();
    const pid_t observer = startProgram(
        {.program = OBSERVE_PROGRAM,
         .arguments = {"--root", root(), "--bundle", pluginBundle(), "--times", "1000000"},
         .outputFile = observed},
        STDERR_FILENO, STDERR_FILENO);
    round();
    kill(observer, SIGKILL);
    waitForEnd(observer, kTimeLimit);
    std::ifstream stream(observed);
    bool migrated = false;
    // A last line that was not written to its end does not count.
    for (std::string line; std::getline(stream, line) && !stream.eof(); ++observations_) {
      migrated = migrated || line.starts_with("version 12, 3 accounts, ");
      EXPECT_TRUE(migrated ? line.starts_with("version 12, 3 accounts, ")
                           : line.starts_with("version 11, 1 accounts, 2 "))
          << line;
    }
    std::filesystem::remove(observed);
  }

  std::size_t lines_ = 0;
  int observations_ = 0;

 private:
  static void killOne(Victim victim, pid_t writer, const std::vector<pid_t>& hosts,
                      std::mt19937& random) {
    const pid_t host =
        victim == Victim::Anybody ? hosts[random() % hosts.size()] : parentOf(writer);
    // One that has ended already is nobody's parent any more, and stays away.
    if (std::find(hosts.begin(), hosts.end(), host) != hosts.end()) {
      kill(victim == Victim::Writer ? writer : host, SIGKILL);
    }
  }
};

TEST_F(Concurrency, ProcessesThatAreNotDisturbedAllSucceedOneAfterTheOther) {
  std::mt19937 random(kSeed);

  runObserved([&] { EXPECT_THAT(runRound({}, random), testing::Each(0)); });

  expectMigrated();
}

TEST_F(Concurrency, ProcessesOfWhichSomeAreKilledLoseNothingAndStayOneAfterTheOther) {
  std::mt19937 random(kSeed);
  std::ptrdiff_t killed = 0;
  for (int round = 0; round < kRounds && !HasFailure(); ++round) {
    SCOPED_TRACE("round " + std::to_string(round));
    makeDevice();

    runObserved([&] {
      const std::vector<int> statuses = runRound(randomVictims(random), random);
      EXPECT_THAT(statuses, testing::Each(testing::AnyOf(0, kPluginEnded, -SIGKILL)));
      killed += std::ssize(statuses) - std::count(statuses.begin(), statuses.end(), 0);
    });

    expectLockIsFree();
    expectNothingLost();
    expectNextRunFinishes({"--bare"});
  }
  EXPECT_GT(killed, 0);
  std::cout << kRounds << " rounds of " << kProcesses << " processes, " << killed << " killed, "
            << lines_ << " lines in order, " << observations_ << " observations\n";
}

/// A migration that stands still now and then.
class StoppedMigration : public InterruptedDevice {
 protected:
  // Between two stops at which somebody new starts to wait.
  static constexpr int kStep = kWithSanitizers ? 16 : 4;
  static constexpr int kStopsOfATrial = 4;

  void SetUp() override {
    if (!TracedProgram::isPossible()) {
      GTEST_SKIP() << "This system lets the test trace no programs.";
    }
    makeDevice();
  }

  /// Starts a program that waits for the migration to finish, and returns when it waits.
  void startWaiting() {
    const std::filesystem::path lockFile = onThisMachine(kLockPath);
    const std::string output =
        onThisMachine("/etc/observed").string() + std::to_string(waiting_.size());
    std::ofstream(output).close();
    waiting_[startProgram({.program = OBSERVE_PROGRAM,
                           .arguments = {"--root", root(), "--bundle", pluginBundle()},
                           .outputFile = output},
                          STDERR_FILENO, STDERR_FILENO)] = output;
    const auto deadline = std::chrono::steady_clock::now() + kTimeLimit;
    while (listedLockWaiters(lockFile) < waiting_.size()) {
      ASSERT_LT(std::chrono::steady_clock::now(), deadline) << "nobody waits";
      std::this_thread::yield();
    }
  }

  /// By process, the file that it writes to.
  std::map<pid_t, std::string> waiting_;
};

TEST_F(StoppedMigration, IsNeverSeenHalfDoneByAProgramThatWaitsForItsEnd) {
  TracedProgram program(migrationCall({"--bare"}), root());
  int stopsWithLock = 0;
  for (int stop = 0; program.runToNextStop() && !HasFatalFailure(); ++stop) {
    stopsWithLock = isLockListed(onThisMachine(kLockPath)) ? stopsWithLock + 1 : 0;
    // Before it is taken it is tried for a moment, which keeps nobody waiting.
    if (stop % kStep == 0 && stopsWithLock > kStopsOfATrial) {
      startWaiting();
    }
  }

  for (const auto& [process, output] : waiting_) {
    EXPECT_EQ(waitForEnd(process, kTimeLimit), 0);
    std::string seen;
    std::getline(std::ifstream(output), seen);
    EXPECT_EQ(seen, "version 12, 3 accounts, 0 legacy stores");
  }
  EXPECT_FALSE(waiting_.empty());
  std::cout << waiting_.size() << " programs waited for one migration\n";
}

TEST_F(StoppedMigration, ThatIsKilledKeepsNobodyWaiting) {
  TracedProgram program(migrationCall({"--bare"}), root());
  while (!isLockListed(onThisMachine(kLockPath))) {
    ASSERT_TRUE(program.runToNextStop());
  }
  startWaiting();

  program.kill();

  EXPECT_EQ(waitForEnd(waiting_.begin()->first, kTimeLimit), 0);
}

}  // namespace
}  // namespace accounts
