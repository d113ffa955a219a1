#include "host/ChildProcess.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/prctl.h>
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

ProgramError inputOutputError(const std::string& message) {
  return ProgramError{ExitStatus::InputOutputError, message + ": " + std::strerror(errno)};
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
  std::array<char, 4096> part{};
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
[[noreturn]] void runChild(int result, pid_t parent,
                           const std::function<std::string()>& function) noexcept {
  // A migration never goes on unseen: a host that is killed takes its child along. The parent may
  // have ended before the request was made.
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  if (getppid() != parent) {
    _exit(EXIT_FAILURE);
  }
  dup2(STDERR_FILENO, STDOUT_FILENO);
  const bool delivered = writeAll(result, function() + kEndMark);
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

}  // namespace

std::variant<std::string, ProgramError> runInChildProcess(
    const std::function<std::string()>& function) {
  // A file in memory rather than a pipe: its reader waits for the child alone, never for some
  // process that the child started and that keeps a pipe open.
  const int result = memfd_create("migration-result", MFD_CLOEXEC);
  if (result < 0) {
    return inputOutputError("No memory for the plug-in's result");
  }
  const pid_t parent = getpid();
  const pid_t child = fork();
  if (child == 0) {
    runChild(result, parent, function);
  }
  if (child < 0) {
    const ProgramError error = inputOutputError("No process for the plug-in");
    close(result);
    return error;
  }
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  std::string text = readFromStart(result);
  close(result);
  const bool delivered = text.ends_with(kEndMark);
  if (!WIFEXITED(status) || WEXITSTATUS(status) != EXIT_SUCCESS || !delivered) {
    return ProgramError{ExitStatus::PluginEnded, "The plug-in " + describeEnd(status)};
  }
  text.pop_back();
  return text;
}

}  // namespace accounts
