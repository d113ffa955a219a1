#include "tests/program/SmallDisk.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <fstream>
#include <utility>

#include "tests/program/RunProgram.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr const char* kMemoryOptions = "size=512k,nr_inodes=64";
constexpr const char* kImageSize = "2M";
constexpr const char* kFilling = "filling";

// In a view of the mounts that is this process's own: what it mounts ends with it at the latest.
bool hasMountsOfItsOwn() {
  return unshare(CLONE_NEWNS) == 0 &&
         mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
}

std::optional<std::string> mountMemory(const fs::path& directory) {
  if (mount("none", directory.c_str(), "tmpfs", 0, kMemoryOptions) == 0) {
    return {};
  }
  return "This system lets the test mount no file system.";
}

std::optional<std::string> mountExt4(const fs::path& image, const fs::path& directory) {
  const ProgramCall steps[] = {
      {.program = "truncate", .arguments = {"--size", kImageSize, image}},
      {.program = "mkfs.ext4",
       .arguments = {"-q", "-F", "-b", "4096", "-m", "0", "-N", "64", "-O", "^has_journal", image}},
      {.program = "mount", .arguments = {"-o", "loop", image, directory}},
  };
  for (const ProgramCall& step : steps) {
    const ProgramResult result = runProgram(step);
    if (result.exitStatus != 0) {
      return "This system lets the test mount no ext4: " + step.program + " says " + result.errors;
    }
  }
  return {};
}

struct statvfs statusOf(const fs::path& directory) {
  struct statvfs status {};
  EXPECT_EQ(statvfs(directory.c_str(), &status), 0);
  return status;
}

}  // namespace

SmallDisk::SmallDisk(Kind kind, fs::path directory) : directory_(std::move(directory)) {
  if (!hasMountsOfItsOwn()) {
    reason_ = "This system lets the test mount no file systems.";
    return;
  }
  if (kind == Kind::Memory) {
    reason_ = mountMemory(directory_);
    return;
  }
  image_ = fs::temp_directory_path() / ("small-disk-" + std::to_string(getpid()));
  reason_ = mountExt4(image_, directory_);
}

SmallDisk::~SmallDisk() {
  if (!reason_) {
    umount2(directory_.c_str(), MNT_DETACH);
  }
  std::error_code error;
  if (!image_.empty()) {
    fs::remove(image_, error);
  }
}

void SmallDisk::leaveBlocks(std::uint64_t count) const {
  makeRoom();
  const int file =
      open((directory_ / kFilling).c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, S_IRUSR | S_IWUSR);
  const struct statvfs status = statusOf(directory_);
  const auto blockSize = static_cast<off_t>(status.f_frsize);
  ASSERT_GT(status.f_bavail, count);
  off_t size = static_cast<off_t>(status.f_bavail - count) * blockSize;
  EXPECT_EQ(posix_fallocate(file, 0, size), 0);
  // A file of many pieces takes blocks to list them as well.
  while (statusOf(directory_).f_bavail < count && size > 0) {
    size -= blockSize;
    EXPECT_EQ(ftruncate(file, size), 0);
  }
  close(file);
  EXPECT_EQ(statusOf(directory_).f_bavail, count);
}

void SmallDisk::leaveInodes(std::uint64_t count) const {
  makeRoom();
  fs::create_directory(directory_ / kFilling);
  while (statusOf(directory_).f_favail > count) {
    std::ofstream file(directory_ / kFilling / std::to_string(statusOf(directory_).f_favail));
    ASSERT_TRUE(file.good());
  }
  EXPECT_EQ(statusOf(directory_).f_favail, count);
}

void SmallDisk::makeRoom() const {
  fs::remove_all(directory_ / kFilling);
}

}  // namespace accounts
