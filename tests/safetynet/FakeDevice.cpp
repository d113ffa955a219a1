#include "tests/safetynet/FakeDevice.h"

#include <algorithm>

#include "propertylist/binary/BinaryPropertyList.h"

namespace accounts {
namespace {

class FakeStagedFile final : public StagedFile {
 public:
  explicit FakeStagedFile(std::shared_ptr<FakeDevice::Entry> staged) : entry(std::move(staged)) {
    identity = entry->identity;
  }
  std::shared_ptr<FakeDevice::Entry> entry;
};

std::string_view nameOf(DevicePlace place) {
  return listed(place).name;
}

std::string line(std::string_view verb, std::string_view what, std::string_view where = {}) {
  std::string text(verb);
  text.append(" ").append(what);
  return where.empty() ? text : text.append(" -> ").append(where);
}

bool isIn(std::string_view path, std::string_view directory) {
  return path.size() > directory.size() && path.starts_with(directory) &&
         path[directory.size()] == '/';
}

Result resultOf(const std::optional<Failure>& failure) {
  return failure ? Result(*failure) : Result();
}

}  // namespace

FakeDevice::FakeDevice() {
  for (const ListedPlace& each : kDevicePlaces) {
    if (each.place != DevicePlace::CommitRecord) {
      const std::string path = pathOf(each.place);
      for (std::size_t end = path.find('/', 1); end != path.npos; end = path.find('/', end + 1)) {
        write(path.substr(0, end), "", EntryKind::Directory);
      }
    }
  }
}

std::shared_ptr<FakeDevice::Entry> FakeDevice::make(EntryKind kind, std::string contents) {
  auto entry = std::make_shared<Entry>();
  const auto now = static_cast<std::int64_t>(++clock_);
  entry->identity.kind = kind;
  entry->identity.device = 1;
  entry->identity.inode = 1000 + clock_;
  entry->identity.size = contents.size();
  entry->identity.mode = 0600;
  entry->identity.modified = {now, 0};
  entry->identity.changed = {now, 0};
  entry->contents = std::move(contents);
  return entry;
}

void FakeDevice::write(std::string_view path, std::string contents, EntryKind kind) {
  entries[std::string(path)] = make(kind, std::move(contents));
}

void FakeDevice::writePropertyList(DevicePlace place, const PropertyValue& value) {
  write(place, writeBinaryPropertyList(value).value());
}

std::string FakeDevice::at(std::string_view path) const {
  const auto found = entries.find(path);
  return found != entries.end() ? found->second->contents : "(nothing)";
}

std::map<std::string, std::string> FakeDevice::contents() const {
  std::map<std::string, std::string> files;
  for (const auto& [path, entry] : entries) {
    if (entry->identity.kind != EntryKind::Directory) {
      files[path] = entry->contents;
    }
  }
  return files;
}

std::vector<std::string> FakeDevice::keptNames() const {
  std::vector<std::string> names;
  for (const auto& [path, entry] : entries) {
    if (isIn(path, kAccountMigrationDirectory)) {
      const std::string name = path.substr(kAccountMigrationDirectory.size() + 1);
      if (name.find('/') == name.npos) {
        names.push_back(name);
      }
    }
  }
  return names;
}

FakeDevice FakeDevice::copy() const {
  FakeDevice device;
  device.entries.clear();
  std::map<const Entry*, std::shared_ptr<Entry>> copies;
  for (const auto& [path, entry] : entries) {
    auto& one = copies[entry.get()];
    one = one != nullptr ? one : std::make_shared<Entry>(*entry);
    device.entries[path] = one;
  }
  device.clock_ = clock_;
  device.unremovable = unremovable;
  return device;
}

void FakeDevice::removeFaults() {
  failing_.clear();
  failAt_.reset();
  stopBefore_.reset();
}

std::optional<Failure> FakeDevice::begin(const std::string& text, Recorded recorded) {
  const std::size_t number = operationCount_++;
  if (number == stopBefore_) {
    throw WorldStopped();
  }
  if (before) {
    before(text);
  }
  if (recorded == Recorded::Yes) {
    journal.push_back(text);
  }
  for (const auto& [beginning, error] : failing_) {
    if (text.starts_with(beginning)) {
      return Failure{error, "Cannot " + text};
    }
  }
  return number == failAt_ ? std::optional(Failure{EIO, "Cannot " + text}) : std::nullopt;
}

FileIdentity FakeDevice::identityOf(std::string_view path) const {
  const auto found = entries.find(path);
  return found != entries.end() ? found->second->identity : FileIdentity();
}

OrFailure<DeviceSnapshot> FakeDevice::takeSnapshot() {
  if (auto failure = begin("takeSnapshot", Recorded::No)) {
    return *failure;
  }
  FakeSnapshot snapshot;
  for (const ListedPlace& each : kDevicePlaces) {
    const auto found = entries.find(pathOf(each.place));
    if (found == entries.end()) {
      continue;
    }
    if (found->second->identity.kind == EntryKind::RegularFile) {
      snapshot.addFile(each.place, found->second->contents);
    } else {
      snapshot.addEntry(each.place, found->second->identity.kind);
    }
    PlaceState& state = snapshot[each.place];
    state.identity = found->second->identity;
    if (const auto why = unremovable.find(each.place); why != unremovable.end()) {
      state.whyNotRemoved = why->second;
    }
  }
  return snapshot;
}

OrFailure<FileIdentity> FakeDevice::identityAt(DevicePlace place) {
  if (auto failure = begin(line("identityAt", nameOf(place)), Recorded::No)) {
    return *failure;
  }
  return identityOf(pathOf(place));
}

OrFailure<std::unique_ptr<StagedFile>> FakeDevice::stage(DevicePlace place, const NewFile& file) {
  if (auto failure = begin(line("stage", nameOf(place)))) {
    return *failure;
  }
  std::string bytes;
  const Result given = file.contents->giveTo([&](std::string_view piece) {
    bytes.append(piece);
    return true;
  });
  if (!given) {
    return given.error();
  }
  auto entry = make(EntryKind::RegularFile, std::move(bytes));
  entry->identity.mode = file.permissions;
  entry->owner = file.owner;
  return std::make_unique<FakeStagedFile>(std::move(entry));
}

OrFailure<std::unique_ptr<StagedFile>> FakeDevice::stageKept(DevicePlace place,
                                                             std::string_view keptPath) {
  if (auto failure = begin(line("stageKept", keptPath, nameOf(place)))) {
    return *failure;
  }
  const auto found = entries.find(keptPath);
  if (found == entries.end()) {
    return failureOf("open", keptPath, ENOENT);
  }
  return std::make_unique<FakeStagedFile>(found->second);
}

PlaceOutcome FakeDevice::put(DevicePlace place, StagedFile& staged, const FileIdentity& expected) {
  if (auto failure = begin(line("put", nameOf(place)))) {
    return PlaceOutcome::failed(*failure);
  }
  if (!identityOf(pathOf(place)).isSameFileAs(expected)) {
    return PlaceOutcome::disturbed();
  }
  if (overtakesPut == place) {
    write(place, "of another program");
    return PlaceOutcome::overtaken();
  }
  entries[pathOf(place)] = static_cast<FakeStagedFile&>(staged).entry;
  return PlaceOutcome::done();
}

PlaceOutcome FakeDevice::remove(DevicePlace place, const FileIdentity& expected) {
  if (auto failure = begin(line("remove", nameOf(place)))) {
    return PlaceOutcome::failed(*failure);
  }
  if (const auto why = unremovable.find(place); why != unremovable.end()) {
    return PlaceOutcome::failed(why->second);
  }
  if (!expected.exists() || !identityOf(pathOf(place)).isSameFileAs(expected)) {
    return PlaceOutcome::disturbed();
  }
  erase(place);
  return PlaceOutcome::done();
}

PlaceOutcome FakeDevice::keep(DevicePlace place, std::string_view keptPath,
                              const FileIdentity& expected) {
  if (auto failure = begin(line("keep", nameOf(place), keptPath))) {
    return PlaceOutcome::failed(*failure);
  }
  const auto found = entries.find(pathOf(place));
  if (found == entries.end() || !found->second->identity.isSameFileAs(expected)) {
    return PlaceOutcome::disturbed();
  }
  found->second->identity.changed.seconds = static_cast<std::int64_t>(++clock_);
  entries[std::string(keptPath)] = found->second;
  return PlaceOutcome::done();
}

Result FakeDevice::flush(DevicePlace place) {
  return resultOf(begin(line("flush", nameOf(place))));
}

Result FakeDevice::makeInformationDirectory() {
  if (auto failure = begin("makeInformationDirectory")) {
    return *failure;
  }
  write(pathOf(DevicePlace::InformationDirectory), "", EntryKind::Directory);
  return {};
}

Result FakeDevice::writeInformationFile(std::string_view name, const ReadableBytes& contents) {
  if (auto failure = begin(line("writeInformationFile", name))) {
    return *failure;
  }
  std::string bytes;
  static_cast<void>(contents.giveTo([&](std::string_view piece) {
    bytes.append(piece);
    return true;
  }));
  write(pathOf(DevicePlace::InformationDirectory), "", EntryKind::Directory);
  write(pathOf(DevicePlace::InformationDirectory) + "/" + std::string(name), bytes);
  return {};
}

std::vector<std::string> FakeDevice::settleLeftovers() {
  static_cast<void>(begin("settleLeftovers"));
  return leftovers;
}

OrFailure<EntryKind> FakeDevice::kindOfEntry(std::string_view path) {
  if (const auto failure = begin(line("kindOfEntry", path), Recorded::No)) {
    return *failure;
  }
  return identityOf(path).kind;
}

OrFailure<std::vector<std::string>> FakeDevice::directoryEntries(std::string_view path) {
  if (const auto failure = begin(line("directoryEntries", path), Recorded::No)) {
    return *failure;
  }
  if (!entries.contains(path)) {
    return failureOf("open", path, ENOENT);
  }
  std::vector<std::string> names;
  for (const auto& [other, entry] : entries) {
    if (isIn(other, path) && other.find('/', path.size() + 1) == other.npos) {
      names.push_back(other.substr(path.size() + 1));
    }
  }
  return names;
}

OrFailure<std::string> FakeDevice::shortContents(std::string_view path, std::size_t most) {
  if (const auto failure = begin(line("shortContents", path), Recorded::No)) {
    return *failure;
  }
  const auto found = entries.find(path);
  const bool isFile =
      found != entries.end() && found->second->identity.kind == EntryKind::RegularFile;
  if (!isFile || found->second->contents.size() > most) {
    return failureOf("read", path, isFile ? EFBIG : ENOENT);
  }
  return found->second->contents;
}

Result FakeDevice::createFile(std::string_view path, std::string_view contents) {
  const auto failure = begin(line("createFile", path));
  if (!failure) {
    write(path, std::string(contents));
  }
  return resultOf(failure);
}

Result FakeDevice::createDirectoryWithIntermediates(std::string_view path, unsigned permissions) {
  auto failure = begin(line("createDirectory", path));
  if (!failure && entries.contains(path)) {
    failure = failureOf("create the directory", path, EEXIST);
  }
  if (!failure) {
    write(path, "", EntryKind::Directory);
    entries.find(path)->second->identity.mode = permissions;
  }
  return resultOf(failure);
}

Result FakeDevice::removeFile(std::string_view path) {
  const auto failure = begin(line("removeFile", path));
  if (!failure) {
    entries.erase(std::string(path));
  }
  return resultOf(failure);
}

Result FakeDevice::removeDirectory(std::string_view path) {
  auto failure = begin(line("removeDirectory", path));
  const bool isFull =
      std::ranges::any_of(entries, [&](const auto& each) { return isIn(each.first, path); });
  if (!failure && isFull) {
    failure = failureOf("remove the directory", path, ENOTEMPTY);
  }
  if (!failure) {
    entries.erase(std::string(path));
  }
  return resultOf(failure);
}

Result FakeDevice::renameDirectory(std::string_view source, std::string_view destination) {
  auto failure = begin(line("renameDirectory", source, destination));
  if (!failure && !entries.contains(source)) {
    failure = failureOf("rename", source, ENOENT);
  }
  if (!failure) {
    std::map<std::string, std::shared_ptr<Entry>, std::less<>> moved;
    for (const auto& [path, entry] : entries) {
      const bool isMoved = path == source || isIn(path, source);
      moved[isMoved ? std::string(destination) + path.substr(source.size()) : path] = entry;
    }
    entries = std::move(moved);
  }
  return resultOf(failure);
}

Result FakeDevice::synchronizeDirectory(std::string_view path) {
  return resultOf(begin(line("synchronizeDirectory", path)));
}

}  // namespace accounts
