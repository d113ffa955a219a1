#pragma once

#include <systemd/sd-bus.h>

#include <optional>
#include <string>

namespace accounts {

/// The functions of libsystemd that speak D-Bus. The library is loaded when they are first asked
/// for, so that a machine without it, or a program that does not speak D-Bus, does without.
struct SystemdLibrary {
  decltype(&sd_bus_new) busNew = nullptr;
  decltype(&sd_bus_set_address) setAddress = nullptr;
  decltype(&sd_bus_set_bus_client) setBusClient = nullptr;
  decltype(&sd_bus_start) start = nullptr;
  decltype(&sd_bus_emit_signal) emitSignal = nullptr;
  decltype(&sd_bus_process) process = nullptr;
  decltype(&sd_bus_wait) wait = nullptr;
  decltype(&sd_bus_is_ready) isReady = nullptr;
  decltype(&sd_bus_get_n_queued_write) queuedForWriting = nullptr;
  decltype(&sd_bus_close_unref) closeAndRelease = nullptr;

  /// Loads the library by its name or path. None, with the dynamic loader's words in `error`, when
  /// it or one of the functions is missing.
  static std::optional<SystemdLibrary> load(const std::string& name, std::string& error);
};

}  // namespace accounts
