#include "tests/program/DeviceRootFixture.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <sstream>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/program/JSONSchema.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr const char* kDirectoryInMemory = "/dev/shm";

}  // namespace

fs::path makeTemporaryDirectory(Medium medium, const std::string& name) {
  const bool inMemory = medium == Medium::Memory && access(kDirectoryInMemory, W_OK) == 0;
  const fs::path parent = inMemory ? kDirectoryInMemory : fs::temp_directory_path();
  std::string path = (parent / (name + "-XXXXXX")).string();
  if (mkdtemp(path.data()) == nullptr) {
    ADD_FAILURE() << "no temporary directory";
  }
  return path;
}

DeviceRootFixture::DeviceRootFixture(Medium medium)
    : directory_(makeTemporaryDirectory(medium, "device-root")) {
  // What a test makes is for others to read, whoever runs it.
  umask(022);
  for (const char* directory :
       {"/tmp", "/etc", "/var/mobile/Library/Preferences", "/var/mobile/Library/Mail",
        "/var/mobile/Library/Logs/CrashReporter"}) {
    fs::create_directories(onThisMachine(directory));
  }
  makeMobile(getuid(), getgid());
}

DeviceRootFixture::~DeviceRootFixture() {
  std::error_code error;
  fs::remove_all(directory_, error);
}

fs::path DeviceRootFixture::onThisMachine(std::string_view devicePath) const {
  return directory_ / fs::path(devicePath).relative_path();
}

void DeviceRootFixture::makeMobile(uid_t user, gid_t group) const {
  const std::string userNumber = std::to_string(user);
  const std::string groupNumber = std::to_string(group);
  writeText("/etc/passwd",
            "mobile:*:" + userNumber + ":" + groupNumber + ":Mobile User:/var/mobile:/bin/sh\n");
  writeText("/etc/group", "mobile:*:" + groupNumber + ":\n");
}

void DeviceRootFixture::writeText(std::string_view devicePath, std::string_view text) const {
  const fs::path path = onThisMachine(devicePath);
  fs::create_directories(path.parent_path());
  std::ofstream stream(path, std::ios::binary | std::ios::trunc);
  stream << text;
  ASSERT_TRUE(stream.flush().good()) << path;
}

void DeviceRootFixture::write(std::string_view devicePath, const PropertyValue& value) const {
  const auto bytes = writeBinaryPropertyList(value);
  ASSERT_TRUE(bytes) << bytes.error().text;
  writeText(devicePath, *bytes);
}

void DeviceRootFixture::copyOverRoot(const fs::path& directory) const {
  fs::copy(directory, directory_,
           fs::copy_options::recursive | fs::copy_options::overwrite_existing);
  makeMobile(getuid(), getgid());
}

void DeviceRootFixture::giveTo(uid_t user) const {
  makeMobile(user, user);
  ASSERT_EQ(chown(directory_.c_str(), user, user), 0);
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(directory_)) {
    ASSERT_EQ(lchown(entry.path().c_str(), user, user), 0) << entry.path();
  }
}

bool DeviceRootFixture::exists(std::string_view devicePath) const {
  return fs::exists(fs::symlink_status(onThisMachine(devicePath)));
}

std::string DeviceRootFixture::readText(std::string_view devicePath) const {
  std::ifstream stream(onThisMachine(devicePath), std::ios::binary);
  EXPECT_TRUE(stream.good()) << devicePath;
  std::ostringstream text;
  text << stream.rdbuf();
  return text.str();
}

PropertyDictionary DeviceRootFixture::readDictionary(std::string_view devicePath) const {
  const auto value = readPropertyList(readText(devicePath));
  if (!value || value->asDictionary() == nullptr) {
    ADD_FAILURE() << devicePath << " holds no dictionary. " << (value ? "" : value.error().text);
    return {};
  }
  return *value->asDictionary();
}

std::vector<std::string> DeviceRootFixture::files() const {
  std::vector<std::string> paths;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(directory_)) {
    if (!fs::is_directory(entry.symlink_status())) {
      paths.push_back("/" + entry.path().lexically_relative(directory_).string());
    }
  }
  std::sort(paths.begin(), paths.end());
  return paths;
}

ProgramCall DeviceRootFixture::migrationCall(const std::vector<std::string>& arguments) const {
  ProgramCall call{.program = migrationHost(), .arguments = {"run", "--root", root()}};
  call.arguments.insert(call.arguments.end(), arguments.begin(), arguments.end());
  return call;
}

ProgramResult DeviceRootFixture::migrate(const std::vector<std::string>& arguments) const {
  return runProgram(migrationCall(arguments));
}

nlohmann::json onlyObject(const ProgramResult& result) {
  EXPECT_EQ(result.outputLines().size(), 1U) << result.output;
  EXPECT_TRUE(result.output.ends_with("}\n")) << result.output;
  nlohmann::json object = nlohmann::json::parse(result.output, nullptr, false);
  EXPECT_TRUE(object.is_object()) << result.output;
  EXPECT_EQ(problemWithSchema(object), "") << result.output;
  return object.is_object() ? object : nlohmann::json::object();
}

}  // namespace accounts
