#include "tests/fleet/SlurmCluster.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/random.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <csignal>
#include <fstream>
#include <sstream>
#include <thread>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/RunProgram.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr auto kInterval = std::chrono::milliseconds(100);
constexpr int kAttempts = 600;
constexpr int kAttemptsBetweenStarts = 30;
constexpr std::size_t kKeySize = 128;

/// A port that nobody listens on, and none above it.
int freePort() {
  for (int attempt = 0; attempt < 100; ++attempt) {
    std::array<int, 2> sockets{};
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t length = sizeof address;
    auto* const generic = reinterpret_cast<sockaddr*>(&address);
    for (int& number : sockets) {
      number = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    }
    const bool isBound =
        bind(sockets[0], generic, length) == 0 && getsockname(sockets[0], generic, &length) == 0;
    const int port = ntohs(address.sin_port);
    address.sin_port = htons(static_cast<std::uint16_t>(port + 1));
    const bool isNextFree = isBound && bind(sockets[1], generic, length) == 0;
    close(sockets[0]);
    close(sockets[1]);
    if (isNextFree) {
      return port;
    }
  }
  return 0;
}

std::string textOf(const fs::path& path) {
  std::ostringstream text;
  text << std::ifstream(path).rdbuf();
  return text.str();
}

}  // namespace

bool comesTrue(const std::function<bool()>& condition) {
  for (int attempt = 0; attempt < kAttempts; ++attempt) {
    if (condition()) {
      return true;
    }
    std::this_thread::sleep_for(kInterval);
  }
  return false;
}

SlurmCluster::SlurmCluster(std::map<std::string, std::string> environment)
    : directory_(makeTemporaryDirectory(Medium::Disk, "slurm-")),
      environment_(std::move(environment)) {
  // Its socket has to be everybody's.
  fs::permissions(directory_, fs::perms(0755));
  environment_["SLURM_CONF"] = directory_ / "slurm.conf";
  // Daemons are not on everybody's search path.
  environment_["PATH"] += ":/usr/sbin:/sbin";
  reason_ = start();
}

SlurmCluster::~SlurmCluster() {
  if (!reason_) {
    (void)output("scancel", {"--user=" + std::to_string(getuid())});
    waitForEmptyQueue();
  }
  for (auto daemon = daemons_.rbegin(); daemon != daemons_.rend(); ++daemon) {
    kill(*daemon, SIGTERM);
    waitForEnd(*daemon, std::chrono::seconds(30));
  }
  std::error_code ignored;
  fs::remove_all(directory_, ignored);
}

bool SlurmCluster::waitForDaemon(const std::function<bool()>& condition) {
  bool hasEnded = false;
  const bool isThere = comesTrue([&] {
    hasEnded = waitpid(daemons_.back(), nullptr, WNOHANG) != 0;
    return hasEnded || condition();
  });
  if (hasEnded) {
    daemons_.pop_back();
  }
  return isThere && !hasEnded;
}

std::optional<std::string> SlurmCluster::start() {
  for (const char* program : {"munged", "slurmctld", "slurmd", "sbatch", "squeue", "scontrol"}) {
    const ProgramResult found =
        runProgram({.program = "/bin/sh",
                    .arguments = {"-c", "command -v " + std::string(program)},
                    .environment = environment_});
    if (found.exitStatus != 0) {
      return "The program " + std::string(program) + " is not installed.";
    }
  }
  for (const char* name : {"state", "spool", "log", "work"}) {
    fs::create_directories(directory_ / name);
  }
  writeConfiguration();
  const std::string place = directory_.string();
  startDaemon("munged", {"--foreground", "--socket=" + place + "/munge.socket",
                         "--key-file=" + place + "/key", "--pid-file=" + place + "/munged.pid",
                         "--log-file=" + place + "/log/munged", "--seed-file=" + place + "/seed"});
  if (!waitForDaemon([&] { return fs::exists(directory_ / "munge.socket"); })) {
    return "munged does not start: " + logs();
  }
  startDaemon("slurmctld", {"-D", "-c", "-f", place + "/slurm.conf"});
  if (!waitForDaemon(
          [&] { return output("scontrol", {"ping"}).find(" UP") != std::string::npos; })) {
    return "slurmctld does not start: " + logs();
  }
  startDaemon("slurmd", {"-D", "-N", "localhost", "-f", place + "/slurm.conf"});
  if (!waitForDaemon([&] { return output("sinfo", {"-h", "-o", "%T"}).starts_with("idle"); })) {
    return "slurmd does not start: " + logs();
  }
  return std::nullopt;
}

void SlurmCluster::writeConfiguration() const {
  std::array<char, kKeySize> key{};
  EXPECT_EQ(getrandom(key.data(), key.size(), 0), static_cast<ssize_t>(key.size()));
  const fs::path keyFile = directory_ / "key";
  std::ofstream(keyFile).flush();
  fs::permissions(keyFile, fs::perms::owner_read | fs::perms::owner_write);
  std::ofstream(keyFile, std::ios::binary).write(key.data(), key.size());

  const std::string place = directory_.string();
  const std::string user = std::to_string(getuid());
  const int port = freePort();
  std::ofstream(directory_ / "slurm.conf")
      << "ClusterName=one\n"
         "SlurmctldHost=localhost(127.0.0.1)\n"
         "SlurmUser=" +
             user + "\nSlurmdUser=" + user +
             "\n"
             "SlurmctldPort=" +
             std::to_string(port) + "\nSlurmdPort=" + std::to_string(port + 1) +
             "\n"
             "CommunicationParameters=NoCtldInAddrAny,NoInAddrAny\n"
             "AuthType=auth/munge\nCredType=cred/munge\nAuthInfo=socket=" +
             place +
             "/munge.socket\n"
             "StateSaveLocation=" +
             place + "/state\nSlurmdSpoolDir=" + place +
             "/spool\n"
             "SlurmctldPidFile=" +
             place + "/slurmctld.pid\nSlurmdPidFile=" + place +
             "/slurmd.pid\n"
             "SlurmctldLogFile=" +
             place + "/log/slurmctld\nSlurmdLogFile=" + place +
             "/log/slurmd\n"
             "ProctrackType=proctrack/linuxproc\nTaskPlugin=task/none\n"
             "SelectType=select/cons_tres\nSelectTypeParameters=CR_CPU_Memory\n"
             "SlurmdParameters=config_overrides\n"
             "SchedulerParameters=batch_sched_delay=0,sched_interval=1,sched_min_interval=0,bf_"
             "interval=1\n"
             "KillWait=5\nMailProg=/bin/true\n"
             "NodeName=localhost NodeAddr=127.0.0.1 CPUs=32 RealMemory=65536\n"
             "PartitionName=all Nodes=ALL Default=YES\n";
}

void SlurmCluster::startDaemon(const std::string& program,
                               const std::vector<std::string>& arguments) {
  const int log = open((directory_ / "log" / (program + ".output")).c_str(),
                       O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
  daemons_.push_back(startProgram(
      {.program = program, .arguments = arguments, .environment = environment_}, log, log));
  close(log);
}

std::string SlurmCluster::logs() const {
  std::string text;
  for (const auto& entry : fs::directory_iterator(directory_ / "log")) {
    const std::string log = textOf(entry.path());
    text += entry.path().filename().string() + ": " +
            log.substr(log.size() - std::min<std::size_t>(log.size(), 500)) + "\n";
  }
  return text;
}

std::string SlurmCluster::output(const std::string& command,
                                 const std::vector<std::string>& arguments) const {
  return runProgram({.program = command,
                     .arguments = arguments,
                     .environment = environment_,
                     .directory = workingDirectory().string()})
      .output;
}

std::string SlurmCluster::task(const std::string& task) const {
  return " " + output("scontrol", {"show", "job", "--oneliner", task});
}

void SlurmCluster::waitForTask(const std::string& task,
                               const std::vector<std::string>& words) const {
  std::string said;
  EXPECT_TRUE(comesTrue([&] {
    said = this->task(task);
    return std::all_of(words.begin(), words.end(), [&](const std::string& word) {
      return said.find(" " + word + " ") != std::string::npos;
    });
  })) << testing::PrintToString(words)
      << " is not said of " << task << ": " << said << logs();
}

void SlurmCluster::waitForEmptyQueue() const {
  std::string queue;
  EXPECT_TRUE(comesTrue([&] {
    const ProgramResult result =
        runProgram({.program = "squeue", .arguments = {"--noheader"}, .environment = environment_});
    queue = result.output + result.errors;
    return result.exitStatus == 0 && queue.empty();
  })) << queue
      << logs();
}

void SlurmCluster::completeNow(const std::string& task) const {
  std::string said;
  int attempt = 0;
  // A job that starts within the second in which it was ended counts as ended once more.
  std::this_thread::sleep_for(std::chrono::seconds(3));
  EXPECT_TRUE(comesTrue([&] {
    said = this->task(task);
    // Not each time: a start that was asked for anew begins to wait anew.
    if (attempt++ % kAttemptsBetweenStarts == 0 &&
        said.find(" JobState=PENDING ") != std::string::npos) {
      (void)output("scontrol", {"update", "jobid=" + task, "StartTime=now"});
    }
    return said.find(" JobState=COMPLETED ") != std::string::npos;
  })) << said
      << logs();
}

}  // namespace accounts
