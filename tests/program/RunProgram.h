#pragma once

#include <sys/types.h>

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace accounts {

/// A user of this machine without privileges.
inline constexpr uid_t kSomebody = 54321;

/// How a program is to be run.
struct ProgramCall {
  std::string program;
  std::vector<std::string> arguments;
  /// Set in the program's environment in addition to the test's own.
  std::map<std::string, std::string> environment = {};
  /// The user that the program runs as, with the group of the same number and no others; none for
  /// the test's own. Needs a test that is run by root.
  std::optional<uid_t> user = {};
  /// The working directory; none for the test's own.
  std::optional<std::string> directory = {};
  /// Where standard output goes instead of into the result.
  std::optional<std::string> outputFile = {};
  /// The address space that it may take, in bytes; none for as much as the test has.
  std::optional<std::uint64_t> memory = {};
  /// How long it may take. Generous, for machines that are busy: it only has to tell a program that
  /// waits for something that never happens from one that works.
  std::chrono::seconds timeLimit = std::chrono::seconds(60);
};

/// What a program left behind when it ended.
struct ProgramResult {
  /// Its exit status; the number of the signal that ended it, negative, when one did.
  int exitStatus = 0;
  std::string output;
  std::string errors;

  /// The lines of standard output and of standard error, without their ends.
  [[nodiscard]] std::vector<std::string> outputLines() const;
  [[nodiscard]] std::vector<std::string> errorLines() const;
  /// Whether standard error has exactly this line.
  [[nodiscard]] bool hasErrorLine(const std::string& line) const;
};

/// Makes the calling process the program, standard input being empty; standard output and standard
/// error go to the given descriptors. For a process that was just forked.
[[noreturn]] void becomeProgram(const ProgramCall& call, int output, int errors);

/// Starts a program, standard input being empty, and returns its process. Standard output and
/// standard error go to the given descriptors.
pid_t startProgram(const ProgramCall& call, int output, int errors);

/// Waits for the end of a process that this one started and returns what waitpid() says. One that
/// takes longer than its time is killed, and the test fails. `peakMemory` gets the most bytes of
/// memory that it, or a process that it waited for, had at a time.
int waitForEnd(pid_t process, std::chrono::seconds timeLimit, std::uint64_t* peakMemory = nullptr);

/// Runs a program to its end, standard input being empty. One that takes longer than its time limit
/// is killed, and the test fails.
ProgramResult runProgram(const ProgramCall& call);

}  // namespace accounts
