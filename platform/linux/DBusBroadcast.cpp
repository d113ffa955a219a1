#include "platform/linux/DBusBroadcast.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "platform/linux/SystemdLibrary.h"

namespace accounts {
namespace {

using Clock = std::chrono::steady_clock;

constexpr const char* kSystemBusVariable = "DBUS_SYSTEM_BUS_ADDRESS";
constexpr const char* kSystemBus = "unix:path=/run/dbus/system_bus_socket";

constexpr const char* kObject = "/com/quarx/accountsettings";
constexpr const char* kInterface = "com.quarx.accountsettings";
constexpr const char* kPreferencesChanged = "PreferencesChanged";
constexpr const char* kCloudTabsSwitched = "CloudTabsSwitched";

}  // namespace

struct DBusBroadcast::Signal {
  /// The state that cloud tabs were switched to; none for a changed preference, which has the
  /// others.
  std::optional<CloudTabs> cloudTabs;
  std::string application;
  std::string key;
};

/// One connection to a bus. The library's functions return a negative error number for failure.
class DBusBroadcast::Connection {
 public:
  Connection(const SystemdLibrary& library, const DBusOptions& options)
      : library_(library), deadline_(Clock::now() + options.timeLimit) {
    error_ = library_.busNew(&bus_);
    require(library_.setAddress, options.address.c_str());
    require(library_.setBusClient, 1);
    require(library_.start);
  }
  Connection(const Connection&) = delete;
  Connection& operator=(const Connection&) = delete;
  ~Connection() { library_.closeAndRelease(bus_); }

  /// Queues a signal.
  void emit(const Signal& signal) {
    if (signal.cloudTabs) {
      const int isOn = *signal.cloudTabs == CloudTabs::On ? 1 : 0;
      require(library_.emitSignal, kObject, kInterface, kCloudTabsSwitched, "b", isOn);
    } else {
      require(library_.emitSignal, kObject, kInterface, kPreferencesChanged, "ss",
              signal.application.c_str(), signal.key.c_str());
    }
  }

  /// Waits until the bus has everything that is queued. 0, or the error number of whatever failed
  /// since the connection was made.
  int flush() {
    while (error_ >= 0 && !isFlushed()) {
      const auto left =
          std::chrono::duration_cast<std::chrono::microseconds>(deadline_ - Clock::now());
      if (left.count() <= 0) {
        return ETIMEDOUT;
      }
      require(library_.process, nullptr);
      if (error_ == 0) {
        require(library_.wait, static_cast<std::uint64_t>(left.count()));
      }
    }
    return std::max(0, -error_);
  }

 private:
  /// Calls a function for the bus unless an earlier one failed.
  template <class Function, class... Arguments>
  void require(Function* function, Arguments... arguments) {
    if (error_ >= 0) {
      error_ = function(bus_, arguments...);
    }
  }

  /// Whether the bus has accepted the connection and everything that was queued is written.
  bool isFlushed() {
    if (const int ready = library_.isReady(bus_); ready <= 0) {
      error_ = std::min(error_, ready);
      return false;
    }
    std::uint64_t queued = 0;
    error_ = library_.queuedForWriting(bus_, &queued);
    return error_ >= 0 && queued == 0;
  }

  const SystemdLibrary& library_;
  const Clock::time_point deadline_;
  sd_bus* bus_ = nullptr;
  /// What the last call returned.
  int error_ = 0;
};

std::string systemBusAddress() {
  const char* const address = std::getenv(kSystemBusVariable);
  return address != nullptr ? address : kSystemBus;
}

DBusBroadcast::DBusBroadcast(DBusOptions options) : options_(std::move(options)) {}

DBusBroadcast::~DBusBroadcast() = default;

void DBusBroadcast::announceChange(std::string_view application, std::string_view key) {
  signals_.push_back({std::nullopt, std::string(application), std::string(key)});
}

void DBusBroadcast::announce(CloudTabs state) {
  signals_.push_back({state, "", ""});
}

Result DBusBroadcast::deliver() {
  const std::vector<Signal> signals = std::exchange(signals_, {});
  if (signals.empty()) {
    return {};
  }
  std::string missing;
  const std::optional<SystemdLibrary> library = SystemdLibrary::load(options_.library, missing);
  if (!library) {
    return Failure{.text = "Cannot load " + options_.library + ": " + missing};
  }
  Connection connection(*library, options_);
  for (const Signal& signal : signals) {
    connection.emit(signal);
  }
  const int error = connection.flush();
  return error == 0 ? Result()
                    : Failure{.text = "Cannot announce on the bus at " + options_.address + ": " +
                                      std::strerror(error)};
}

}  // namespace accounts
