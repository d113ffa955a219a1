#pragma once

#include <filesystem>
#include <string>

namespace accounts {

/// The plug-in's bundle of the running program.
std::filesystem::path bundleOfProgram();

/// The plug-in's bundle of a program in a directory: the one beside the program, as in a build, or
/// else the one in ../lib/accounts, as in an installed system. The path of the former where there
/// is neither.
std::filesystem::path bundleOfProgramIn(const std::filesystem::path& directory);

/// The directory of a bundle's resources.
std::filesystem::path resourcesOfBundle(const std::filesystem::path& bundle);

}  // namespace accounts
