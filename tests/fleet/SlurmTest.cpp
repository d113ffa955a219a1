#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <sstream>

#include "tests/fleet/FleetFixture.h"
#include "tests/fleet/SlurmCluster.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ListedLocks.h"

// The recipe for Slurm, on a real one of one node.

namespace accounts {
namespace {

namespace fs = std::filesystem;

class Slurm : public FleetFixture {
 protected:
  void SetUp() override {
    environment["PATH"] = example("") + ":" + environment["PATH"];
    cluster_ = std::make_unique<SlurmCluster>(environment);
    if (cluster_->reason()) {
      GTEST_SKIP() << "No Slurm can be started here. " << *cluster_->reason();
    }
  }
  void TearDown() override { cluster_.reset(); }

  [[nodiscard]] const SlurmCluster& cluster() const { return *cluster_; }
  [[nodiscard]] std::string roots() const { return directory() / "roots.txt"; }
  [[nodiscard]] std::string results() const { return directory() / "results"; }

  /// Submits the recipe for some of the list's lines, as the documents say, and returns the job's
  /// number.
  [[nodiscard]] std::string submit(const std::string& lines, int lockTimeout = 60) const {
    std::string job =
        cluster().output("sbatch", {"--parsable", "--array=" + lines,
                                    "--export=ALL,LOCK_TIMEOUT=" + std::to_string(lockTimeout),
                                    example("slurm-array.sbatch"), roots(), results()});
    EXPECT_FALSE(job.empty());
    return job.substr(0, job.find('\n'));
  }
  [[nodiscard]] ProgramResult summary() const {
    return runProgram(call(example("migrate-fleet"), {"--summary", roots(), results()}));
  }
  /// What the tasks wrote beside their results.
  [[nodiscard]] std::string logs() const {
    std::string text;
    for (const auto& entry : fs::directory_iterator(cluster().workingDirectory())) {
      text += textOf(entry.path());
    }
    return text;
  }

  /// Holds an image as another host would.
  [[nodiscard]] int holdImage(int number) const {
    const int root = open(image(number).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    EXPECT_EQ(flock(root, LOCK_EX), 0);
    return root;
  }
  /// Waits until a task waits for an image that is held.
  void waitForTaskOf(int number) const {
    EXPECT_TRUE(comesTrue([&] { return listedLockWaiters(image(number)) > 0; })) << logs();
  }
  /// The process of a task whose command line has these words.
  [[nodiscard]] static pid_t processOf(const std::string& job, int task,
                                       const std::vector<std::string>& words) {
    const std::string jobVariable = "SLURM_ARRAY_JOB_ID=" + job + '\0';
    const std::string taskVariable = "SLURM_ARRAY_TASK_ID=" + std::to_string(task) + '\0';
    for (const auto& entry : fs::directory_iterator("/proc")) {
      const std::string environment = textOf(entry.path() / "environ");
      const std::string line = textOf(entry.path() / "cmdline");
      if (environment.find(jobVariable) != std::string::npos &&
          environment.find(taskVariable) != std::string::npos &&
          std::all_of(words.begin(), words.end(), [&](const std::string& word) {
            return line.find(word) != std::string::npos;
          })) {
        return std::stoi(entry.path().filename().string());
      }
    }
    ADD_FAILURE() << "no such process of task " << task;
    return 0;
  }
  static std::string textOf(const fs::path& path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
  }

 private:
  std::unique_ptr<SlurmCluster> cluster_;
};

TEST_F(Slurm, EachTaskMigratesTheImageOfItsLine) {
  (void)makeImages(20);
  std::ofstream list(roots());
  for (int number = 1; number <= 20; ++number) {
    // As an editor on another system leaves it, with no line break at the end.
    list << image(number).string() << (number < 20 ? "\r\n\r\n" : "");
  }
  list.close();

  (void)submit("1-20");
  cluster().waitForEmptyQueue();

  const ProgramResult result = summary();
  EXPECT_EQ(result.exitStatus, 0) << result.output << result.errors << logs();
  EXPECT_NE(result.output.find("20\t0\tmigrated\n"), std::string::npos) << result.output;
  for (int number = 1; number <= 20; ++number) {
    EXPECT_EQ(versionOf(number), 12) << number;
  }
  EXPECT_EQ(logs(), "");
}

TEST_F(Slurm, WhatFailsForGoodIsNotRunAgainAndNeedsAPerson) {
  (void)makeImages(3);
  fs::remove_all(image(3));

  const std::string job = submit("1-4");
  cluster().waitForEmptyQueue();

  cluster().waitForTask(job + "_3", {"JobState=FAILED", "Restarts=0", "ExitCode=66:0"});
  EXPECT_NE(logs().find("has no root number 4"), std::string::npos) << logs();
  const ProgramResult result = summary();
  EXPECT_EQ(result.exitStatus, 1);
  EXPECT_NE(result.output.find("Images that need a person:\n" + image(3).string() + "\tCannot "),
            std::string::npos)
      << result.output;
}

TEST_F(Slurm, WhatMayPassIsPutInTheQueueAgain) {
  (void)makeImages(1);
  const int root = holdImage(1);
  const std::string job = submit("1", 0);
  cluster().waitForTask(job + "_1", {"JobState=PENDING", "Restarts=1"});
  EXPECT_EQ(versionOf(1), 11);
  EXPECT_NE(summary().output.find("1\t75\tsomething that may pass\n"), std::string::npos);

  close(root);
  cluster().completeNow(job + "_1");

  EXPECT_EQ(summary().exitStatus, 0) << summary().output << logs();
  EXPECT_EQ(versionOf(1), 12);
}

TEST_F(Slurm, AHostThatIsKilledIsRunAgain) {
  (void)makeImages(1);
  const int root = holdImage(1);
  const std::string job = submit("1", 600);
  waitForTaskOf(1);

  ASSERT_EQ(kill(processOf(job, 1, {"migration-host", "run"}), SIGKILL), 0);

  cluster().waitForTask(job + "_1", {"JobState=PENDING", "Restarts=1"});
  EXPECT_NE(summary().output.find("1 without a result"), std::string::npos) << summary().output;
  close(root);
  cluster().completeNow(job + "_1");
  EXPECT_EQ(summary().exitStatus, 0) << summary().output << logs();
  EXPECT_EQ(versionOf(1), 12);
}

TEST_F(Slurm, ATaskThatIsKilledIsToldAsMissingAndCanBeSubmittedAgain) {
  (void)makeImages(2);
  const int root = holdImage(2);
  const std::string job = submit("1-2", 600);
  waitForTaskOf(2);

  ASSERT_EQ(kill(processOf(job, 2, {"slurm_script"}), SIGKILL), 0);
  cluster().waitForEmptyQueue();

  EXPECT_EQ(versionOf(2), 11);
  const ProgramResult result = summary();
  EXPECT_EQ(result.exitStatus, 1);
  EXPECT_NE(result.output.find("\n1\t\tno result yet\n"), std::string::npos) << result.output;
  close(root);
  (void)submit("2");
  cluster().waitForEmptyQueue();
  EXPECT_EQ(summary().exitStatus, 0) << summary().output << logs();
  EXPECT_EQ(versionOf(2), 12);
}

TEST_F(Slurm, ATaskThatIsCancelledDoesNotComeBack) {
  (void)makeImages(1);
  const int root = holdImage(1);
  const std::string job = submit("1", 600);
  waitForTaskOf(1);

  (void)cluster().output("scancel", {job + "_1"});

  cluster().waitForEmptyQueue();
  cluster().waitForTask(job + "_1", {"JobState=CANCELLED", "Restarts=0"});
  EXPECT_EQ(versionOf(1), 11);
  // The migration ended cleanly: there is a result.
  EXPECT_NE(summary().output.find("1\t75\tsomething that may pass\n"), std::string::npos);
  close(root);
}

}  // namespace
}  // namespace accounts
