#include "tests/program/FileCalls.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <sys/uio.h>

#include <climits>
#include <string>
#include <system_error>

namespace accounts {
namespace {

constexpr int kNone = -1;

/// Which arguments of a call name a file: a descriptor, a path (relative to the descriptor if there
/// is one) or both.
struct FileArguments {
  int descriptor = kNone;
  int path = kNone;
};

struct FileCall {
  long number;
  const char* name;
  FileArguments first;
  FileArguments second = {};
};

constexpr FileArguments kDescriptor = {0, kNone};
constexpr FileArguments kPath = {kNone, 0};
constexpr FileArguments kPathAtDescriptor = {0, 1};

constexpr FileCall kFileCalls[] = {
    {SYS_open, "open", kPath},
    {SYS_creat, "creat", kPath},
    {SYS_openat, "openat", kPathAtDescriptor},
    {SYS_openat2, "openat2", kPathAtDescriptor},
    {SYS_read, "read", kDescriptor},
    {SYS_readv, "readv", kDescriptor},
    {SYS_pread64, "pread64", kDescriptor},
    {SYS_getdents64, "getdents64", kDescriptor},
    {SYS_write, "write", kDescriptor},
    {SYS_writev, "writev", kDescriptor},
    {SYS_pwrite64, "pwrite64", kDescriptor},
    {SYS_copy_file_range, "copy_file_range", kDescriptor, {2, kNone}},
    {SYS_sendfile, "sendfile", kDescriptor, {1, kNone}},
    {SYS_ftruncate, "ftruncate", kDescriptor},
    {SYS_fallocate, "fallocate", kDescriptor},
    {SYS_truncate, "truncate", kPath},
    {SYS_fsync, "fsync", kDescriptor},
    {SYS_fdatasync, "fdatasync", kDescriptor},
    {SYS_syncfs, "syncfs", kDescriptor},
    {SYS_flock, "flock", kDescriptor},
    {SYS_fchmod, "fchmod", kDescriptor},
    {SYS_fchmodat, "fchmodat", kPathAtDescriptor},
    {SYS_chmod, "chmod", kPath},
    {SYS_fchown, "fchown", kDescriptor},
    {SYS_fchownat, "fchownat", kPathAtDescriptor},
    {SYS_chown, "chown", kPath},
    {SYS_utimensat, "utimensat", kPathAtDescriptor},
    {SYS_mkdir, "mkdir", kPath},
    {SYS_mkdirat, "mkdirat", kPathAtDescriptor},
    {SYS_rmdir, "rmdir", kPath},
    {SYS_unlink, "unlink", kPath},
    {SYS_unlinkat, "unlinkat", kPathAtDescriptor},
    {SYS_rename, "rename", kPath, {kNone, 1}},
    {SYS_renameat, "renameat", kPathAtDescriptor, {2, 3}},
    {SYS_renameat2, "renameat2", kPathAtDescriptor, {2, 3}},
    {SYS_link, "link", kPath, {kNone, 1}},
    {SYS_linkat, "linkat", kPathAtDescriptor, {2, 3}},
    {SYS_symlink, "symlink", {kNone, 1}},
    {SYS_symlinkat, "symlinkat", {1, 2}},
};

std::string pathOfDescriptor(pid_t process, int descriptor) {
  std::error_code error;
  return std::filesystem::read_symlink(
             "/proc/" + std::to_string(process) + "/fd/" + std::to_string(descriptor), error)
      .string();
}

std::string textAt(pid_t process, std::uint64_t address) {
  std::array<char, PATH_MAX> text{};
  iovec here = {text.data(), text.size() - 1};
  // Reads up to the first page that cannot be read.
  iovec there = {reinterpret_cast<void*>(address), text.size() - 1};
  process_vm_readv(process, &here, 1, &there, 1, 0);
  return text.data();
}

bool isBeneath(const std::filesystem::path& directory, const std::string& path) {
  const std::string beginning = directory.string();
  return path == beginning || path.starts_with(beginning + "/");
}

bool namesFileBeneath(const std::filesystem::path& directory, pid_t process,
                      const FileArguments& names, const std::array<std::uint64_t, 6>& arguments) {
  const auto argument = [&](int index) { return arguments[static_cast<std::size_t>(index)]; };
  const int descriptor =
      names.descriptor == kNone ? AT_FDCWD : static_cast<int>(argument(names.descriptor));
  if (descriptor != AT_FDCWD) {
    return isBeneath(directory, pathOfDescriptor(process, descriptor));
  }
  return names.path != kNone && isBeneath(directory, textAt(process, argument(names.path)));
}

}  // namespace

const char* fileCallBeneath(const std::filesystem::path& directory, pid_t process,
                            std::uint64_t number, const std::array<std::uint64_t, 6>& arguments) {
  for (const FileCall& call : kFileCalls) {
    if (static_cast<std::uint64_t>(call.number) == number) {
      const bool touches = namesFileBeneath(directory, process, call.first, arguments) ||
                           namesFileBeneath(directory, process, call.second, arguments);
      return touches ? call.name : nullptr;
    }
  }
  return nullptr;
}

}  // namespace accounts
