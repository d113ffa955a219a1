#pragma once

#include <sys/stat.h>
#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <ctime>
#include <functional>
#include <limits>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tests/campaign/OtherProgram.h"
#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// What goes wrong in a run.
struct Fault {
  enum class Duration : std::uint8_t { Once, FromThenOn };
  /// The number of the system call that fails, counted from 0.
  std::size_t operation = 0;
  /// The error number; 0 stands for a short write: half of the bytes are written, and the next
  /// write finds the disk full.
  int error = 0;
  Duration duration = Duration::Once;
};

/// What a file system can do beyond what every one can.
struct FileSystemAbilities {
  bool exchangesNames = true;
  /// Whether it renames without replacing anything, when it is asked to.
  bool sparesNames = true;
  /// Whether it says what is immutable.
  bool hasFlags = true;
};

/// What another program does while a process runs.
struct Intrusion {
  /// It acts just before the numbered call, and before so many calls altogether, one after another.
  std::size_t operation = 0;
  std::size_t count = 1;
  std::function<void(OtherProgram&)> act;
};

/// A lock of a file or directory that another process has. `count` calls that ask for it are in
/// vain: those that would wait are interrupted. The last thing that it does with the lock is `act`.
struct OtherLock {
  std::string path;
  std::size_t count = 0;
  std::function<void(OtherProgram&)> act = [](OtherProgram&) {};
};

/// The system calls of the Linux platform over a simulated disk. While one of these is alive, the
/// program's own file operations (see SystemCalls.cpp) on kDeviceDirectory and beneath it arrive
/// here instead of at the real system. Only one may be alive at a time. The calls give what the
/// system's give, but for errors: those are negative error numbers.
///
/// Every call that could fail for want of a working disk is numbered. Closing is not, nor are
/// locking (the platform waits for a lock as long as it takes) and random numbers, which count up.
/// Reading a directory is one call. The process may do what it likes, as root may, but for what is
/// immutable.
class SimulatedKernel {
 public:
  /// The directory of the host that the device seems to be in.
  static constexpr std::string_view kDeviceDirectory = "/simulated-device";
  /// Descriptors from this one on are simulated.
  static constexpr int kFirstDescriptor = 1 << 20;

  /// `run` makes random names differ from those of other runs.
  SimulatedKernel(SimulatedDisk disk, unsigned run);
  SimulatedKernel(const SimulatedKernel&) = delete;
  SimulatedKernel& operator=(const SimulatedKernel&) = delete;
  ~SimulatedKernel();
  /// The one that is alive; null when there is none.
  static SimulatedKernel* current();

  enum class Recording : std::uint8_t { Off, On };
  /// Counts calls from 0 again, with a fault to come or none. Recording keeps every numbered call
  /// and every change from here on for calls() and changes().
  void start(const std::optional<Fault>& fault, Recording recording);

  [[nodiscard]] const SimulatedDisk& disk() const { return disk_; }
  [[nodiscard]] std::size_t operationCount() const { return operationCount_; }
  /// How many descriptors are open.
  [[nodiscard]] std::size_t openDescriptors() const;

  /// A numbered call, such as "renameat /a -> /b", and how many changes had been made before it.
  struct Call {
    std::string line;
    std::size_t changesBefore = 0;
  };
  [[nodiscard]] const std::vector<Call>& calls() const { return calls_; }
  [[nodiscard]] const std::vector<DiskChange>& changes() const { return changes_; }
  /// The paths of the calls that the fault made fail, in order.
  [[nodiscard]] const std::vector<std::string>& refusedPaths() const { return refusedPaths_; }

  /// Lets another program act. Its changes are recorded, too.
  void intrude(Intrusion intrusion) { intrusion_ = std::move(intrusion); }

  /// Another process has a lock.
  void lockByAnother(const OtherLock& lock) {
    otherLocks_.push_back({disk_.find(lock.path).value(), 0, lock});
  }
  /// A number of calls after which nobody gives a lock back. A process that asks that often would
  /// wait for ever: that throws.
  static constexpr std::size_t kNever = std::numeric_limits<std::size_t>::max();

  void setAbilities(const FileSystemAbilities& abilities) { abilities_ = abilities; }

  // Opening and closing.
  int open(std::string_view hostPath, int flags);
  int openBeneath(std::string_view path, int flags);
  int openAt(int directory, std::string_view name, int flags, unsigned permissions);
  int close(int descriptor);

  // What is open.
  int status(int descriptor, struct stat& status);
  ssize_t read(int descriptor, char* bytes, std::size_t count);
  ssize_t readAt(int descriptor, char* bytes, std::size_t count, std::size_t offset);
  ssize_t write(int descriptor, std::string_view bytes);
  ssize_t writeAt(int descriptor, std::string_view bytes, std::size_t offset);
  int synchronize(std::string_view call, int descriptor);
  int truncate(int descriptor, std::size_t size);
  int setPermissions(int descriptor, unsigned permissions);
  int setOwner(int descriptor, unsigned owner, unsigned group);
  /// `times` as futimens takes them. The time of the last access is not kept.
  int setTimes(int descriptor, const timespec* times);
  /// What FS_IOC_GETFLAGS gives.
  int flags(int descriptor, int& flags);
  int readNames(int descriptor, std::vector<std::string>& names);
  /// `operation` as flock takes it. The process would wait for ever for a lock of its own: that is
  /// refused.
  int lock(int descriptor, int operation);

  // Names in open directories. `flags` as the calls take them.
  int statusAt(int directory, std::string_view name, struct stat& status, int flags);
  int access(int directory, std::string_view name, int mode, int flags);
  int rename(int directory, std::string_view name, int newDirectory, std::string_view newName,
             unsigned flags);
  int unlink(int directory, std::string_view name, int flags);
  int link(int directory, std::string_view name, int newDirectory, std::string_view newName,
           int flags);
  int makeDirectory(int directory, std::string_view name, unsigned permissions);

  void random(char* bytes, std::size_t count);

 private:
  struct OpenFile {
    std::size_t inode = 0;
    std::string path = {};
    /// As it was opened with.
    int flags = 0;
    std::size_t offset = 0;
    bool isOpen = true;
    bool isLocked = false;
  };
  OpenFile& file(int descriptor) {
    return files_[static_cast<std::size_t>(descriptor - kFirstDescriptor)];
  }
  [[nodiscard]] std::string pathIn(int directory, std::string_view name);
  int addDescriptor(std::size_t inode, std::string path, int flags);
  int openInode(std::size_t number, const std::string& path, int flags);
  /// A name in a directory, or the directory itself, and what is there.
  struct Place {
    std::size_t directory = 0;
    std::string name = {};
    std::optional<std::size_t> inode = {};
  };
  Place place(int directory, std::string_view name);
  /// 0 when a name may be given, taken or replaced, else the negative error number.
  [[nodiscard]] int mayChange(const Place& place) const;
  int exchange(const Place& one, const Place& other);
  ssize_t read(std::string_view call, int descriptor, char* bytes, std::size_t count,
               std::size_t offset);
  ssize_t write(std::string_view call, int descriptor, std::string_view bytes, std::size_t offset);
  [[nodiscard]] struct stat statusOf(std::size_t number) const;
  /// Numbers a call. 0 when it goes on, else the negative error number that it must give.
  int begin(std::string_view call, const std::string& path);
  /// The same for a call on an open file, which one that was opened for its path alone refuses.
  int beginOn(std::string_view call, int descriptor);
  /// The same for a call that changes an open file.
  int beginToChange(std::string_view call, int descriptor);
  void change(DiskChange change);
  std::size_t allocate(bool isDirectory, unsigned permissions);

  SimulatedDisk disk_;
  std::vector<OpenFile> files_;
  std::optional<Fault> fault_;
  /// After a short write.
  bool isDiskFull_ = false;
  bool isRecording_ = false;
  std::size_t operationCount_ = 0;
  std::vector<Call> calls_;
  std::vector<DiskChange> changes_;
  std::vector<std::string> refusedPaths_;
  std::uint64_t randomNumber_;
  FileSystemAbilities abilities_;
  OtherProgram otherProgram_;
  std::optional<Intrusion> intrusion_;
  struct HeldLock {
    std::size_t inode = 0;
    std::size_t asked = 0;
    OtherLock lock;
  };
  std::vector<HeldLock> otherLocks_;
};

}  // namespace accounts
