#include "accountsctl/JSONText.h"

#include <utility>

namespace accounts {

JSON reportObject(std::string_view subcommand) {
  return {{"command", subcommand}};
}

std::string lineOf(JSON object, ExitStatus exitStatus) {
  object["exitStatus"] = static_cast<int>(exitStatus);
  return lineOf(object) + "\n";
}

}  // namespace accounts
