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

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>

#include "platform/FrameworkLoader.h"
#include "platform/MigrationPluginBase.h"
#include "platform/Platform.h"

// A plug-in that tries to do what a migration never does, chosen by the environment variable
// ATTEMPT. VICTIM names a file, VICTIM_PROCESS a process.

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

/// Writes the kind of each open descriptor, one a line.
bool showsDescriptors() {
  constexpr int kMostDescriptors = 1024;
  for (int number = 0; number < kMostDescriptors; ++number) {
    struct stat status = {};
    if (syscall(SYS_fstat, number, &status) == 0) {
      std::printf("descriptor of kind %o\n", status.st_mode & S_IFMT);
    }
  }
  return true;
}

bool showsUser() {
  std::printf("user %u, group %u\n", geteuid(), getegid());
  return true;
}

const std::map<std::string, bool (*)(Platform&)> attempts = {
    {"nothing", [](Platform&) { return true; }},
    {"open", [](Platform&) { return succeeds(open(victim().c_str(), O_RDONLY)); }},
    {"openat2",
     [](Platform&) {
       open_how how = {};
       how.flags = O_RDONLY;
       return succeeds(syscall(SYS_openat2, AT_FDCWD, victim().c_str(), &how, sizeof how));
     }},
    {"create",
     [](Platform&) {
       return succeeds(open((victim() + ".new").c_str(), O_WRONLY | O_CREAT, 0600));
     }},
    {"chmod",
     [](Platform&) { return succeeds(syscall(SYS_fchmodat, AT_FDCWD, victim().c_str(), 0777)); }},
    {"chown",
     [](Platform&) {
       return succeeds(syscall(SYS_fchownat, AT_FDCWD, victim().c_str(), 1, 1, 0));
     }},
    {"truncate", [](Platform&) { return succeeds(truncate(victim().c_str(), 0)); }},
    {"remove",
     [](Platform&) { return succeeds(syscall(SYS_unlinkat, AT_FDCWD, victim().c_str(), 0)); }},
    {"rename",
     [](Platform&) {
       return succeeds(syscall(SYS_renameat2, AT_FDCWD, victim().c_str(), AT_FDCWD,
                               (victim() + ".new").c_str(), 0));
     }},
    {"exec",
     [](Platform&) {
       return succeeds(execl("/bin/sh", "sh", "-c", "rm -f \"$VICTIM\"", nullptr));
     }},
    {"fork",
     [](Platform&) {
       const pid_t child = fork();
       if (child == 0) {
         unlink(victim().c_str());
         _exit(0);
       }
       return succeeds(child);
     }},
    {"clone3",
     [](Platform&) {
       clone_args arguments = {};
       return syscall(SYS_clone3, &arguments, sizeof arguments) < 0 && errno == ENOSYS;
     }},
    {"socket", [](Platform&) { return succeeds(socket(AF_UNIX, SOCK_DGRAM, 0)); }},
    {"ptrace",
     [](Platform&) { return succeeds(ptrace(PTRACE_ATTACH, victimProcess(), nullptr, nullptr)); }},
    {"signal", [](Platform&) { return succeeds(kill(victimProcess(), SIGKILL)); }},
    {"make code",
     [](Platform&) {
       return mmap(nullptr, 4096, PROT_READ | PROT_EXEC, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0) !=
              MAP_FAILED;
     }},
    {"handle forbidden calls", [](Platform&) { return signal(SIGSYS, SIG_IGN) != SIG_ERR; }},
    {"memory", [](Platform&) { return takesMemoryForever(); }},
    {"time", [](Platform&) { return runsForever(); }},
    {"framework",
     [](Platform& platform) {
       const Result loaded = platform.frameworkLoader.loadFramework("/framework.so");
       std::puts(loaded.error().c_str());
       return !loaded;
     }},
    {"show descriptors", [](Platform&) { return showsDescriptors(); }},
    {"show user", [](Platform&) { return showsUser(); }},
};

class EscapingPlugin : public MigrationPluginBase {
 public:
  explicit EscapingPlugin(Platform& platform) : platform_(platform) {}

  std::string dataClassName() override { return "escape"; }
  bool performMigration() override { return attempts.at(variable("ATTEMPT"))(platform_); }

 private:
  Platform& platform_;
};

}  // namespace
}  // namespace accounts

extern "C" accounts::MigrationPluginBase* CreateMigrationPlugin(accounts::Platform& platform) {
  return new accounts::EscapingPlugin(platform);
}
