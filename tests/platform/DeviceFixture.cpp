#include "tests/platform/DeviceFixture.h"

#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr uid_t kUserWithoutRights = 65534;
constexpr uid_t kSuperuser = 0;

// What a fixture cannot prepare ends the test that needs it.
void require(bool prepared, std::string_view what) {
  if (!prepared) {
    throw std::runtime_error("Could not prepare " + std::string(what));
  }
}

// Gives the directories that a test took permissions from their usual ones back.
void makeRemovable(const fs::path& directory) {
  std::error_code ignored;
  fs::permissions(directory, fs::perms::owner_all, ignored);
  for (const auto& entry : fs::directory_iterator(directory, ignored)) {
    if (entry.symlink_status(ignored).type() == fs::file_type::directory) {
      makeRemovable(entry.path());
    }
  }
}

}  // namespace

DeviceFixture::DeviceFixture() {
  // What a test makes is for others to read, whoever runs it.
  ::umask(022);
  std::string name = (fs::temp_directory_path() / "platform-test-XXXXXX").string();
  require(::mkdtemp(name.data()) != nullptr, "a temporary directory");
  base_ = name;
  // Tests that give up their privileges still need to get here.
  fs::permissions(base_, fs::perms(0755));
  fs::create_directories(image());
  fs::create_directories(outside());
}

DeviceFixture::~DeviceFixture() {
  std::error_code ignored;
  makeRemovable(base_);
  fs::remove_all(base_, ignored);
}

fs::path DeviceFixture::onHost(std::string_view devicePath) const {
  return image() / fs::path(devicePath).relative_path();
}

void DeviceFixture::makeDirectory(std::string_view devicePath) const {
  fs::create_directories(onHost(devicePath));
}

void DeviceFixture::makeFile(std::string_view devicePath, std::string_view contents) const {
  fs::create_directories(onHost(devicePath).parent_path());
  makeHostFile(onHost(devicePath), contents);
}

void DeviceFixture::makeLink(std::string_view devicePath, const fs::path& target) const {
  fs::create_directories(onHost(devicePath).parent_path());
  fs::create_symlink(target, onHost(devicePath));
}

void DeviceFixture::makeNamedPipe(std::string_view devicePath) const {
  fs::create_directories(onHost(devicePath).parent_path());
  require(::mkfifo(onHost(devicePath).c_str(), 0666) == 0, "a named pipe");
}

std::string DeviceFixture::contentsOf(std::string_view devicePath) const {
  return hostFileContents(onHost(devicePath));
}

struct stat DeviceFixture::statusOf(std::string_view devicePath) const {
  struct stat status = {};
  require(::lstat(onHost(devicePath).c_str(), &status) == 0, devicePath);
  return status;
}

unsigned DeviceFixture::permissionsOf(std::string_view devicePath) const {
  return statusOf(devicePath).st_mode & 07777;
}

std::vector<std::string> DeviceFixture::namesIn(std::string_view devicePath) const {
  std::vector<std::string> names;
  for (const auto& entry : fs::directory_iterator(onHost(devicePath))) {
    names.push_back(entry.path().filename().string());
  }
  std::ranges::sort(names);
  return names;
}

DeviceRoot DeviceFixture::openImage() const {
  auto root = DeviceRoot::openRoot(image().string());
  require(root.has_value(), failureOf(root).text);
  return std::move(*root);
}

std::string hostFileContents(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  require(file.good(), path.string());
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

void makeHostFile(const fs::path& path, std::string_view contents) {
  std::ofstream file(path, std::ios::binary);
  file.write(contents.data(), static_cast<std::streamsize>(contents.size()));
  file.close();
  require(file.good(), path.string());
}

std::string xmlPropertyList(std::string_view element) {
  return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">" +
         std::string(element) + "</plist>\n";
}

std::string xmlDictionary(std::string_view entries) {
  return xmlPropertyList("<dict>" + std::string(entries) + "</dict>");
}

WithoutPrivileges::WithoutPrivileges() : changed_(::geteuid() == kSuperuser) {
  if (changed_) {
    require(::setegid(kUserWithoutRights) == 0 && ::seteuid(kUserWithoutRights) == 0,
            "a user without rights");
  }
}

WithoutPrivileges::~WithoutPrivileges() {
  if (changed_ && (::seteuid(kSuperuser) != 0 || ::setegid(kSuperuser) != 0)) {
    std::abort();
  }
}

void makeSystemCallFail(long systemCall, int number) {
  sock_filter program[] = {
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, static_cast<std::uint32_t>(systemCall), 0, 1),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | static_cast<std::uint32_t>(number)),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
  };
  const sock_fprog filter = {std::size(program), program};
  require(::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 &&
              ::prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &filter) == 0,
          "a filter of system calls");
}

WithLargestWrittenFile::WithLargestWrittenFile(std::size_t size) {
  std::signal(SIGXFSZ, SIG_IGN);
  require(::getrlimit(RLIMIT_FSIZE, &previous_) == 0, "the old limit of file sizes");
  const struct rlimit limit = {size, previous_.rlim_max};
  require(::setrlimit(RLIMIT_FSIZE, &limit) == 0, "a limit of file sizes");
}

WithLargestWrittenFile::~WithLargestWrittenFile() {
  ::setrlimit(RLIMIT_FSIZE, &previous_);
  std::signal(SIGXFSZ, SIG_DFL);
}

}  // namespace accounts
