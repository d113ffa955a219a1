#pragma once

#include <pthread.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <fstream>
#include <functional>
#include <string>
#include <thread>
#include <utility>

namespace accounts {

/// A thread that runs something which waits in the kernel, and that a signal can interrupt there.
class WaitingThread {
 public:
  explicit WaitingThread(std::function<void()> run) {
    struct sigaction interrupting = {};
    interrupting.sa_handler = [](int) { ++signalsReceived(); };
    ::sigaction(SIGUSR1, &interrupting, &before_);
    thread_ = std::thread([this, run = std::move(run)] {
      identifier_ = ::gettid();
      run();
      hasEnded_ = true;
    });
  }
  ~WaitingThread() {
    join();
    ::sigaction(SIGUSR1, &before_, nullptr);
  }
  WaitingThread(const WaitingThread&) = delete;
  WaitingThread& operator=(const WaitingThread&) = delete;

  /// Sends a signal while the thread waits; returns when it has got the signal and waits again or
  /// has ended.
  void interrupt() {
    waitUntilItWaits();
    const int before = signalsReceived();
    ::pthread_kill(thread_.native_handle(), SIGUSR1);
    while (signalsReceived() == before) {
      std::this_thread::yield();
    }
    waitUntilItWaits();
  }

  [[nodiscard]] bool hasEnded() const { return hasEnded_; }

  void join() {
    if (thread_.joinable()) {
      thread_.join();
    }
  }

 private:
  static std::atomic<int>& signalsReceived() {
    static std::atomic<int> count = 0;
    return count;
  }

  void waitUntilItWaits() const {
    while (!hasEnded_ && (identifier_ == 0 || state() != 'S')) {
      std::this_thread::yield();
    }
  }

  // The state letter of the thread; 'S' while it waits in the kernel.
  [[nodiscard]] char state() const {
    std::ifstream file("/proc/self/task/" + std::to_string(identifier_) + "/stat");
    std::string line;
    std::getline(file, line);
    const std::size_t afterName = line.rfind(") ");
    return afterName == std::string::npos ? '?' : line[afterName + 2];
  }

  struct sigaction before_ = {};
  std::atomic<pid_t> identifier_ = 0;
  std::atomic<bool> hasEnded_ = false;
  std::thread thread_;
};

}  // namespace accounts
