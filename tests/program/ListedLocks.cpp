#include "tests/program/ListedLocks.h"

#include <sys/stat.h>

#include <fstream>
#include <string>

namespace accounts {
namespace {

struct Listed {
  std::size_t holders = 0;
  std::size_t waiters = 0;
};

Listed listedLocks(const std::filesystem::path& file) {
  Listed listed;
  struct stat status {};
  if (stat(file.c_str(), &status) != 0) {
    return listed;
  }
  const std::string inode = ":" + std::to_string(status.st_ino) + " ";
  std::ifstream locks("/proc/locks");
  for (std::string line; std::getline(locks, line);) {
    if (line.find(inode) != std::string::npos) {
      ++(line.find("->") != std::string::npos ? listed.waiters : listed.holders);
    }
  }
  return listed;
}

}  // namespace

bool isLockListed(const std::filesystem::path& file) {
  return listedLocks(file).holders > 0;
}

std::size_t listedLockWaiters(const std::filesystem::path& file) {
  return listedLocks(file).waiters;
}

}  // namespace accounts
