#include "tests/program/AccountsctlFixture.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <map>
#include <optional>
#include <sstream>

#include "propertylist/PropertyListFile.h"
#include "propertylist/binary/BinaryPropertyList.h"
#include "tests/program/Programs.h"

namespace accounts {
namespace {

const std::map<std::string, std::string> kEnvironment = {{"COLUMNS", "80"}};

}  // namespace

AccountsctlFixture::AccountsctlFixture() {
  std::string pattern = (std::filesystem::temp_directory_path() / "accountsctl-XXXXXX").string();
  directory_ = mkdtemp(pattern.data());
}

AccountsctlFixture::~AccountsctlFixture() {
  std::error_code ignored;
  std::filesystem::remove_all(directory_, ignored);
}

std::string AccountsctlFixture::path(std::string_view name) const {
  return (directory_ / name).string();
}

std::string AccountsctlFixture::write(std::string_view name, const PropertyValue& value) const {
  return writeText(name, writeBinaryPropertyList(value).value());
}

std::string AccountsctlFixture::writeText(std::string_view name, std::string_view text) const {
  std::ofstream(path(name), std::ios::binary) << text;
  return path(name);
}

std::string AccountsctlFixture::readText(std::string_view name) const {
  std::ostringstream text;
  text << std::ifstream(path(name), std::ios::binary).rdbuf();
  return text.str();
}

PropertyValue AccountsctlFixture::readValue(std::string_view name) const {
  const auto value = readPropertyList(readText(name));
  EXPECT_TRUE(value) << value.error().text;
  return value.value_or("unreadable");
}

std::vector<std::string> AccountsctlFixture::files() const {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(directory_)) {
    names.push_back(entry.path().filename().string());
  }
  std::sort(names.begin(), names.end());
  return names;
}

ProgramResult AccountsctlFixture::run(const std::vector<std::string>& arguments) {
  return runProgram(
      {.program = accountsctl(), .arguments = arguments, .environment = kEnvironment});
}

ProgramResult AccountsctlFixture::runRedirected(const std::vector<std::string>& arguments,
                                                const std::string& redirection) {
  std::vector<std::string> all = {"-c", "exec \"$0\" \"$@\" " + redirection, accountsctl()};
  all.insert(all.end(), arguments.begin(), arguments.end());
  return runProgram({.program = "/bin/sh", .arguments = all, .environment = kEnvironment});
}

void expectRefused(const ProgramResult& result, int exitStatus, const std::string& naming) {
  EXPECT_EQ(result.exitStatus, exitStatus);
  EXPECT_EQ(result.output, "");
  EXPECT_EQ(result.errorLines().size(), 1U) << result.errors;
  EXPECT_TRUE(result.errors.starts_with("accountsctl: ")) << result.errors;
  EXPECT_NE(result.errors.find(naming), std::string::npos) << result.errors;
}

}  // namespace accounts
