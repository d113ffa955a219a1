#include "tests/packaging/InstalledPackages.h"

#include <unistd.h>

#include "tests/program/DeviceRootFixture.h"

namespace accounts {
namespace {

namespace fs = std::filesystem;

constexpr const char* kDatabase = "var/lib/dpkg";
constexpr const char* kMachinesDatabase = "/var/lib/dpkg/status";

}  // namespace

InstalledPackages::InstalledPackages()
    : directory_(makeTemporaryDirectory(Medium::Disk, "packages")) {
  // Like a machine's root, for tests that run a program as another user.
  fs::permissions(directory_, fs::perms(0755));
  for (const char* directory : {"info", "updates", "triggers"}) {
    fs::create_directories(machine() / kDatabase / directory);
  }
  fs::copy_file(kMachinesDatabase, machine() / kDatabase / "status");
}

InstalledPackages::~InstalledPackages() {
  std::error_code error;
  fs::remove_all(directory_, error);
}

std::string InstalledPackages::packageFile(const std::string& package) {
  for (const fs::directory_entry& entry : fs::directory_iterator(PACKAGES_DIRECTORY)) {
    // A version follows the name.
    if (entry.path().filename().string().starts_with(package + "_")) {
      return entry.path().string();
    }
  }
  ADD_FAILURE() << "no package " << package << " in " << PACKAGES_DIRECTORY;
  return {};
}

void InstalledPackages::install() const {
  const ProgramResult result =
      dpkg({"--install", packageFile("accounts-migration"), packageFile("accounts-migration-dev")});
  ASSERT_EQ(result.exitStatus, 0) << result.errors;
}

void InstalledPackages::remove(const std::string& package) const {
  const ProgramResult result = dpkg({"--remove", package});
  ASSERT_EQ(result.exitStatus, 0) << result.errors;
}

std::string InstalledPackages::field(const std::string& package, const std::string& name) {
  const ProgramResult result =
      succeed({.program = "dpkg-deb", .arguments = {"--field", packageFile(package), name}});
  return result.output.substr(0, result.output.find('\n'));
}

std::set<std::string> InstalledPackages::tree(const fs::path& root) {
  std::set<std::string> paths;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root)) {
    const std::string path = entry.path().lexically_relative(root).string();
    if (!path.starts_with("var")) {
      paths.insert(path);
    }
  }
  return paths;
}

ProgramResult InstalledPackages::succeed(const ProgramCall& call) {
  ProgramResult result = runProgram(call);
  EXPECT_EQ(result.exitStatus, 0) << result.output << result.errors;
  return result;
}

ProgramResult InstalledPackages::dpkg(const std::vector<std::string>& arguments) const {
  // Nobody's privileges are needed for a directory of one's own, nor the programs that the system
  // administrator alone has in the search path.
  std::vector<std::string> all = {"--root=" + machine().string(), "--force-not-root",
                                  "--force-bad-path", "--log=/dev/null"};
  all.insert(all.end(), arguments.begin(), arguments.end());
  // Only root gives files away; everyone else pretends to.
  if (geteuid() != 0) {
    all.insert(all.begin(), "dpkg");
    return runProgram({.program = "fakeroot", .arguments = all});
  }
  return runProgram({.program = "dpkg", .arguments = all});
}

}  // namespace accounts
