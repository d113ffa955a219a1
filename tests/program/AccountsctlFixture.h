#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "propertylist/value/PropertyValue.h"
#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/RunProgram.h"

namespace accounts {

/// An empty directory in which the real accountsctl is run.
class AccountsctlFixture : public testing::Test {
 public:
  AccountsctlFixture(const AccountsctlFixture&) = delete;
  AccountsctlFixture& operator=(const AccountsctlFixture&) = delete;

 protected:
  AccountsctlFixture();
  ~AccountsctlFixture() override;

  /// The path of a file in the directory.
  [[nodiscard]] std::string path(std::string_view name) const;
  /// Writes a file, a property list in the binary format, and returns its path.
  std::string write(std::string_view name, const PropertyValue& value) const;
  std::string writeText(std::string_view name, std::string_view text) const;
  [[nodiscard]] std::string readText(std::string_view name) const;
  /// The value in a property-list file; a failure of the test when there is none.
  [[nodiscard]] PropertyValue readValue(std::string_view name) const;
  /// The names of the files in the directory, sorted.
  [[nodiscard]] std::vector<std::string> files() const;

  /// Runs accountsctl to its end, standard input being empty and COLUMNS 80.
  static ProgramResult run(const std::vector<std::string>& arguments);
  /// The same by a shell, with a redirection such as "< FILE" behind the arguments.
  static ProgramResult runRedirected(const std::vector<std::string>& arguments,
                                     const std::string& redirection);

 private:
  std::filesystem::path directory_;
};

/// A run was refused: nothing on standard output, one line on standard error that begins with the
/// program's name and has a text in it.
void expectRefused(const ProgramResult& result, int exitStatus, const std::string& naming);

}  // namespace accounts
