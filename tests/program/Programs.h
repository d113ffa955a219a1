#pragma once

#include <string>

namespace accounts {

// What the tests run: the programs of the build, or those of an installed system if the environment
// variable ACCOUNTS_INSTALLED_PREFIX names its prefix.

/// The path of migration-host.
std::string migrationHost();
/// The path of accountsctl.
std::string accountsctl();
/// The path of the plug-in's bundle.
std::string pluginBundle();

}  // namespace accounts
