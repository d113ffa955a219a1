#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <stdexcept>
#include <string>

#include "platform/MigrationPluginBase.h"
#include "platform/Platform.h"

namespace accounts {
namespace {

// The ways to misbehave, chosen by the environment variable MISBEHAVIOUR.
const std::map<std::string, bool (*)()> behaviours = {
    {"abort",
     [] {
       std::abort();
       return false;
     }},
    {"kill", [] { return std::raise(SIGKILL) == 0; }},
    {"throw", []() -> bool { throw std::runtime_error("thrown by the plug-in"); }},
    {"exit",
     [] {
       std::exit(0);
       return false;
     }},
    {"fail", [] { return false; }},
    {"print", [] { return std::puts("printed by the plug-in") >= 0; }},
};

std::string chosenBehaviour() {
  const char* const behaviour = std::getenv("MISBEHAVIOUR");
  return behaviour != nullptr ? behaviour : "";
}

class MisbehavingPlugin : public MigrationPluginBase {
 public:
  std::string dataClassName() override { return "misbehaviour"; }
  bool performMigration() override { return behaviours.at(chosenBehaviour())(); }
};

}  // namespace
}  // namespace accounts

extern "C" accounts::MigrationPluginBase* CreateMigrationPlugin(accounts::Platform& /*platform*/) {
  return accounts::chosenBehaviour() == "no instance" ? nullptr : new accounts::MisbehavingPlugin();
}
