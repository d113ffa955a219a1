#include "platform/overlay/OverlayFileSystem.h"

#include <algorithm>
#include <set>
#include <utility>

namespace accounts {
namespace {

std::string_view parentOf(std::string_view path) {
  const std::size_t separator = path.rfind('/');
  return separator == 0 || separator == std::string_view::npos ? "/" : path.substr(0, separator);
}

Result failure(std::string_view operation, std::string_view path, std::string_view reason) {
  std::string text = "Cannot ";
  return Result::failure(
      text.append(operation).append(" ").append(path).append(": ").append(reason));
}

constexpr std::string_view kNoSuchFile = "No such file or directory";
constexpr std::string_view kFileExists = "File exists";

}  // namespace

OverlayFileSystem::OverlayFileSystem(FileSystem& beneath, OwnershipRule& ownership,
                                     std::string temporaryDirectory)
    : beneath_(beneath),
      ownership_(ownership),
      temporaryDirectory_(std::move(temporaryDirectory)) {}

const OverlayFileSystem::Change* OverlayFileSystem::changeOf(std::string_view path) const {
  const auto found = changes_.find(path);
  return found != changes_.end() ? &found->second : nullptr;
}

OverlayFileSystem::Contents OverlayFileSystem::contentsOf(std::string_view path) const {
  const Change* const change = changeOf(path);
  if (change == nullptr) {
    return Beneath{std::string(path)};
  }
  if (const auto* beneath = std::get_if<Beneath>(change)) {
    return *beneath;
  }
  if (const auto* inMemory = std::get_if<InMemory>(change)) {
    return *inMemory;
  }
  return Missing{};
}

bool OverlayFileSystem::fileExists(std::string_view path) {
  const Change* const change = changeOf(path);
  return change != nullptr ? !std::holds_alternative<Removed>(*change) : beneath_.fileExists(path);
}

bool OverlayFileSystem::isDirectory(std::string_view path) {
  const Change* const change = changeOf(path);
  return change != nullptr ? std::holds_alternative<Directory>(*change)
                           : beneath_.isDirectory(path);
}

std::optional<EntryKind> OverlayFileSystem::kindOfEntry(std::string_view path) {
  const Change* const change = changeOf(path);
  if (change == nullptr) {
    return beneath_.kindOfEntry(path);
  }
  if (std::holds_alternative<Removed>(*change)) {
    return EntryKind::Nothing;
  }
  return std::holds_alternative<Directory>(*change) ? EntryKind::Directory : EntryKind::RegularFile;
}

std::optional<std::vector<std::string>> OverlayFileSystem::directoryEntries(std::string_view path) {
  if (!isDirectory(path)) {
    return std::nullopt;
  }
  std::set<std::string> names;
  if (changeOf(path) == nullptr) {
    std::optional<std::vector<std::string>> beneath = beneath_.directoryEntries(path);
    if (!beneath) {
      return std::nullopt;
    }
    names.insert(beneath->begin(), beneath->end());
  }
  for (const auto& [changed, change] : changes_) {
    if (parentOf(changed) == path) {
      const std::string name = changed.substr(changed.rfind('/') + 1);
      if (std::holds_alternative<Removed>(change)) {
        names.erase(name);
      } else {
        names.insert(name);
      }
    }
  }
  return std::vector<std::string>(names.begin(), names.end());
}

bool OverlayFileSystem::haveSameContents(std::string_view first, std::string_view second) {
  const Contents left = contentsOf(first);
  const Contents right = contentsOf(second);
  const auto* leftBeneath = std::get_if<Beneath>(&left);
  const auto* rightBeneath = std::get_if<Beneath>(&right);
  if (leftBeneath != nullptr && rightBeneath != nullptr) {
    return beneath_.haveSameContents(leftBeneath->path, rightBeneath->path);
  }
  const auto* leftBytes = std::get_if<InMemory>(&left);
  const auto* rightBytes = std::get_if<InMemory>(&right);
  return leftBytes != nullptr && rightBytes != nullptr && *leftBytes->bytes == *rightBytes->bytes;
}

Result OverlayFileSystem::put(std::string_view operation, std::string_view path, Change change) {
  if (!isDirectory(parentOf(path))) {
    return failure(operation, path, kNoSuchFile);
  }
  if (isDirectory(path)) {
    return failure(operation, path, "Is a directory");
  }
  changes_.insert_or_assign(std::string(path), std::move(change));
  return Result::success();
}

Result OverlayFileSystem::copyFile(std::string_view source, std::string_view destination) {
  if (!fileExists(source) || isDirectory(source)) {
    return failure("open", source, kNoSuchFile);
  }
  if (kindOfEntry(destination) != EntryKind::Nothing) {
    return failure("copy to", destination, kFileExists);
  }
  const Contents contents = contentsOf(source);
  const auto* inMemory = std::get_if<InMemory>(&contents);
  return put("copy to", destination,
             inMemory != nullptr ? Change(*inMemory) : Change(std::get<Beneath>(contents)));
}

Result OverlayFileSystem::linkFile(std::string_view source, std::string_view destination) {
  return copyFile(source, destination);
}

Result OverlayFileSystem::removeFile(std::string_view path) {
  const std::optional<EntryKind> kind = kindOfEntry(path);
  if (!kind || *kind == EntryKind::Nothing) {
    return failure("remove", path, kNoSuchFile);
  }
  return put("remove", path, Removed{});
}

Result OverlayFileSystem::createFile(std::string_view path, std::string_view contents) {
  return put("create", path, InMemory{std::make_shared<const std::string>(contents)});
}

Result OverlayFileSystem::createDirectoryWithIntermediates(std::string_view path,
                                                           unsigned /*permissions*/) {
  if (fileExists(path)) {
    return failure("create the directory", path, kFileExists);
  }
  for (std::string_view missing = path; !isDirectory(missing); missing = parentOf(missing)) {
    if (fileExists(missing)) {
      return failure("create the directory", path, "Not a directory");
    }
    changes_.insert_or_assign(std::string(missing), Directory{});
  }
  return Result::success();
}

Result OverlayFileSystem::removeDirectory(std::string_view path) {
  const auto entries = directoryEntries(path);
  if (!entries || !entries->empty()) {
    return failure("remove the directory", path, entries ? "Directory not empty" : kNoSuchFile);
  }
  changes_.insert_or_assign(std::string(path), Removed{});
  return Result::success();
}

Result OverlayFileSystem::renameDirectory(std::string_view source,
                                          std::string_view /*destination*/) {
  return failure("rename the directory", source, "Operation not supported");
}

Result OverlayFileSystem::synchronizeDirectory(std::string_view path) {
  return isDirectory(path) ? Result::success() : failure("flush", path, kNoSuchFile);
}

std::optional<std::string> OverlayFileSystem::makeTemporaryFile() {
  // As on the device, the directory itself is made where it is missing, but not its parents.
  if (!fileExists(temporaryDirectory_) && isDirectory(parentOf(temporaryDirectory_))) {
    changes_.insert_or_assign(temporaryDirectory_, Directory{});
  }
  const std::string path =
      temporaryDirectory_ + "/overlay-" + std::to_string(++temporaryFileCount_);
  return createFile(path, "") ? std::optional(path) : std::nullopt;
}

void OverlayFileSystem::removeAbandonedTemporaryFiles(
    const std::vector<std::string>& /*furtherDirectories*/) {}

Result OverlayFileSystem::writeFile(std::string_view path, const SerializedPropertyList& contents) {
  return createFile(path, bytesOf(contents));
}

Result OverlayFileSystem::writeFileAtomically(std::string_view path,
                                              const SerializedPropertyList& contents) {
  return createFile(path, bytesOf(contents));
}

Result OverlayFileSystem::setOwnerAndGroup(std::string_view path, std::string_view ownerName,
                                           std::string_view groupName) {
  return fileExists(path) ? ownership_.canGive(ownerName, groupName)
                          : failure("set the owner of", path, kNoSuchFile);
}

Result OverlayFileSystem::renameFile(std::string_view source, std::string_view destination) {
  if (!fileExists(source) || isDirectory(source)) {
    return failure("open", source, kNoSuchFile);
  }
  const Contents contents = contentsOf(source);
  const auto* inMemory = std::get_if<InMemory>(&contents);
  Result moved = put("rename to", destination,
                     inMemory != nullptr ? Change(*inMemory) : Change(std::get<Beneath>(contents)));
  if (moved) {
    changes_.insert_or_assign(std::string(source), Removed{});
  }
  return moved;
}

}  // namespace accounts
