#include "platform/linux/SystemdLibrary.h"

#include <dlfcn.h>

namespace accounts {
namespace {

/// Looks a function up; whether it is there.
template <class Function>
bool find(void* library, const char* name, Function& function) {
  // dlsym() gives functions as object pointers; POSIX promises that this conversion works.
  function = reinterpret_cast<Function>(dlsym(library, name));
  return function != nullptr;
}

}  // namespace

std::optional<SystemdLibrary> SystemdLibrary::load(const std::string& name, std::string& error) {
  // Never closed: the process ends soon after.
  void* const library = dlopen(name.c_str(), RTLD_NOW | RTLD_LOCAL);
  SystemdLibrary found;
  if (library == nullptr || !find(library, "sd_bus_new", found.busNew) ||
      !find(library, "sd_bus_set_address", found.setAddress) ||
      !find(library, "sd_bus_set_bus_client", found.setBusClient) ||
      !find(library, "sd_bus_start", found.start) ||
      !find(library, "sd_bus_emit_signal", found.emitSignal) ||
      !find(library, "sd_bus_process", found.process) ||
      !find(library, "sd_bus_wait", found.wait) ||
      !find(library, "sd_bus_is_ready", found.isReady) ||
      !find(library, "sd_bus_get_n_queued_write", found.queuedForWriting) ||
      !find(library, "sd_bus_close_unref", found.closeAndRelease)) {
    error = dlerror();
    return std::nullopt;
  }
  return found;
}

}  // namespace accounts
