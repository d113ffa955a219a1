#include "commandline/OptionDeclarations.h"

#include <CLI/CLI.hpp>

namespace accounts {
namespace {

// More devices than there are, and seconds than anybody waits.
constexpr std::size_t kMostDigitsOfACount = 9;

}  // namespace

std::string requireText(const std::string& value) {
  return value.empty() ? "must not be empty" : "";
}

std::string requireDevicePath(const std::string& value) {
  return value.starts_with('/') ? "" : "must be an absolute device path, such as /var/mobile";
}

std::string requireCount(const std::string& value) {
  const bool isCount = !value.empty() && value.size() <= kMostDigitsOfACount &&
                       value.find_first_not_of("0123456789") == std::string::npos;
  return isCount ? "" : "must be a whole number, at most 999999999";
}

void addHelpAndVersion(CLI::App& part, const std::string& version) {
  part.set_help_flag("-h,--help", "Print this help and exit");
  part.set_version_flag("--version", version, "Print the version and exit");
}

CLI::Option* addPath(CLI::App& command, const std::string& name,
                     std::optional<std::string>& destination, const std::string& placeholder,
                     const std::string& description) {
  return command
      .add_option_function<std::string>(
          name, [&destination](const std::string& value) { destination = value; }, description)
      ->option_text(placeholder)
      ->check(requireText);
}

void addDevice(CLI::App& command, std::string& root, std::optional<std::string>& home) {
  command.add_option("--root", root, "The device root: / or the directory of an image")
      ->option_text("DIR")
      ->required()
      ->check(requireText);
  addPath(command, "--home", home, "DIR",
          "The mobile user's home directory, a device path (default /var/mobile)")
      ->check(requireDevicePath);
}

}  // namespace accounts
