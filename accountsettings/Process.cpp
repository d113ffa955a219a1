#include "accountsettings/Process.h"

#include <atomic>
#include <cstdlib>

#include "accountsettings/DeviceLocalAccount.h"

namespace accounts {

namespace {

// Everything that belongs to the process hangs from this; the plug-in's entry point owns the
// process that it makes, and there is no other mutable static.
std::atomic<Process*> newestProcess = nullptr;

}  // namespace

Process::Process(Platform& platformOfTheProcess)
    : platform(platformOfTheProcess), previous_(newestProcess) {
  newestProcess = this;
  DeviceLocalAccount::registerClass(platform.frameworkLoader.classes());
}

Process::~Process() {
  newestProcess = previous_;
}

Process& Process::current() {
  Process* process = newestProcess;
  if (process == nullptr) {
    // A programming error that no log can take: the console log is reached through the process.
    std::abort();
  }
  return *process;
}

}  // namespace accounts
