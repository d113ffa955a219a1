#include "tests/program/TracedProgram.h"

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/ptrace.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <utility>

#include "tests/program/FileCalls.h"

namespace accounts {
namespace {

constexpr int kSystemCallStop = SIGTRAP | 0x80;
constexpr long kOptions = PTRACE_O_TRACESYSGOOD | PTRACE_O_TRACEFORK | PTRACE_O_TRACEVFORK |
                          PTRACE_O_TRACECLONE | PTRACE_O_TRACEEXEC | PTRACE_O_EXITKILL;

/// The trace of a program and of its descendants: from the exec on, in a process group of their
/// own.
[[noreturn]] void becomeTracedProgram(const ProgramCall& call, int output) {
  setpgid(0, 0);
  if (ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) != 0) {
    _exit(EXIT_FAILURE);
  }
  raise(SIGSTOP);
  becomeProgram(call, output, output);
}

void resume(pid_t process, int signalNumber) {
  ptrace(PTRACE_SYSCALL, process, nullptr, static_cast<long>(signalNumber));
}

/// The signal of a stop that the process is to see: none for stops that the trace itself makes.
int signalToPassOn(int status) {
  const bool isEvent = status >> 16 != 0;
  const int number = WSTOPSIG(status);
  return isEvent || number == kSystemCallStop || number == SIGSTOP ? 0 : number;
}

}  // namespace

TracedProgram::TracedProgram(const ProgramCall& call, const std::filesystem::path& directory)
    // Without a separator at its end.
    : directory_((directory / "").lexically_normal().parent_path()) {
  ProgramCall traced = call;
  // The leak sanitizer traces as well, and only one can.
  traced.environment.emplace("ASAN_OPTIONS", "detect_leaks=0");
  const int output = memfd_create("output", MFD_CLOEXEC);
  program_ = fork();
  if (program_ == 0) {
    becomeTracedProgram(traced, output);
  }
  close(output);
  int status = 0;
  waitpid(program_, &status, __WALL);
  if (!WIFSTOPPED(status) || ptrace(PTRACE_SETOPTIONS, program_, nullptr, kOptions) != 0) {
    return;
  }
  processes_.emplace(program_, Process());
  stopped_ = program_;
}

TracedProgram::~TracedProgram() {
  kill();
}

bool TracedProgram::isPossible() {
  TracedProgram program({.program = "true", .arguments = {}}, "/tmp");
  return program.runToEnd() == 0;
}

bool TracedProgram::runToNextStop() {
  if (const std::optional<pid_t> process = std::exchange(stopped_, std::nullopt)) {
    resume(*process, 0);
  }
  return waitForStop();
}

int TracedProgram::runToEnd() {
  while (runToNextStop()) {
  }
  return exitStatus_;
}

void TracedProgram::kill() {
  if (processes_.empty()) {
    return;
  }
  ::kill(-program_, SIGKILL);
  while (waitpid(-program_, nullptr, __WALL) >= 0 || errno == EINTR) {
  }
  processes_.clear();
  stopped_.reset();
}

bool TracedProgram::waitForStop() {
  while (!processes_.empty()) {
    int status = 0;
    const pid_t process = waitpid(-program_, &status, __WALL);
    if (process < 0) {
      ADD_FAILURE() << "a traced program went away";
      return false;
    }
    if (!WIFSTOPPED(status)) {
      processes_.erase(process);
      if (process == program_) {
        exitStatus_ = WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
      }
      continue;
    }
    // A process that was just forked stops for the first time.
    processes_.try_emplace(process);
    if (WSTOPSIG(status) == kSystemCallStop && isStopAtFileCall(process)) {
      stopped_ = process;
      return true;
    }
    resume(process, signalToPassOn(status));
  }
  return false;
}

bool TracedProgram::isStopAtFileCall(pid_t process) {
  __ptrace_syscall_info information = {};
  if (ptrace(PTRACE_GET_SYSCALL_INFO, process, sizeof information, &information) <= 0) {
    return false;
  }
  const char*& fileCall = processes_.at(process).fileCall;
  if (information.op == PTRACE_SYSCALL_INFO_ENTRY) {
    std::array<std::uint64_t, 6> arguments{};
    std::copy(std::begin(information.entry.args), std::end(information.entry.args),
              arguments.begin());
    fileCall = fileCallBeneath(directory_, process, information.entry.nr, arguments);
    place_ = std::string("before ") + (fileCall != nullptr ? fileCall : "");
    return fileCall != nullptr;
  }
  const char* const ended = std::exchange(fileCall, nullptr);
  place_ = std::string("after ") + (ended != nullptr ? ended : "");
  return ended != nullptr;
}

}  // namespace accounts
