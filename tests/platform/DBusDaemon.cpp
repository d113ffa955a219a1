#include "tests/platform/DBusDaemon.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <fstream>

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr std::uint64_t kLongestWaitInMicroseconds = 30'000'000;
constexpr const char* kMatch = "type='signal',interface='com.quarx.accountsettings'";

std::string configuration(const std::string& address) {
  return "<busconfig><type>session</type><listen>" + address +
         "</listen><auth>EXTERNAL</auth><policy context='default'><allow send_destination='*'/>"
         "<allow send_type='signal'/><allow receive_type='signal'/><allow eavesdrop='true'/>"
         "<allow own='*'/></policy></busconfig>";
}

std::string textOf(sd_bus_message* message) {
  std::string text = std::string(sd_bus_message_get_path(message)) + " " +
                     sd_bus_message_get_interface(message) + "." +
                     sd_bus_message_get_member(message);
  for (const char* type = sd_bus_message_get_signature(message, 1); *type != '\0'; ++type) {
    if (*type == 's') {
      const char* argument = nullptr;
      sd_bus_message_read(message, "s", &argument);
      text += std::string(" ") + argument;
    } else {
      int argument = 0;
      sd_bus_message_read(message, "b", &argument);
      text += " " + std::to_string(argument);
    }
  }
  return text;
}

}  // namespace

DBusDaemon::DBusDaemon() {
  std::string path = (fs::temp_directory_path() / "bus-XXXXXX").string();
  EXPECT_NE(mkdtemp(path.data()), nullptr);
  directory_ = path;
  const std::string configurationFile = directory_ / "configuration";
  std::ofstream(configurationFile) << configuration(address());
  std::array<int, 2> pipe{};
  EXPECT_EQ(pipe2(pipe.data(), O_CLOEXEC), 0);
  process_ = fork();
  if (process_ == 0) {
    dup2(pipe[1], STDOUT_FILENO);
    execlp("dbus-daemon", "dbus-daemon", "--nofork", "--nopidfile", "--nosyslog",
           ("--config-file=" + configurationFile).c_str(), "--print-address=1", nullptr);
    _exit(127);
  }
  close(pipe[1]);
  // It prints its address once it listens.
  char first = '\0';
  EXPECT_EQ(::read(pipe[0], &first, 1), 1) << "no dbus-daemon";
  close(pipe[0]);
}

DBusDaemon::~DBusDaemon() {
  kill(process_, SIGKILL);
  waitpid(process_, nullptr, 0);
  std::error_code error;
  fs::remove_all(directory_, error);
}

std::string DBusDaemon::address() const {
  return "unix:path=" + (directory_ / "socket").string();
}

DBusListener::DBusListener(const std::string& address) {
  EXPECT_GE(sd_bus_new(&bus_), 0);
  EXPECT_GE(sd_bus_set_address(bus_, address.c_str()), 0);
  EXPECT_GE(sd_bus_set_bus_client(bus_, 1), 0);
  EXPECT_GE(sd_bus_start(bus_), 0);
  EXPECT_GE(sd_bus_add_match(bus_, nullptr, kMatch, nullptr, nullptr), 0);
}

DBusListener::~DBusListener() {
  sd_bus_close_unref(bus_);
}

std::string DBusListener::next() {
  while (true) {
    sd_bus_message* message = nullptr;
    const int processed = sd_bus_process(bus_, &message);
    const bool isSignal =
        message != nullptr &&
        sd_bus_message_is_signal(message, "com.quarx.accountsettings", nullptr) > 0;
    const std::string text = isSignal ? textOf(message) : "";
    sd_bus_message_unref(message);
    if (isSignal) {
      return text;
    }
    if (processed < 0 || (processed == 0 && sd_bus_wait(bus_, kLongestWaitInMicroseconds) <= 0)) {
      ADD_FAILURE() << "no signal came";
      return "";
    }
  }
}

}  // namespace accounts
