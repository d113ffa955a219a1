#include "tests/transaction/SameAsTheDeviceFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

/// What stands in the place of a file, and whether the system is told that something is there.
struct InPlace {
  const char* name;
  std::function<void(const fs::path&)> make;
};

void PrintTo(const InPlace& inPlace, std::ostream* stream) {
  *stream << inPlace.name;
}

class ExistenceTest : public SameAsTheDeviceTest,
                      public testing::WithParamInterface<std::tuple<DevicePlace, InPlace>> {};

TEST_P(ExistenceTest, WhatIsThereIsThereInMemory) {
  const auto& [place, inPlace] = GetParam();
  makeFile("/secret", "nobody else may read this");
  takeRights("/secret", 0600);
  makeDirectory("/directory");
  inPlace.make(onHost(path(place)));
  for (const bool isPrivileged : {true, false}) {
    const std::optional<WithoutPrivileges> everyone =
        isPrivileged ? std::nullopt : std::make_optional<WithoutPrivileges>();
    const auto look = [&, at = path(place)](FileSystem& system) {
      return Failure{.text = std::string(system.fileExists(at) ? "there" : "not there") +
                             (system.isDirectory(at) ? ", a directory" : "")};
    };
    const std::string memory = inMemory(look);
    if (!memory.starts_with("no snapshot: Cannot open " + path(place))) {
      EXPECT_EQ(memory, outcomeOf(files, look)) << isPrivileged;
    }
  }
}

const InPlace kInPlaces[] = {
    {"nothing", [](const fs::path&) {}},
    {"a file", [](const fs::path& at) { makeHostFile(at, "contents"); }},
    {"an unreadable file",
     [](const fs::path& at) {
       makeHostFile(at, "contents");
       fs::permissions(at, fs::perms::none);
     }},
    {"a directory", [](const fs::path& at) { fs::create_directories(at); }},
    {"a pipe", [](const fs::path& at) { EXPECT_EQ(::mkfifo(at.c_str(), 0600), 0); }},
    {"a link to nothing", [](const fs::path& at) { fs::create_symlink("/nowhere", at); }},
    {"a link to itself", [](const fs::path& at) { fs::create_symlink(at.filename(), at); }},
    {"a link to a directory", [](const fs::path& at) { fs::create_symlink("/directory", at); }},
    {"a link to a file that not everybody may read",
     [](const fs::path& at) { fs::create_symlink("/secret", at); }}};

INSTANTIATE_TEST_SUITE_P(
    Places, ExistenceTest,
    testing::Combine(testing::Values(DevicePlace::Settings, DevicePlace::LegacyMail,
                                     DevicePlace::RemovalSentinel, DevicePlace::CopyAside,
                                     DevicePlace::AutoFetchEnabled,
                                     DevicePlace::InformationDirectory,
                                     DevicePlace::LoggingPreferences),
                     testing::ValuesIn(kInPlaces)));

}  // namespace
}  // namespace accounts
