#include <algorithm>

#include "tests/fakes/FakeFileSystem.h"

// What FakeFileSystem does with names and directories.

namespace accounts {

namespace {

// The file name in a path of a directory's entry; none when the path is not directly in it.
std::optional<std::string> nameIn(std::string_view directory, std::string_view path) {
  const std::string beginning = directory == "/" ? std::string("/") : std::string(directory) + "/";
  const bool isInside = path.starts_with(beginning) && path.size() > beginning.size();
  const std::string_view name = isInside ? path.substr(beginning.size()) : std::string_view();
  return name.empty() || name.find('/') != name.npos ? std::nullopt
                                                     : std::optional(std::string(name));
}

Result failure(std::string_view path, std::string_view reason) {
  return Result::failure(std::string(path).append(": ").append(reason));
}

}  // namespace

EntryKind FakeFileSystem::kindOf(std::string_view path) const {
  if (otherEntries.contains(path)) {
    return EntryKind::Other;
  }
  if (directories.contains(path)) {
    return EntryKind::Directory;
  }
  return files.contains(path) ? EntryKind::RegularFile : EntryKind::Nothing;
}

std::vector<std::string> FakeFileSystem::namesIn(std::string_view path) const {
  std::vector<std::string> names;
  const auto add = [&](const std::string& entry) {
    if (const auto name = nameIn(path, entry)) {
      names.push_back(*name);
    }
  };
  std::ranges::for_each(otherEntries, add);
  for (const auto& [directory, permissions] : directories) {
    add(directory);
  }
  for (const auto& [file, contents] : files) {
    add(file);
  }
  std::ranges::sort(names);
  return names;
}

std::optional<EntryKind> FakeFileSystem::kindOfEntry(std::string_view path) {
  std::optional<EntryKind> kind;
  (void)perform("kindOfEntry " + std::string(path), [&] {
    kind = kindOf(path);
    return Result::success();
  });
  return kind;
}

std::optional<std::vector<std::string>> FakeFileSystem::directoryEntries(std::string_view path) {
  std::optional<std::vector<std::string>> names;
  (void)perform("directoryEntries " + std::string(path), [&] {
    if (!directories.contains(path)) {
      return failure(path, "No such directory");
    }
    names = namesIn(path);
    return Result::success();
  });
  return names;
}

bool FakeFileSystem::haveSameContents(std::string_view first, std::string_view second) {
  const std::string line = "haveSameContents " + std::string(first) + " and " + std::string(second);
  return static_cast<bool>(perform(line, [&] {
    const auto contents = contentsOf(first);
    return contents && contents == contentsOf(second) ? Result::success()
                                                      : failure(first, "Other contents");
  }));
}

Result FakeFileSystem::linkFile(std::string_view source, std::string_view destination) {
  return perform("link " + std::string(source) + " -> " + std::string(destination), [&] {
    if (kindOf(source) != EntryKind::RegularFile) {
      return failure(source, "No such file");
    }
    if (kindOf(destination) != EntryKind::Nothing) {
      return failure(destination, "File exists");
    }
    if (!parentExists(destination)) {
      return failure(destination, "No such directory");
    }
    const FakeFile file = files.find(source)->second;
    files.emplace(destination, file);
    return Result::success();
  });
}

Result FakeFileSystem::removeDirectory(std::string_view path) {
  return perform("removeDirectory " + std::string(path), [&] {
    const auto directory = directories.find(path);
    if (directory == directories.end()) {
      return failure(path, "No such directory");
    }
    if (!namesIn(path).empty()) {
      return failure(path, "Directory not empty");
    }
    directories.erase(directory);
    return Result::success();
  });
}

Result FakeFileSystem::renameDirectory(std::string_view source, std::string_view destination) {
  return perform("renameDirectory " + std::string(source) + " -> " + std::string(destination), [&] {
    if (!directories.contains(source) || !parentExists(destination)) {
      return failure(source, "No such directory");
    }
    if (kindOf(destination) != EntryKind::Nothing) {
      return failure(destination, "File exists");
    }
    const auto moveIn = [&](auto& entries) {
      const std::string beginning = std::string(source) + "/";
      for (auto entry = entries.lower_bound(beginning);
           entry != entries.end() && entry->first.starts_with(beginning);) {
        auto moved = entries.extract(entry++);
        moved.key() = std::string(destination) + moved.key().substr(source.size());
        entries.insert(std::move(moved));
      }
    };
    moveIn(files);
    moveIn(directories);
    auto renamed = directories.extract(directories.find(source));
    renamed.key() = destination;
    directories.insert(std::move(renamed));
    return Result::success();
  });
}

Result FakeFileSystem::synchronizeDirectory(std::string_view path) {
  return perform("synchronizeDirectory " + std::string(path), [&] {
    return directories.contains(path) ? Result::success() : failure(path, "No such directory");
  });
}

void FakeFileSystem::removeAbandonedTemporaryFiles(
    const std::vector<std::string>& /*furtherDirectories*/) {
  (void)perform("removeAbandonedTemporaryFiles", [&] {
    for (const std::string& path : temporaryFiles()) {
      if (!ownTemporaryFiles_.contains(path)) {
        files.erase(path);
      }
    }
    return Result::success();
  });
}

}  // namespace accounts
