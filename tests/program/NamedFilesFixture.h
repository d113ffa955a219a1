#pragma once

#include <algorithm>
#include <fstream>
#include <string>
#include <vector>

#include "tests/program/DeviceRootFixture.h"
#include "tests/program/ExitStatuses.h"
#include "tests/program/Programs.h"

namespace accounts {

/// Both programs, run from a working directory that holds a settings file, "settings.plist", and
/// nothing else. How a file is named there must not matter.
class NamedFiles : public DeviceRootFixture {
 protected:
  NamedFiles() : directory_(makeTemporaryDirectory(Medium::Disk, "named-")) {
    std::filesystem::create_directories(directory_ / "here");
    write(kSettingsPath, accountSettings(12));
    std::filesystem::copy_file(onThisMachine(kSettingsPath), path("settings.plist"));
    write(kSettingsPath, accountSettings(11));
  }
  ~NamedFiles() override { std::filesystem::remove_all(directory_); }

  /// Where a name leads that is used in the working directory.
  [[nodiscard]] std::filesystem::path path(const std::string& name) const {
    return directory_ / "here" / name;
  }
  [[nodiscard]] std::string text(const std::string& name) const {
    std::ifstream stream(path(name));
    return {std::istreambuf_iterator<char>(stream), {}};
  }
  void writeHere(const std::string& name, const std::string& content) const {
    std::ofstream(path(name)) << content;
  }
  [[nodiscard]] std::vector<std::string> filesHere() const {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(directory_ / "here")) {
      names.push_back(entry.path().filename());
    }
    std::sort(names.begin(), names.end());
    return names;
  }

  [[nodiscard]] ProgramResult runHere(const std::string& program,
                                      const std::vector<std::string>& arguments) const {
    return runProgram({.program = program,
                       .arguments = arguments,
                       .environment = {{"COLUMNS", "80"}},
                       .directory = path(".").string()});
  }
  [[nodiscard]] ProgramResult host(const std::string& subcommand,
                                   std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), {subcommand, "--root", root()});
    return runHere(migrationHost(), arguments);
  }
  [[nodiscard]] ProgramResult tool(const std::vector<std::string>& arguments) const {
    return runHere(accountsctl(), arguments);
  }
  /// A command line for the shell; HOST, TOOL and ROOT stand for what their names say.
  [[nodiscard]] ProgramResult shell(const std::string& line) const {
    return runProgram(
        {.program = "/bin/bash",
         .arguments = {"-c", line},
         .environment = {{"HOST", migrationHost()}, {"TOOL", accountsctl()}, {"ROOT", root()}},
         .directory = path(".").string()});
  }

 private:
  std::filesystem::path directory_;
};

}  // namespace accounts
