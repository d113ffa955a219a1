#include "host/ChildProcess.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <string_view>

namespace accounts {
namespace {

/// Ends a text that the child wrote in full; a child that dies while writing leaves it out.
constexpr char kEndMark = '\x04';
constexpr char kLineEnd = '\n';

// A migration takes far less; one that takes longer waits for something.
constexpr auto kGrace = std::chrono::seconds(5);

/// The system lacks what a child process needs; at another time it may have it.
ProgramError temporaryFailure(const std::string& message) {
  return ProgramError{ExitStatus::TemporaryFailure, message + ": " + std::strerror(errno)};
}

bool writeAll(int file, std::string_view text) {
  while (!text.empty()) {
    const ssize_t count = write(file, text.data(), text.size());
    if (count < 0 && errno != EINTR) {
      return false;
    }
    text.remove_prefix(static_cast<std::size_t>(count < 0 ? 0 : count));
  }
  return true;
}

std::string readFromStart(int file) {
  std::string text;
  std::array<char, 65536> part;
  while (true) {
    const ssize_t count = pread(file, part.data(), part.size(), static_cast<off_t>(text.size()));
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count <= 0) {
      return text;
    }
    text.append(part.data(), static_cast<std::size_t>(count));
  }
}

// noexcept: an exception of the plug-in ends the child as an abort, not the host's own main().
[[noreturn]] void runChild(int result, pid_t parent, const ChildFunction& function) noexcept {
  // A migration never goes on unseen: a host that is killed takes its child along. The parent may
  // have ended before the request was made.
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  if (getppid() != parent) {
    _exit(EXIT_FAILURE);
  }
  dup2(STDERR_FILENO, STDOUT_FILENO);
  const WriteLine writeLine = [result](std::string_view line) {
    // A line that does not arrive is missed by people alone.
    static_cast<void>(writeAll(result, std::string(line) + kLineEnd));
  };
  const bool delivered = writeAll(result, function(writeLine) + kEndMark);
  std::exit(delivered ? EXIT_SUCCESS : EXIT_FAILURE);
}

/// How the child ended, for a person.
std::string describeEnd(int status) {
  if (WIFSIGNALED(status)) {
    const int signalNumber = WTERMSIG(status);
    return "ended by signal " + std::to_string(signalNumber) + " (" + strsignal(signalNumber) + ")";
  }
  return "ended the process with exit status " + std::to_string(WEXITSTATUS(status));
}

/// What the child left in its file, and how it ended.
ChildOutcome outcomeOf(std::string_view text, int status) {
  ChildOutcome outcome;
  for (std::size_t end = text.find(kLineEnd); end != std::string_view::npos;
       end = text.find(kLineEnd)) {
    outcome.lines.emplace_back(text.substr(0, end));
    text.remove_prefix(end + 1);
  }
  const bool delivered = text.ends_with(kEndMark);
  if (!WIFEXITED(status) || WEXITSTATUS(status) != EXIT_SUCCESS || !delivered) {
    outcome.result = ProgramError{ExitStatus::PluginEnded, "The plug-in " + describeEnd(status)};
  } else {
    outcome.result = std::string(text.substr(0, text.size() - 1));
  }
  return outcome;
}

}  // namespace

ChildOutcome runInChildProcess(const ChildFunction& function, StopSignals& stop) {
  // A file in memory rather than a pipe: its reader waits for the child alone, never for some
  // process that the child started and that keeps a pipe open.
  const int result = memfd_create("migration-result", MFD_CLOEXEC);
  if (result < 0) {
    return {{}, temporaryFailure("No memory for the plug-in's result")};
  }
  const pid_t parent = getpid();
  const pid_t child = fork();
  if (child == 0) {
    runChild(result, parent, function);
  }
  if (child < 0) {
    ChildOutcome outcome{{}, temporaryFailure("No process for the plug-in")};
    close(result);
    return outcome;
  }
  const FileDescriptor process(static_cast<int>(syscall(SYS_pidfd_open, child, 0)));
  const bool endedByItself = process.number() < 0 || stop.waitForEndOf(process, kGrace);
  if (!endedByItself) {
    kill(child, SIGKILL);
  }
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  const std::string text = readFromStart(result);
  close(result);
  ChildOutcome outcome = outcomeOf(text, status);
  if (!endedByItself) {
    outcome.result = ProgramError{ExitStatus::TemporaryFailure,
                                  std::string(kStopped) + " before the plug-in was done"};
  }
  return outcome;
}

}  // namespace accounts
