#pragma once

#include <sys/types.h>

#include <filesystem>
#include <map>
#include <optional>
#include <string>

#include "tests/program/RunProgram.h"

namespace accounts {

/// A program that is run from one system call to the next: it stops before and after each one with
/// which the program, or a process that it started, touches a file beneath a directory (opens,
/// reads, writes, locks, makes, renames or removes it, or changes what it is).
class TracedProgram {
 public:
  /// Starts the program, stopped before it does anything.
  TracedProgram(const ProgramCall& call, const std::filesystem::path& directory);
  /// Kills what still runs.
  ~TracedProgram();
  TracedProgram(const TracedProgram&) = delete;
  TracedProgram& operator=(const TracedProgram&) = delete;

  /// Whether this system lets the test trace programs.
  static bool isPossible();

  /// Lets the program run until its next stop. False when it ended instead.
  bool runToNextStop();
  /// Lets the program run to its end, and returns its exit status.
  int runToEnd();
  /// Kills the program and every process that it started, where they are, and waits for their ends.
  void kill();

  /// Where the program stopped last: "before renameat", for instance.
  [[nodiscard]] std::string place() const { return place_; }

 private:
  struct Process {
    /// The call that the process is in, if it touches a file beneath the directory.
    const char* fileCall = nullptr;
  };

  bool waitForStop();
  bool isStopAtFileCall(pid_t process);

  std::filesystem::path directory_;
  /// The program's own process, which is the process group of all.
  pid_t program_ = 0;
  std::map<pid_t, Process> processes_;
  /// The process that stopped at a file call.
  std::optional<pid_t> stopped_;
  std::string place_;
  int exitStatus_ = -1;
};

}  // namespace accounts
