#include <fstream>
#include <set>
#include <sstream>

#include "tests/fleet/FleetFixture.h"
#include "tests/program/DeviceRootFixture.h"

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
