#include "tests/program/Programs.h"

#include <cstdlib>

namespace accounts {
namespace {

std::string installedOr(const char* pathInPrefix, const char* pathInBuild) {
  const char* prefix = std::getenv("ACCOUNTS_INSTALLED_PREFIX");
  return prefix != nullptr ? prefix + std::string(pathInPrefix) : pathInBuild;
}

}  // namespace

std::string migrationHost() {
  return installedOr("/bin/migration-host", MIGRATION_HOST);
}

std::string accountsctl() {
  return installedOr("/bin/accountsctl", ACCOUNTSCTL);
}

std::string pluginBundle() {
  return installedOr("/lib/accounts/accounts.migrator", PLUGIN_BUNDLE);
}

}  // namespace accounts
