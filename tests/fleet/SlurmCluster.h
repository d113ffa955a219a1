#pragma once

#include <sys/types.h>

#include <filesystem>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace accounts {

/// A real Slurm of one node, which runs as long as this lives. Its files are in a temporary
/// directory of its own.
class SlurmCluster {
 public:
  /// Starts it. `environment` is what its programs and the jobs get.
  explicit SlurmCluster(std::map<std::string, std::string> environment);
  /// Cancels what is in the queue and stops it.
  ~SlurmCluster();
  SlurmCluster(const SlurmCluster&) = delete;
  SlurmCluster& operator=(const SlurmCluster&) = delete;

  /// Why it could not be started here; none when it runs.
  [[nodiscard]] const std::optional<std::string>& reason() const { return reason_; }

  /// What a command such as "squeue" writes, in a working directory for the jobs' logs.
  [[nodiscard]] std::string output(const std::string& command,
                                   const std::vector<std::string>& arguments) const;
  /// What Slurm says of a task: "KEY=VALUE" words in one line.
  [[nodiscard]] std::string task(const std::string& task) const;
  /// Waits until a task is said to have all of some words; a failure of the test after a minute.
  void waitForTask(const std::string& task, const std::vector<std::string>& words) const;
  /// Waits until no task is in the queue.
  void waitForEmptyQueue() const;
  /// Lets a task that waits in the queue start at once rather than after Slurm's two minutes, and
  /// waits until it has completed. While the run before is being cleared away the queue can look
  /// empty, and a start is not taken.
  void completeNow(const std::string& task) const;

  /// The working directory of jobs.
  [[nodiscard]] std::filesystem::path workingDirectory() const { return directory_ / "work"; }
  [[nodiscard]] const std::map<std::string, std::string>& environment() const {
    return environment_;
  }

 private:
  [[nodiscard]] std::optional<std::string> start();
  void writeConfiguration() const;
  void startDaemon(const std::string& program, const std::vector<std::string>& arguments);
  /// Waits for something that the daemon started last is to bring about; false if it ended.
  [[nodiscard]] bool waitForDaemon(const std::function<bool()>& condition);
  [[nodiscard]] std::string logs() const;

  std::filesystem::path directory_;
  std::map<std::string, std::string> environment_;
  std::vector<pid_t> daemons_;
  std::optional<std::string> reason_;
};

/// Asks every tenth of a second; whether it came true within a minute.
bool comesTrue(const std::function<bool()>& condition);

}  // namespace accounts
