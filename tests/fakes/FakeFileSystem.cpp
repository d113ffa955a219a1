#include "tests/fakes/FakeFileSystem.h"

#include <algorithm>

namespace accounts {

namespace {

constexpr std::string_view kTemporaryNameBeginning = "temporary-";

std::string parentOf(std::string_view path) {
  const std::size_t separator = path.rfind('/');
  return separator == 0 || separator == path.npos ? "/" : std::string(path.substr(0, separator));
}

Result noSuchFile(std::string_view path) {
  return Failure{.text = std::string(path) + ": No such file or directory"};
}

std::string words(std::string_view verb, std::string_view path) {
  return std::string(verb) + " " + std::string(path);
}

std::string words(std::string_view verb, std::string_view source, std::string_view destination) {
  return words(verb, source) + " -> " + std::string(destination);
}

}  // namespace

void FakeFileSystem::addDirectory(std::string_view path) {
  if (directories.emplace(path, 0755).second) {
    addDirectory(parentOf(path));
  }
}

void FakeFileSystem::addFile(std::string_view path, std::string_view contents) {
  addDirectory(parentOf(path));
  files[std::string(path)].contents = contents;
}

std::optional<std::string> FakeFileSystem::contentsOf(std::string_view path) const {
  const auto file = files.find(path);
  return file != files.end() ? std::optional(file->second.contents) : std::nullopt;
}

std::vector<std::string> FakeFileSystem::temporaryFiles() const {
  std::vector<std::string> result;
  for (const auto& [path, file] : files) {
    if (path.find(kTemporaryNameBeginning) != path.npos) {
      result.push_back(path);
    }
  }
  return result;
}

void FakeFileSystem::removeFaults() {
  failingBeginnings_.clear();
  failAt_.reset();
  failFrom_.reset();
  stopBefore_.reset();
  stopAfter_.reset();
}

void FakeFileSystem::stopWorld() {
  throw WorldStopped();
}

Result FakeFileSystem::perform(const std::string& line, const std::function<Result()>& operation) {
  const std::size_t number = operationCount_++;
  if (number == stopBefore_) {
    stopWorld();
  }
  journal_.push_back(line);
  const bool isFailing =
      number == failAt_ || (failFrom_ && number >= *failFrom_) ||
      std::any_of(failingBeginnings_.begin(), failingBeginnings_.end(),
                  [&](const std::string& beginning) { return line.starts_with(beginning); });
  Result result = isFailing ? Failure{.text = line + ": Input/output error"} : operation();
  if (number == stopAfter_) {
    stopWorld();
  }
  return result;
}

bool FakeFileSystem::parentExists(std::string_view path) const {
  return directories.contains(parentOf(path));
}

Result FakeFileSystem::put(std::string_view path, std::string_view contents) {
  if (!parentExists(path)) {
    return noSuchFile(path);
  }
  if (directories.contains(path)) {
    return Failure{.text = std::string(path) + ": Is a directory"};
  }
  files[std::string(path)].contents = contents;
  return {};
}

std::optional<std::string> FakeFileSystem::read(std::string_view path) {
  std::optional<std::string> contents;
  const Result result = perform(words("read", path), [&]() -> Result {
    contents = contentsOf(path);
    return contents ? Result() : noSuchFile(path);
  });
  return result ? contents : std::nullopt;
}

bool FakeFileSystem::fileExists(std::string_view path) {
  return static_cast<bool>(perform(words("exists", path), [&]() -> Result {
    return files.contains(path) || directories.contains(path) ? Result() : noSuchFile(path);
  }));
}

bool FakeFileSystem::isDirectory(std::string_view path) {
  return static_cast<bool>(perform(words("isDirectory", path), [&]() -> Result {
    return directories.contains(path) ? Result() : noSuchFile(path);
  }));
}

Result FakeFileSystem::copyFile(std::string_view source, std::string_view destination) {
  return perform(words("copy", source, destination), [&]() -> Result {
    const auto file = files.find(source);
    if (file == files.end()) {
      return noSuchFile(source);
    }
    if (files.contains(destination) || directories.contains(destination)) {
      return Failure{.text = std::string(destination) + ": File exists"};
    }
    return put(destination, std::string(file->second.contents));
  });
}

Result FakeFileSystem::removeFile(std::string_view path) {
  return perform(words("remove", path), [&]() -> Result {
    if (directories.contains(path)) {
      return Failure{.text = std::string(path) + ": Is a directory"};
    }
    const auto file = files.find(path);
    if (file == files.end()) {
      return noSuchFile(path);
    }
    files.erase(file);
    return {};
  });
}

Result FakeFileSystem::createFile(std::string_view path, std::string_view contents) {
  return perform(words("create", path), [&] { return put(path, contents); });
}

Result FakeFileSystem::createDirectoryWithIntermediates(std::string_view path,
                                                        unsigned permissions) {
  return perform(words("createDirectory", path), [&]() -> Result {
    if (files.contains(path) || directories.contains(path)) {
      return Failure{.text = std::string(path) + ": File exists"};
    }
    addDirectory(path);
    directories[std::string(path)] = permissions;
    return {};
  });
}

std::optional<std::string> FakeFileSystem::makeTemporaryFile() {
  std::string path = temporaryDirectory + "/" + std::string(kTemporaryNameBeginning) +
                     std::to_string(temporaryFileCount_++);
  const Result result = perform("makeTemporary", [&]() -> Result {
    Result made = put(path, "");
    if (made) {
      files[path].permissions = 0600;
    }
    return made;
  });
  return result ? std::optional(path) : std::nullopt;
}

Result FakeFileSystem::writeFile(std::string_view path, const SerializedPropertyList& contents) {
  return perform(words("write", path), [&] { return put(path, bytesOf(contents)); });
}

Result FakeFileSystem::writeFileAtomically(std::string_view path,
                                           const SerializedPropertyList& contents) {
  return perform(words("writeAtomically", path), [&] { return put(path, bytesOf(contents)); });
}

Result FakeFileSystem::setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                                        std::string_view groupName) {
  return perform(words("setOwner", path), [&]() -> Result {
    const auto file = files.find(path);
    if (file == files.end()) {
      return noSuchFile(path);
    }
    if (!accountNames.contains(ownerName) || !accountNames.contains(groupName)) {
      return Failure{.text = std::string(path) + ": no such user or group"};
    }
    file->second.owner = ownerName;
    file->second.group = groupName;
    return {};
  });
}

Result FakeFileSystem::renameFile(std::string_view source, std::string_view destination) {
  return perform(words("rename", source, destination), [&]() -> Result {
    const auto file = files.find(source);
    if (file == files.end() || !parentExists(destination)) {
      return noSuchFile(source);
    }
    if (directories.contains(destination)) {
      return Failure{.text = std::string(destination) + ": Is a directory"};
    }
    FakeFile moved = std::move(file->second);
    files.erase(file);
    files.insert_or_assign(std::string(destination), std::move(moved));
    return {};
  });
}

EntryKind FakeFileSystem::kindOf(std::string_view path) const {
  if (otherEntries.contains(path)) {
    return EntryKind::Other;
  }
  if (directories.contains(path)) {
    return EntryKind::Directory;
  }
  return files.contains(path) ? EntryKind::RegularFile : EntryKind::Nothing;
}

}  // namespace accounts
