#include "tests/program/PlacesFixture.h"

#include <gmock/gmock.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <set>

#include "tests/program/HostileKind.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr uid_t kOrdinaryUser = 54321;

const TreeEntry* entryAt(const DeviceTree& tree, const std::string& path) {
  const auto found = tree.find(path);
  return found != tree.end() ? &found->second : nullptr;
}

/// "+", "-", "~" or "" for what became of an entry.
std::string changeOf(const DeviceTree& before, const DeviceTree& after, const std::string& path) {
  const TreeEntry* const was = entryAt(before, path);
  const TreeEntry* const is = entryAt(after, path);
  if (was == nullptr || is == nullptr) {
    return was == is ? "" : was == nullptr ? "+" : "-";
  }
  return *was == *is ? "" : "~";
}

/// Takes the paths that begin with a text out of a set; false when there are none.
bool takeAllBeneath(std::set<std::string>& paths, const std::string& beginning) {
  return std::erase_if(paths,
                       [&](const std::string& each) { return each.starts_with(beginning); }) > 0;
}

/// What a migration changes where nothing is in its way.
const std::vector<std::string> kAllChanges = {
    "~Settings(SEM)",    "-LegacyExchange",           "-LegacyExchangeOriginal",
    "-LegacyMail",       "-LegacyMailOriginal",       "+CopyAside",
    "-AutoFetchEnabled", "+InformationDirectory+File"};

std::vector<std::string> without(std::vector<std::string> texts,
                                 const std::vector<std::string>& taken) {
  std::erase_if(texts, [&](const std::string& each) {
    return std::ranges::find(taken, each) != taken.end();
  });
  return texts;
}

/// The lines of standard error that are not the host's own.
std::vector<std::string> logsOf(const ProgramResult& result) {
  std::vector<std::string> lines = result.errorLines();
  std::erase_if(lines,
                [](const std::string& line) { return line.starts_with("migration-host: "); });
  return lines;
}

std::string inOneLine(const std::vector<std::string>& texts) {
  std::string line;
  for (const std::string& each : texts) {
    line += (line.empty() ? "" : " ") + each;
  }
  return line;
}

}  // namespace

PlacesFixture::PlacesFixture() : DeviceRootFixture(Medium::Memory) {
  write(kSettingsPath, accountSettings(11, {PropertyDictionary{{"Type", "CalDAV"},
                                                               {"Class", "MobileCalDAVAccount"},
                                                               {"Identifier", "S"}}}));
  addPlaces();
}

PlacesFixture::~PlacesFixture() {
  if (isMounted_) {
    umount2(root().c_str(), MNT_DETACH);
  }
  std::ranges::for_each(immutable_, makeRemovable);
}

void PlacesFixture::addPlaces() const {
  const auto path = [this](DevicePlace place) { return pathOfPlace(place, home_); };
  write(path(DevicePlace::LegacyMail),
        PropertyDictionary{
            {"MailAccounts", PropertyArray{PropertyDictionary{{"AccountType", "IMAPAccount"},
                                                              {"uniqueId", "M"}}}}});
  write(path(DevicePlace::LegacyExchange),
        PropertyDictionary{{"DAAccountsKey", PropertyArray{PropertyDictionary{
                                                 {"DAAccountConfigurationClass", "ASAccount"},
                                                 {"DAAccountConfigurationAccountID", "E"}}}}});
  writeText(path(DevicePlace::LegacyMailOriginal), "left by another program");
  writeText(path(DevicePlace::LegacyExchangeOriginal), "left by another program");
  writeText(path(DevicePlace::AutoFetchEnabled), "");
  write(path(DevicePlace::LoggingPreferences),
        PropertyDictionary{{"ASSaveMigrationInformation", true}});
}

fs::path PlacesFixture::at(DevicePlace place) const {
  return onThisMachine(pathOfPlace(place, home_));
}

void PlacesFixture::put(const char* hostileKind, const fs::path& path) {
  fs::create_directories(path.parent_path());
  immutable_.push_back(path);
  reason_ = hostileFileKind(hostileKind).put(path, "/nowhere/on/the/device");
}

void PlacesFixture::moveBehindLink(const fs::path& path) {
  const fs::path elsewhere = onThisMachine("/elsewhere");
  if (fs::exists(path)) {
    fs::rename(path, elsewhere);
  } else {
    writeText("/elsewhere", "a file that a link leads to");
  }
  fs::create_directories(path.parent_path());
  fs::create_symlink(elsewhere.lexically_relative(path.parent_path()), path);
}

void PlacesFixture::linkDirectory(const char* devicePath, const char* target) {
  fs::remove_all(onThisMachine(devicePath));
  fs::create_directory_symlink(target, onThisMachine(devicePath));
}

void PlacesFixture::moveDirectory(const char* devicePath, const char* target) {
  fs::rename(onThisMachine(devicePath), onThisMachine(target));
  fs::create_directory_symlink(target, onThisMachine(devicePath));
}

void PlacesFixture::makeImmutable(const char* devicePath) {
  const fs::path path = onThisMachine(devicePath);
  immutable_.push_back(path);
  reason_ = hostileDirectoryKind("AnImmutableDirectory").put(path, {});
}

void PlacesFixture::mountReadOnly() {
  // In a view of the mounts that is this process's own.
  const std::string place = root();
  isMounted_ = unshare(CLONE_NEWNS) == 0 &&
               mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
               mount(place.c_str(), place.c_str(), nullptr, MS_BIND, nullptr) == 0;
  if (!isMounted_ ||
      mount(nullptr, place.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY, nullptr) != 0) {
    reason_ = "This system lets the test mount nothing.";
  }
}

void PlacesFixture::becomeOrdinaryUser() {
  const ProgramResult result =
      runProgram({.program = migrationHost(), .arguments = {"--version"}, .user = kOrdinaryUser});
  if (getuid() != 0 || result.exitStatus != 0) {
    reason_ = "The test cannot run " + migrationHost() + " as another user.";
    return;
  }
  giveTo(kOrdinaryUser);
  user_ = kOrdinaryUser;
}

void PlacesFixture::giveToRoot(const fs::path& path, unsigned permissions) const {
  ASSERT_EQ(lchown(path.c_str(), 0, 0), 0);
  fs::permissions(path, static_cast<fs::perms>(permissions));
}

void PlacesFixture::moveHome(const std::string& devicePath) {
  for (const ListedPlace& each : kDevicePlaces) {
    if (each.base == ListedPlace::Base::Home) {
      fs::remove_all(at(each.place));
    }
  }
  home_ = devicePath;
  addPlaces();
  fs::create_directories(onThisMachine(home_ + "/Library/Logs/CrashReporter"));
}

ProgramResult PlacesFixture::migrateObstructed(std::vector<std::string> arguments) {
  before_ = treeOf(root());
  arguments.insert(arguments.end(), {"--root", root(), "--channel", "-", "--home", home_});
  ProgramCall call = {.program = migrationHost(), .arguments = std::move(arguments)};
  call.user = user_;
  call.environment = {{"LC_ALL", "C"}, {"LANGUAGE", "en"}};
  const mode_t umaskBefore = umask(077);
  ProgramResult result = runProgram(call);
  umask(umaskBefore);
  return result;
}

void PlacesFixture::expectAlone(const PlacesOutcome& expected, ForetoldLogs logs) {
  const ProgramResult plan = migrateObstructed({"plan"});

  const ProgramResult result = migrateObstructed({"run", "--bare"});

  expectOutcome(expected, result);
  if (const std::vector<std::string> foretold = logsOf(plan); foretold.empty()) {
    EXPECT_NE(plan.exitStatus, 0);
  } else {
    EXPECT_EQ(foretold == logsOf(result), logs == ForetoldLogs::AreTheSame)
        << "planned:\n"
        << plan.errors << "done:\n"
        << result.errors;
  }
}

void PlacesFixture::expectInARun(const PlacesOutcome& expected) {
  expectOutcome(expected, migrateObstructed({"run"}));
}

void PlacesFixture::expectOutcome(const PlacesOutcome& expected,
                                  const ProgramResult& result) const {
  EXPECT_EQ(result.exitStatus, expected.exitStatus) << result.errors;
  EXPECT_EQ(changes(), expected.changes) << result.errors;
  EXPECT_THAT(result.errors, testing::HasSubstr(std::string(expected.said)));
}

std::vector<std::string> PlacesFixture::changedPlaces() const {
  const DeviceTree after = treeOf(root());
  std::set<std::string> others;
  for (const DeviceTree* tree : {&before_, &after}) {
    for (const auto& [path, entry] : *tree) {
      others.insert(path);
    }
  }
  std::vector<std::string> changed;
  for (const ListedPlace& each : kDevicePlaces) {
    const std::string path = pathOfPlace(each.place, home_);
    std::string text = changeOf(before_, after, path);
    others.erase(path);
    if (!text.empty()) {
      text += each.name;
      text += each.place == DevicePlace::Settings ? "(" + savedIdentifiers() + ")" : "";
    }
    if (each.place == DevicePlace::InformationDirectory) {
      if (const TreeEntry* directory = entryAt(after, path); text.starts_with('+')) {
        text += directory->mode == (S_IFDIR | 0777) ? "" : " of another mode";
      }
      text +=
          takeAllBeneath(others, path + "/" + std::string(kInformationFilePrefix)) ? "+File" : "";
    }
    if (!text.empty()) {
      changed.push_back(text);
    }
  }
  if (takeAllBeneath(others, std::string(kAccountMigrationDirectory) + "/Kept-")) {
    changed.emplace_back("+Kept");
  }
  takeAllBeneath(others, std::string(kAccountMigrationDirectory));
  others.erase(kLockPath);
  others.erase(home_ + "/tmp");
  for (const std::string& each : others) {
    if (const std::string change = changeOf(before_, after, each); !change.empty()) {
      changed.push_back(change + withoutTime(each));
    }
  }
  return changed;
}

std::string PlacesFixture::savedIdentifiers() const {
  std::string identifiers;
  for (const PropertyValue& account :
       readDictionary(kSettingsPath).arrayForKey("Accounts").value_or(PropertyArray())) {
    identifiers += account.asDictionary()->textForKey("Identifier")->string();
  }
  return identifiers;
}

std::string PlacesFixture::changes() const {
  const std::vector<std::string> changed = changedPlaces();
  const std::vector<std::string> missing = without(kAllChanges, changed);
  const std::string others = inOneLine(without(changed, kAllChanges));
  if (changed.empty()) {
    return "nothing";
  }
  if (missing.size() > kAllChanges.size() / 2) {
    return inOneLine(changed);
  }
  return "all" + (missing.empty() ? "" : " but " + inOneLine(missing)) +
         (others.empty() ? "" : "; " + others);
}

}  // namespace accounts
