// Small devices that a seed decides, and those of tests/fixtures/versions. Each is planned and
// migrated, and migrated bare: the plan must have foretold the migration, and the two migrations
// must leave the same device. What may differ is in the two tables below, with the reason.
//
// docs/testing.md says how to run more of them.

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string>

#include "tests/fakes/Sanitizers.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/GeneratedDevice.h"
#include "tests/program/MigratedDevice.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;
using nlohmann::json;

constexpr std::string_view kHostsDirectory = "/var/mobile/Library/AccountMigration";
constexpr std::string_view kTemporaryFiles = "/var/mobile/tmp";

/// Two endings of one device, the device before, and one way in which they may differ.
struct Pair {
  Ending& first;
  Ending& second;
  const DeviceTree& before;
};

struct Difference {
  const char* what;
  const char* reason;
  /// Checks what can be checked of it, and makes the two alike in that.
  void (*overlook)(const Pair& endings);
};

/// Takes what stands at a path, and beneath it, out of a tree.
void removeFrom(DeviceTree& tree, std::string_view path) {
  std::erase_if(tree, [&](const auto& each) {
    return each.first == path || each.first.starts_with(std::string(path) + "/");
  });
}

void forBoth(const Pair& endings, void (*change)(json& report)) {
  change(endings.first.told["report"]);
  change(endings.second.told["report"]);
}

void overlookTimes(const Pair& endings) {
  forBoth(endings, [](json& report) {
    report.erase("time");
    if (report.contains("stages")) {
      for (json& stage : report["stages"]) {
        stage.erase("seconds");
      }
    }
  });
}

void overlookCommand(const Pair& endings) {
  EXPECT_EQ(endings.first.told["report"]["command"], "plan");
  EXPECT_EQ(endings.second.told["report"]["command"], "run");
  forBoth(endings, [](json& report) { report.erase("command"); });
}

/// A warning of what may not be carried over, and what is done about it.
constexpr std::string_view kWouldBeKept = "; a run would keep the files as they were";
constexpr std::string_view kAreKept = "; the files as they were are kept in ";

void overlookKeptFolder(const Pair& endings) {
  std::size_t foretold = 0;
  std::size_t done = 0;
  json& kept = endings.second.told["report"]["keptInputs"];
  const std::string folder = kept.size() == 1 ? kept[0].get<std::string>() : "";
  for (json& warning : endings.first.told["report"]["warnings"]) {
    std::string text = warning;
    if (text.ends_with(kWouldBeKept)) {
      warning = text.erase(text.size() - kWouldBeKept.size());
      ++foretold;
    }
  }
  for (json& warning : endings.second.told["report"]["warnings"]) {
    std::string text = warning;
    if (const std::size_t at = text.find(std::string(kAreKept) + folder); at != std::string::npos) {
      warning = text.erase(at);
      ++done;
    }
  }
  EXPECT_EQ(foretold, done);
  EXPECT_EQ(kept.size(), foretold > 0 ? 1U : 0U) << kept;
  kept.clear();
}

constexpr Difference kBetweenPlanAndRun[] = {
    {"times", "Each says when it was made and how long its stages took.", overlookTimes},
    {"the command", "Each says what it is.", overlookCommand},
    {"kept files", "A plan says that a run would keep files; a run keeps them and says where.",
     overlookKeptFolder},
};

void overlookWhatABriefResultLeavesOut(const Pair& endings) {
  json& full = endings.first.told["report"];
  const json& brief = endings.second.told["report"];
  for (const char* key : {"result", "steps", "broadcasts", "cloudTabAnnouncements"}) {
    EXPECT_TRUE(brief.contains(key)) << key;
  }
  for (const char* key :
       {"command", "time", "stages", "versions", "accountsBefore", "accountsAfter"}) {
    if (!brief.contains(key)) {
      full.erase(key);
    }
  }
}

void overlookWhatIsToldOfTheCommit(const Pair& endings) {
  for (const char* key : {"settingsSaves", "keptInputs", "warnings"}) {
    endings.first.told["report"].erase(key);
    endings.second.told["report"].erase(key);
  }
}

void overlookHostsDirectory(const Pair& endings) {
  EXPECT_FALSE(endings.second.tree.contains(std::string(kHostsDirectory)));
  removeFrom(endings.first.tree, kHostsDirectory);
}

void overlookTemporaryDirectory(const Pair& endings) {
  for (DeviceTree* tree : {&endings.first.tree, &endings.second.tree}) {
    if (isEmptyDirectory(*tree, std::string(kTemporaryFiles))) {
      removeFrom(*tree, kTemporaryFiles);
    }
  }
}

void overlookLedger(const Pair& endings) {
  EXPECT_TRUE(endings.second.told["report"]["ledger"].is_null());
  forBoth(endings, [](json& report) {
    report.erase("ledger");
    report.erase("outcome");
  });
  if (endings.first.told["exitStatus"] == kNotAllCarriedOver) {
    EXPECT_EQ(endings.second.told["exitStatus"], 0);
    endings.first.told["exitStatus"] = 0;
    endings.first.told["report"]["exitStatus"] = 0;
  }
}

void overlookRefusedChanges(const Pair& endings) {
  const int status = endings.first.told["exitStatus"];
  if (status == 0) {
    return;
  }
  DeviceTree unchanged = endings.first.tree;
  if (!endings.before.contains(kLockPath)) {
    unchanged.erase(kLockPath);
  }
  EXPECT_TRUE(unchanged == endings.before) << "a run of status " << status << " changed it";
  endings.second.tree = endings.first.tree;
  for (const char* key : {"exitStatus", "error", "versions", "accountsAfter", "broadcasts",
                          "cloudTabAnnouncements"}) {
    endings.first.told["report"].erase(key);
    endings.second.told["report"].erase(key);
  }
  endings.first.told.erase("exitStatus");
  endings.second.told.erase("exitStatus");
}

constexpr Difference kBetweenRunAndBareRun[] = {
    {"what a brief result leaves out",
     "Without a report a run tells its result alone, and most bare runs have none, to save time.",
     overlookWhatABriefResultLeavesOut},
    {"the ledger", "The plug-in alone accounts for nothing.", overlookLedger},
    {"what is not verified",
     "A run that ends with another status than 0 or 3 changes nothing; the plug-in alone has "
     "saved.",
     overlookRefusedChanges},
    {"times", "Each says when it was made and how long its stages took.", overlookTimes},
    {"what is told of the commit",
     "The plug-in alone commits nothing, keeps nothing and verifies nothing.",
     overlookWhatIsToldOfTheCommit},
    {"the host's own directory", "A run that may have lost something keeps files there.",
     overlookHostsDirectory},
    {"an empty temporary directory",
     "The plug-in alone writes its temporary files there; a run makes them where they are to stay.",
     overlookTemporaryDirectory},
};

/// The paths of a device as a plan foretells them: those before, with what its stages do to them.
std::set<std::string> foretoldPaths(const Ending& plan, const DeviceTree& before) {
  std::set<std::string> paths;
  for (const auto& [path, entry] : before) {
    paths.insert(path);
  }
  if (before.contains("/tmp")) {
    paths.insert(kLockPath);
  }
  if (plan.told["exitStatus"] != 0 && plan.told["exitStatus"] != kNotAllCarriedOver) {
    return paths;
  }
  for (const json& stage : plan.told["report"]["stages"]) {
    for (const json& file : stage["files"]) {
      const fs::path path = file["path"].get<std::string>();
      if (file.contains("error")) {
        continue;
      }
      if (file["action"] == "removed") {
        paths.erase(path);
        continue;
      }
      for (fs::path each = path; each != "/"; each = each.parent_path()) {
        paths.insert(each);
      }
    }
  }
  return paths;
}

/// The paths of a device after a run, but for what the host keeps for itself.
std::set<std::string> pathsOf(const Ending& run) {
  std::set<std::string> paths;
  for (const auto& [path, entry] : run.tree) {
    if (!path.starts_with(kHostsDirectory)) {
      paths.insert(path);
    }
  }
  return paths;
}

template <std::size_t count>
void expectAlike(Ending first, Ending second, const DeviceTree& before,
                 const Difference (&differences)[count]) {
  const Pair endings = {first, second, before};
  for (const Difference& each : differences) {
    SCOPED_TRACE(each.what);
    each.overlook(endings);
  }
  EXPECT_EQ(differencesOf(first, second), "");
}

/// Plans, migrates, and migrates bare.
void expectForetoldAndTheSameAsBare(const MigratedDevice::Make& make, Detail detail) {
  MigratedDevice device(make, detail);
  const Ending plan = device.plan();
  EXPECT_TRUE(plan.tree == device.before()) << "the plan changed the device";
  const Ending run = device.run();
  device.makeAnew();
  const Ending bare = device.runBare();

  EXPECT_EQ(pathsOf(run), foretoldPaths(plan, device.before()));
  {
    SCOPED_TRACE("the plan (-) and the run (+)");
    expectAlike({.told = plan.told, .tree = {}}, {.told = run.told, .tree = {}}, device.before(),
                kBetweenPlanAndRun);
  }
  SCOPED_TRACE("the run (-) and the bare run (+)");
  expectAlike(run, bare, device.before(), kBetweenRunAndBareRun);
}

std::uint64_t numberFrom(const char* variable, std::uint64_t otherwise) {
  const char* text = std::getenv(variable);
  return text != nullptr ? std::strtoull(text, nullptr, 10) : otherwise;
}

constexpr std::uint64_t kShards = 20;
// With sanitizers a program takes many times as long to start.
constexpr std::uint64_t kDevices = kWithSanitizers ? 100 : 1000;

/// Every device of one shard of them.
class GeneratedDevices : public testing::TestWithParam<std::uint64_t> {};

TEST_P(GeneratedDevices, AreMigratedAsPlannedAndEndAsThePluginAloneLeavesThem) {
  const std::uint64_t count = numberFrom("GENERATED_DEVICES", kDevices);
  const std::uint64_t firstSeed = numberFrom("GENERATED_DEVICES_SEED", 1);
  if (GetParam() >= count) {
    GTEST_SKIP() << "There are fewer devices than shards.";
  }
  for (std::uint64_t index = GetParam(); index < count; index += kShards) {
    const std::uint64_t seed = firstSeed + index;
    const std::vector<GeneratedEntry> device = generatedDevice(seed);
    SCOPED_TRACE("GENERATED_DEVICES=1 GENERATED_DEVICES_SEED=" + std::to_string(seed) +
                 " makes this device alone:\n" + description(device));

    // The umask has no influence on any file.
    const mode_t umaskBefore = umask(seed % 2 == 0 ? 022 : 077);
    expectForetoldAndTheSameAsBare([&device](const fs::path& root) { makeDevice(device, root); },
                                   index / kShards % 16 == 0 ? Detail::Full : Detail::Brief);
    umask(umaskBefore);

    if (HasFailure()) {
      return;
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Shard, GeneratedDevices, testing::Range(std::uint64_t{0}, kShards));

fs::path fixturesOfVersions() {
  return fs::path(SOURCE_DIRECTORY) / "tests" / "fixtures" / "versions";
}

std::vector<std::string> devicesOfVersions() {
  std::vector<std::string> names;
  for (const fs::directory_entry& entry : fs::directory_iterator(fixturesOfVersions())) {
    if (entry.is_directory()) {
      names.push_back(entry.path().filename().string());
    }
  }
  std::ranges::sort(names);
  return names;
}

/// A device of the fixtures, named by the test's parameter.
class DeviceOfAStoredVersion : public testing::TestWithParam<std::string> {};

TEST_P(DeviceOfAStoredVersion, IsMigratedAsPlannedAndEndsAsThePluginAloneLeavesIt) {
  expectForetoldAndTheSameAsBare(
      [](const fs::path& root) {
        const std::string mobile = std::to_string(mobileOfGeneratedDevices());
        makeDevice({{.path = "/tmp", .contents = {}, .mode = 01777}}, root);
        fs::copy(fixturesOfVersions() / GetParam() / "before", root, fs::copy_options::recursive);
        fs::create_directories(root / "var/mobile/Library/Logs/CrashReporter");
        fs::create_directories(root / "etc");
        makeDevice(
            {{.path = "/etc/passwd", .contents = "mobile:*:" + mobile + ":" + mobile + ":::\n"},
             {.path = "/etc/group", .contents = "mobile:*:" + mobile + ":\n"}},
            root);
      },
      Detail::Full);
}

INSTANTIATE_TEST_SUITE_P(Device, DeviceOfAStoredVersion, testing::ValuesIn(devicesOfVersions()),
                         [](const auto& information) {
                           std::string name = information.param;
                           std::ranges::replace(name, '-', '_');
                           return name;
                         });

}  // namespace
}  // namespace accounts
