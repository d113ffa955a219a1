#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <fstream>
#include <set>
#include <sstream>

#include "tests/fleet/FleetFixture.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"

// The recipes for engines that are not here: what they run is run, with what the engine would give
// it.

namespace accounts {
namespace {

namespace fs = std::filesystem;

class Recipes : public FleetFixture {
 protected:
  [[nodiscard]] std::string textOf(const std::string& name) const {
    std::ostringstream text;
    text << std::ifstream(directory() / name).rdbuf();
    return text.str();
  }
};

TEST_F(Recipes, ShellScriptsHaveNothingThatACheckerWarnsOf) {
  const ProgramResult result =
      runProgram(call("shellcheck", {example("migrate-image"), example("migrate-fleet"),
                                     example("slurm-array.sbatch")}));
  EXPECT_EQ(result.exitStatus, 0) << result.output;
}

/// The task of a Slurm array, with a program in the place of the one that asks Slurm.
class SlurmTask : public Recipes {
 protected:
  SlurmTask() {
    roots_ = makeImages(3);
    fs::create_directories(directory() / "bin");
    std::ofstream(directory() / "bin/scontrol")
        << "#!/bin/sh\necho \"$*\" >> '" << (directory() / "requeued").string() << "'\n";
    fs::permissions(directory() / "bin/scontrol", fs::perms(0755));
    environment["PATH"] = (directory() / "bin").string() + ":" + environment["PATH"];
    environment["SLURM_ARRAY_JOB_ID"] = "77";
  }

  [[nodiscard]] ProgramCall task(int number, int restarts = 0) const {
    ProgramCall taskCall = call("bash", {example("slurm-array.sbatch"), roots_});
    taskCall.environment["SLURM_ARRAY_TASK_ID"] = std::to_string(number);
    taskCall.environment["SLURM_RESTART_COUNT"] = std::to_string(restarts);
    return taskCall;
  }

 private:
  std::string roots_;
};

TEST_F(SlurmTask, MigratesTheImageOfItsNumber) {
  const ProgramResult result = runProgram(task(2));
  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(onlyObject(result)["root"], image(2).string());
  EXPECT_EQ(versionOf(1), 11);
  EXPECT_EQ(versionOf(2), 12);
  EXPECT_EQ(textOf("requeued"), "");
}

TEST_F(SlurmTask, WhatFailsForGoodIsNotPutInTheQueueAgain) {
  fs::remove_all(image(3));
  EXPECT_EQ(runProgram(task(3)).exitStatus, 66);
  EXPECT_EQ(textOf("requeued"), "");
}

TEST_F(SlurmTask, WhatMayPassIsPutInTheQueueAgainFiveTimes) {
  const int busy = open(image(1).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  ASSERT_EQ(flock(busy, LOCK_EX), 0);
  environment["LOCK_TIMEOUT"] = "0";
  EXPECT_EQ(runProgram(task(1, 4)).exitStatus, kMayPass);
  EXPECT_EQ(textOf("requeued"), "requeue 77_1\n");
  EXPECT_EQ(runProgram(task(1, 5)).exitStatus, kMayPass);
  EXPECT_EQ(textOf("requeued"), "requeue 77_1\n");
  EXPECT_EQ(versionOf(1), 11);
  close(busy);
}

/// The Kubernetes Job, read as YAML.
class KubernetesJob : public Recipes {
 protected:
  KubernetesJob() {
    const ProgramResult result = runProgram(
        call("python3", {"-c",
                         "import json, sys, yaml\n"
                         "print(json.dumps(list(yaml.safe_load_all(open(sys.argv[1])))))",
                         example("kubernetes-job.yaml")}));
    EXPECT_EQ(result.exitStatus, 0) << result.errors;
    objects_ = nlohmann::json::parse(result.output);
    for (const nlohmann::json& object : objects_) {
      if (object["kind"] == "Job") {
        job = object;
      }
    }
  }

  [[nodiscard]] nlohmann::json container() const {
    return job["spec"]["template"]["spec"]["containers"][0];
  }

  nlohmann::json job;

 private:
  nlohmann::json objects_;
};

TEST_F(KubernetesJob, CountsFailuresOfEachImageByItself) {
  EXPECT_EQ(job["apiVersion"], "batch/v1");
  EXPECT_EQ(job["spec"]["completionMode"], "Indexed");
  EXPECT_EQ(job["spec"]["backoffLimitPerIndex"], 5);
  EXPECT_EQ(job["spec"]["maxFailedIndexes"], job["spec"]["completions"]);
  // What a policy for failures of pods needs.
  EXPECT_EQ(job["spec"]["template"]["spec"]["restartPolicy"], "Never");
}

TEST_F(KubernetesJob, TriesAgainExactlyWhatMayPass) {
  std::set<int> neverAgain;
  for (const nlohmann::json& rule : job["spec"]["podFailurePolicy"]["rules"]) {
    if (rule["action"] == "FailIndex") {
      EXPECT_EQ(rule["onExitCodes"]["containerName"], container()["name"]);
      EXPECT_EQ(rule["onExitCodes"]["operator"], "In");
      neverAgain = rule["onExitCodes"]["values"].get<std::set<int>>();
    }
  }
  EXPECT_EQ(neverAgain, (std::set<int>{1, 2, 64, 65, 66, 70, 73, 74}));
}

TEST_F(KubernetesJob, ItsContainerMigratesTheImageOfItsIndex) {
  std::vector<std::string> command = container()["command"];
  ProgramCall pod = call(command[0], {command.begin() + 1, command.end()});
  pod.environment["ROOTS"] = makeImages(2);
  pod.environment["LOG"] = (directory() / "log").string();
  pod.environment["JOB_COMPLETION_INDEX"] = "1";

  const ProgramResult result = runProgram(pod);

  EXPECT_EQ(result.exitStatus, 0) << result.errors;
  EXPECT_EQ(onlyObject(result)["root"], image(2).string());
  EXPECT_EQ(versionOf(1), 11);
  EXPECT_EQ(versionOf(2), 12);
  EXPECT_EQ(textOf("log"), "Migrating accounts\n");
}

}  // namespace
}  // namespace accounts
