#pragma once

#include <filesystem>
#include <string>

namespace accounts {

/// The plug-in's bundle beside the running program.
std::filesystem::path bundleBesideProgram();

/// The directory of a bundle's resources.
std::filesystem::path resourcesOfBundle(const std::filesystem::path& bundle);

}  // namespace accounts
