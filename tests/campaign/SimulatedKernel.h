#pragma once

#include <sys/stat.h>
#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "tests/campaign/SimulatedDisk.h"

namespace accounts {

/// What goes wrong in a run.
struct Fault {
  enum class Duration : std::uint8_t {
    Once,
    FromThenOn,
    /// From then on, but only in the plug-in: as if its process had been killed there, while the
    /// host lives on.
    UntilThePluginEnds
  };
  /// The number of the system call that fails, counted from 0.
  std::size_t operation = 0;
  /// The error number; 0 stands for a short write: half of the bytes are written, and the next
  /// write finds the disk full.
  int error = 0;
  Duration duration = Duration::Once;
};

/// The system calls of the Linux platform over a simulated disk. While one of these is alive, the
/// program's own file operations (see SystemCalls.cpp) on kDeviceDirectory and beneath it arrive
/// here instead of at the real system. Only one may be alive at a time. The calls give what the
/// system's give, but for errors: those are negative error numbers.
///
/// Every call that could fail for want of a working disk is numbered. Closing is not, nor are
/// locking (the platform waits for a lock as long as it takes) and random numbers, which count up.
/// Reading a directory is one call.
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

  /// Ends a fault that lasts until the plug-in ends. Whether there was one and it has hit.
  bool endPlugin();

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

  int open(std::string_view hostPath);
  int openBeneath(int directory, std::string_view path, int flags);
  int openAt(int directory, std::string_view name, int flags, unsigned permissions);
  int status(int descriptor, struct stat& status);
  int statusAt(int directory, std::string_view name, struct stat& status);
  ssize_t read(int descriptor, char* bytes, std::size_t count);
  ssize_t write(int descriptor, std::string_view bytes);
  int synchronize(int descriptor);
  int truncate(int descriptor, std::size_t size);
  int setPermissions(int descriptor, unsigned permissions);
  int setOwner(int descriptor, unsigned owner, unsigned group);
  int rename(int directory, std::string_view name, int newDirectory, std::string_view newName);
  int unlink(int directory, std::string_view name, int flags);
  int link(int directory, std::string_view name, int newDirectory, std::string_view newName);
  /// The names in an open directory, "." and ".." included, through `names`.
  int readNames(int descriptor, std::vector<std::string>& names);
  /// `operation` as flock takes it. Waiting for a lock would never end here: that is refused.
  int lock(int descriptor, int operation);
  int setTimes(int descriptor);
  int makeDirectory(int directory, std::string_view name, unsigned permissions);
  void close(int descriptor);
  void random(char* bytes, std::size_t count);

 private:
  struct OpenFile {
    std::size_t inode = 0;
    std::string path = {};
    std::size_t offset = 0;
    bool isOpen = true;
    bool isLocked = false;
  };
  OpenFile& file(int descriptor) {
    return files_[static_cast<std::size_t>(descriptor - kFirstDescriptor)];
  }
  [[nodiscard]] std::string pathIn(int directory, std::string_view name);
  /// The inode of a name in an open directory; none when there is none.
  std::optional<std::size_t> entry(int directory, std::string_view name);
  int addDescriptor(std::size_t inode, std::string path);
  /// Numbers a call. 0 when it goes on, else the negative error number that it must give.
  int begin(std::string_view call, const std::string& path);
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
};

}  // namespace accounts
