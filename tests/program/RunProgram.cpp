#include "tests/program/RunProgram.h"

#include <fcntl.h>
#include <grp.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <cstdlib>
#include <sstream>

namespace accounts {
namespace {

constexpr int kCannotStart = 127;

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(line);
  }
  return lines;
}

std::string contentsOf(int file) {
  std::string text;
  std::array<char, 4096> part{};
  ssize_t count = 0;
  while ((count = pread(file, part.data(), part.size(), static_cast<off_t>(text.size()))) > 0) {
    text.append(part.data(), static_cast<std::size_t>(count));
  }
  close(file);
  return text;
}

bool becomeUser(uid_t user) {
  return setgroups(0, nullptr) == 0 && setgid(user) == 0 && setuid(user) == 0;
}

bool takeAtMost(std::uint64_t memory) {
  const rlimit limit = {.rlim_cur = memory, .rlim_max = memory};
  return setrlimit(RLIMIT_AS, &limit) == 0;
}

}  // namespace

std::vector<std::string> ProgramResult::outputLines() const {
  return linesOf(output);
}

std::vector<std::string> ProgramResult::errorLines() const {
  return linesOf(errors);
}

bool ProgramResult::hasErrorLine(const std::string& line) const {
  const std::vector<std::string> lines = errorLines();
  return std::find(lines.begin(), lines.end(), line) != lines.end();
}

void becomeProgram(const ProgramCall& call, int output, int errors) {
  dup2(open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
  const int outputFile =
      call.outputFile ? open(call.outputFile->c_str(), O_WRONLY | O_CLOEXEC) : output;
  dup2(outputFile, STDOUT_FILENO);
  dup2(errors, STDERR_FILENO);
  // What whoever started the tests left open is none of the program's.
  close_range(STDERR_FILENO + 1, ~0U, CLOSE_RANGE_CLOEXEC);
  // That of whoever runs the tests may not be installed.
  setenv("LC_ALL", "C.UTF-8", 1);
  for (const auto& [name, value] : call.environment) {
    setenv(name.c_str(), value.c_str(), 1);
  }
  std::vector<char*> arguments{const_cast<char*>(call.program.c_str())};
  for (const std::string& argument : call.arguments) {
    arguments.push_back(const_cast<char*>(argument.c_str()));
  }
  arguments.push_back(nullptr);
  const bool isThere = !call.directory || chdir(call.directory->c_str()) == 0;
  if (isThere && (!call.user || becomeUser(*call.user)) &&
      (!call.memory || takeAtMost(*call.memory))) {
    execvp(call.program.c_str(), arguments.data());
  }
  _exit(kCannotStart);
}

pid_t startProgram(const ProgramCall& call, int output, int errors) {
  const pid_t child = fork();
  if (child == 0) {
    becomeProgram(call, output, errors);
  }
  return child;
}

int waitForEnd(pid_t process, std::chrono::seconds timeLimit, std::uint64_t* peakMemory) {
  const auto handle = static_cast<int>(syscall(SYS_pidfd_open, process, 0));
  pollfd ended = {handle, POLLIN, 0};
  const auto milliseconds = std::chrono::milliseconds(timeLimit).count();
  if (poll(&ended, 1, static_cast<int>(milliseconds)) == 0) {
    ADD_FAILURE() << "a program did not end within " << timeLimit.count() << " seconds";
    kill(process, SIGKILL);
  }
  close(handle);
  int status = 0;
  rusage used = {};
  wait4(process, &status, 0, &used);
  if (peakMemory != nullptr) {
    constexpr std::uint64_t kKibibyte = 1024;
    *peakMemory = static_cast<std::uint64_t>(used.ru_maxrss) * kKibibyte;
  }
  return status;
}

ProgramResult runProgram(const ProgramCall& call) {
  const int output = memfd_create("output", MFD_CLOEXEC);
  const int errors = memfd_create("errors", MFD_CLOEXEC);
  const pid_t process = startProgram(call, output, errors);
  const int status = waitForEnd(process, call.timeLimit);
  return ProgramResult{WIFSIGNALED(status) ? -WTERMSIG(status) : WEXITSTATUS(status),
                       contentsOf(output), contentsOf(errors)};
}

}  // namespace accounts
