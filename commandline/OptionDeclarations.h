#pragma once

#include <CLI/App.hpp>
#include <optional>
#include <string>

namespace accounts {

/// What is wrong with a value that must not be empty; empty when nothing is.
std::string requireText(const std::string& value);
/// What is wrong with a value that must be an absolute path of a device; empty when nothing is.
std::string requireDevicePath(const std::string& value);
/// What is wrong with a value that must be a whole number of at most nine digits; empty when
/// nothing is.
std::string requireCount(const std::string& value);

/// Declares --help and --version of a program or of one of its subcommands.
void addHelpAndVersion(CLI::App& part, const std::string& version);

/// Declares an option with a path that must not be empty. In the help, `placeholder` stands for it.
CLI::Option* addPath(CLI::App& command, const std::string& name,
                     std::optional<std::string>& destination, const std::string& placeholder,
                     const std::string& description);

/// Declares the options that say which device is meant: the root, which is needed, and the mobile
/// user's home directory.
void addDevice(CLI::App& command, std::string& root, std::optional<std::string>& home);

}  // namespace accounts
