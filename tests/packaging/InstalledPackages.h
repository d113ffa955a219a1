#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include "tests/program/RunProgram.h"

namespace accounts {

/// The Debian packages of the build, and a directory in the place of a machine's root that they are
/// installed in. The directory knows which packages this machine has, so a dependency that Debian
/// does not satisfy here fails the installation.
class InstalledPackages : public testing::Test {
 public:
  InstalledPackages(const InstalledPackages&) = delete;
  InstalledPackages& operator=(const InstalledPackages&) = delete;

 protected:
  InstalledPackages();
  ~InstalledPackages() override;

  /// A directory of this test's own, which also holds the other ones.
  [[nodiscard]] std::filesystem::path directory() const { return directory_; }
  /// Where the packages' "/usr" is.
  [[nodiscard]] std::filesystem::path prefix() const { return machine() / "usr"; }
  [[nodiscard]] std::filesystem::path machine() const { return directory_ / "machine"; }

  /// Installs every package.
  void install() const;
  /// Removes one package.
  void remove(const std::string& package) const;
  /// The file of the package that has this name.
  [[nodiscard]] static std::string packageFile(const std::string& package);
  /// A field of the package that has this name.
  [[nodiscard]] static std::string field(const std::string& package, const std::string& name);

  /// The paths of all files and directories of a tree, such as "usr/bin"; those of dpkg itself are
  /// left out.
  static std::set<std::string> tree(const std::filesystem::path& root);
  /// Runs a program, which must end with exit status 0.
  static ProgramResult succeed(const ProgramCall& call);

 private:
  [[nodiscard]] ProgramResult dpkg(const std::vector<std::string>& arguments) const;

  std::filesystem::path directory_;
};

}  // namespace accounts
