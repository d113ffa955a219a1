#include "tests/program/DeviceTree.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <fstream>
#include <iterator>
#include <regex>

namespace accounts {
namespace {

namespace fs = std::filesystem;

std::string contentsOf(const fs::path& path, mode_t mode) {
  if (S_ISLNK(mode)) {
    return fs::read_symlink(path).string();
  }
  if (!S_ISREG(mode)) {
    return "";
  }
  std::ifstream stream(path, std::ios::binary);
  EXPECT_TRUE(stream.good()) << path;
  return {std::istreambuf_iterator<char>(stream), {}};
}

}  // namespace

DeviceTree treeOf(const fs::path& root) {
  DeviceTree tree;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root)) {
    struct stat status = {};
    EXPECT_EQ(lstat(entry.path().c_str(), &status), 0) << entry.path();
    tree.emplace("/" + entry.path().lexically_relative(root).string(),
                 TreeEntry{status.st_mode, status.st_uid, status.st_gid,
                           contentsOf(entry.path(), status.st_mode)});
  }
  return tree;
}

std::string withoutTime(const std::string& text) {
  static const std::regex form("AccountMigrationInformation-[-0-9]+[.]txt");
  return text.find("AccountMigrationInformation-") == std::string::npos
             ? text
             : std::regex_replace(text, form, "AccountMigrationInformation-TIME.txt");
}

bool isEmptyDirectory(const DeviceTree& tree, const std::string& path) {
  const auto found = tree.find(path);
  if (found == tree.end() || !S_ISDIR(found->second.mode)) {
    return false;
  }
  const auto next = tree.upper_bound(path + "/");
  return next == tree.end() || !next->first.starts_with(path + "/");
}

}  // namespace accounts
