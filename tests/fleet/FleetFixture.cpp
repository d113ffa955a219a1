#include "tests/fleet/FleetFixture.h"

#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <sstream>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr int kOldVersion = 11;

void writeFile(const fs::path& path, const std::string& text) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << text;
}

}  // namespace

FleetFixture::FleetFixture() : directory_(makeTemporaryDirectory(Medium::Memory, "fleet")) {
  const char* const path = std::getenv("PATH");
  environment["PATH"] = fs::path(migrationHost()).parent_path().string() + ":" +
                        fs::path(accountsctl()).parent_path().string() + ":" +
                        (path != nullptr ? path : "/usr/bin:/bin");
  // GNU parallel keeps its state in the home directory.
  environment["HOME"] = directory_.string();
}

FleetFixture::~FleetFixture() {
  std::error_code error;
  fs::remove_all(directory_, error);
}

fs::path FleetFixture::image(int number) const {
  return directory_ / "images" / ("image " + std::to_string(number));
}

void FleetFixture::makeImage(int number) const {
  const fs::path root = image(number);
  fs::create_directories(root / "tmp");
  fs::create_directories(root / "var/mobile/Library/Logs/CrashReporter");
  writeFile(root / "etc/passwd", "mobile:*:" + std::to_string(getuid()) + ":" +
                                     std::to_string(getgid()) + "::/var/mobile:/bin/sh\n");
  writeFile(root / "etc/group", "mobile:*:" + std::to_string(getgid()) + ":\n");
  const PropertyDictionary account = {{"Identifier", "A" + std::to_string(number)},
                                      {"Type", "CalDAV"},
                                      {"Class", "MobileCalDAVAccount"}};
  writeFile(root / fs::path(kSettingsPath).relative_path(),
            writeBinaryPropertyList(accountSettings(kOldVersion, {account})).value_or(""));
}

std::string FleetFixture::makeImages(int count) const {
  std::string roots;
  for (int number = 1; number <= count; ++number) {
    makeImage(number);
    roots += image(number).string() + "\n";
  }
  writeFile(directory_ / "roots.txt", roots);
  return directory_ / "roots.txt";
}

std::int64_t FleetFixture::versionOf(int number) const {
  std::ostringstream text;
  text << std::ifstream(image(number) / fs::path(kSettingsPath).relative_path(), std::ios::binary)
              .rdbuf();
  const auto settings = readPropertyList(text.str());
  if (!settings || settings->asDictionary() == nullptr) {
    return -1;
  }
  const PropertyValue* const version = settings->asDictionary()->find("Version");
  return version != nullptr ? version->integerValue().value_or(-1) : -1;
}

ProgramCall FleetFixture::call(const std::string& program,
                               const std::vector<std::string>& arguments) const {
  return {.program = program,
          .arguments = arguments,
          .environment = environment,
          .timeLimit = std::chrono::seconds(240)};
}

std::string FleetFixture::example(const std::string& name) {
  return std::string(FLEET_EXAMPLES) + "/" + name;
}

}  // namespace accounts
