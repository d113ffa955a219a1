#include "platform/linux/BundleFiles.h"

#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <system_error>
#include <utility>

#include "platform/linux/FileContents.h"
#include "vocabulary/DevicePath.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

}  // namespace

std::string BundleFiles::pathOf(const std::string& name) const {
  return joinedPath(directory_, name);
}

Result BundleFiles::readAhead() {
  std::map<std::string, OrFailure<std::string>> found;
  std::error_code error;
  fs::recursive_directory_iterator entry(directory_, error);
  for (; !error && entry != fs::recursive_directory_iterator(); entry.increment(error)) {
    if (std::error_code unknown; entry->is_directory(unknown)) {
      continue;
    }
    std::string name = entry->path().lexically_relative(directory_).string();
    auto file = readHostFile(entry->path().string(), Pipes::Refuse);
    if (!file && file.error().kind() != FailureKind::Lasting) {
      return file.error();
    }
    found.emplace(std::move(name), std::move(file));
  }
  if (Failure{error.value(), {}}.kind() != FailureKind::Lasting) {
    return pathFailure("open", directory_, error.value());
  }
  found_ = std::move(found);
  return {};
}

bool BundleFiles::exists(const std::string& name) const {
  return found_ ? found_->contains(name) : ::access(pathOf(name).c_str(), F_OK) == 0;
}

OrFailure<std::string> BundleFiles::read(const std::string& name) const {
  if (!found_) {
    return readHostFile(pathOf(name), Pipes::Refuse);
  }
  const auto file = found_->find(name);
  return file != found_->end() ? file->second : pathFailure("open", pathOf(name), ENOENT);
}

}  // namespace accounts
