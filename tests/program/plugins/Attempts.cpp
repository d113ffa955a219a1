#include "tests/program/plugins/Attempts.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <linux/sched.h>
#include <sys/mman.h>
#include <sys/ptrace.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/types.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>

namespace accounts {
namespace {

std::string variable(const char* name) {
  const char* const value = std::getenv(name);
  return value != nullptr ? value : "";
}

std::string victim() {
  return variable("VICTIM");
}

pid_t victimProcess() {
  return static_cast<pid_t>(std::atoi(variable("VICTIM_PROCESS").c_str()));
}

bool succeeds(long result) {
  return result >= 0;
}

bool runsForever() {
  for (volatile unsigned long step = 0;; step = step + 1) {
  }
}

bool takesMemoryForever() {
  constexpr std::size_t kBlock = std::size_t{1} << 24;
  for (std::size_t number = 0;; ++number) {
    auto* const block = new char[kBlock];
    block[number % kBlock] = 1;
  }
}

/// Without a buffer, for which the C library would have a look at standard output.
void print(const char* format, unsigned first, unsigned second = 0) {
  std::array<char, 64> line{};
  const int length = std::snprintf(line.data(), line.size(), format, first, second);
  static_cast<void>(!write(STDOUT_FILENO, line.data(), static_cast<std::size_t>(length)));
}

/// Writes the kind of each open descriptor, one a line.
bool showsDescriptors() {
  constexpr int kMostDescriptors = 1024;
  for (int number = 0; number < kMostDescriptors; ++number) {
    struct stat status = {};
    if (syscall(SYS_fstat, number, &status) == 0) {
      print("descriptor of kind %o\n", status.st_mode & S_IFMT);
    }
  }
  return true;
}

bool showsUser() {
  print("user %u, group %u\n", geteuid(), getegid());
  return true;
}

const std::map<std::string, bool (*)()> attempts = {
    {"nothing", [] { return true; }},
    {"open", [] { return succeeds(open(victim().c_str(), O_RDONLY)); }},
    {"openat2",
     [] {
       open_how how = {};
       how.flags = O_RDONLY;
       return succeeds(syscall(SYS_openat2, AT_FDCWD, victim().c_str(), &how, sizeof how));
     }},
    {"create",
     [] { return succeeds(open((victim() + ".new").c_str(), O_WRONLY | O_CREAT, 0600)); }},
    {"chmod", [] { return succeeds(syscall(SYS_fchmodat, AT_FDCWD, victim().c_str(), 0777)); }},
    {"chown", [] { return succeeds(syscall(SYS_fchownat, AT_FDCWD, victim().c_str(), 1, 1, 0)); }},
    {"truncate", [] { return succeeds(truncate(victim().c_str(), 0)); }},
    {"remove", [] { return succeeds(syscall(SYS_unlinkat, AT_FDCWD, victim().c_str(), 0)); }},
    {"rename",
     [] {
       return succeeds(syscall(SYS_renameat2, AT_FDCWD, victim().c_str(), AT_FDCWD,
                               (victim() + ".new").c_str(), 0));
     }},
    {"exec", [] { return succeeds(execl("/bin/sh", "sh", "-c", "rm -f \"$VICTIM\"", nullptr)); }},
    {"fork",
     [] {
       const pid_t child = fork();
       if (child == 0) {
         unlink(victim().c_str());
         _exit(0);
       }
       return succeeds(child);
     }},
    {"clone3",
     [] {
       clone_args arguments = {};
       return syscall(SYS_clone3, &arguments, sizeof arguments) < 0 && errno == ENOSYS;
     }},
    {"socket", [] { return succeeds(socket(AF_UNIX, SOCK_DGRAM, 0)); }},
    {"ptrace", [] { return succeeds(ptrace(PTRACE_ATTACH, victimProcess(), nullptr, nullptr)); }},
    {"signal", [] { return succeeds(kill(victimProcess(), SIGKILL)); }},
    {"make code",
     [] {
       return mmap(nullptr, 4096, PROT_READ | PROT_EXEC, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0) !=
              MAP_FAILED;
     }},
    {"handle forbidden calls", [] { return signal(SIGSYS, SIG_IGN) != SIG_ERR; }},
    {"memory", [] { return takesMemoryForever(); }},
    {"time", [] { return runsForever(); }},
    {"show descriptors", [] { return showsDescriptors(); }},
    {"show user", [] { return showsUser(); }},
};

}  // namespace

std::string chosenAttempt() {
  return variable("ATTEMPT");
}

bool makeAttempt() {
  return attempts.at(chosenAttempt())();
}

}  // namespace accounts
