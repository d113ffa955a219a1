#pragma once

#include <sys/types.h>
#include <systemd/sd-bus.h>

#include <filesystem>
#include <string>

namespace accounts {

/// A message bus of the test's own, with a socket in a temporary directory; ended with this object.
class DBusDaemon {
 public:
  /// Starts the daemon and waits until it takes connections.
  DBusDaemon();
  ~DBusDaemon();
  DBusDaemon(const DBusDaemon&) = delete;
  DBusDaemon& operator=(const DBusDaemon&) = delete;

  [[nodiscard]] std::string address() const;

 private:
  std::filesystem::path directory_;
  pid_t process_ = -1;
};

/// A program on the bus that hears the signals of the account settings.
class DBusListener {
 public:
  explicit DBusListener(const std::string& address);
  ~DBusListener();
  DBusListener(const DBusListener&) = delete;
  DBusListener& operator=(const DBusListener&) = delete;

  /// The next signal: "OBJECT INTERFACE.NAME ARGUMENT...". Empty, and a failure of the test, when
  /// none comes.
  std::string next();

 private:
  sd_bus* bus_ = nullptr;
};

}  // namespace accounts
