#include <CLI/CLI.hpp>
#include <cstdio>
#include <map>

#include "bench/DeviceRootGenerator.h"

// Writes a generated device root for benchmarks and for trying things out.

namespace {

constexpr const char* kDescription =
    "Write a device root with a generated account settings file: every account type, accounts\n"
    "for every upgrade step, child accounts under every fourth. The same arguments always give\n"
    "the same files. The user \"mobile\" of the root is the current user.";

constexpr const char* kExamples =
    "Examples:\n"
    "  make-device-root --root /tmp/image --accounts 1000\n"
    "  make-device-root --root /tmp/image --accounts 20 --version 7 --legacy both\n";

enum ExitStatus { Success = 0, UnusableArguments = 64, CannotCreate = 73 };

}  // namespace

int main(int argumentCount, char** arguments) {
  using accounts::LegacyStores;
  const std::map<std::string, LegacyStores> legacyNames = {{"none", LegacyStores::None},
                                                           {"mail", LegacyStores::Mail},
                                                           {"exchange", LegacyStores::Exchange},
                                                           {"both", LegacyStores::Both}};
  accounts::DeviceRootDescription description;
  CLI::App program(kDescription, "make-device-root");
  program.footer(kExamples);
  program.add_option("--root", description.root, "The directory to write")
      ->option_text("DIR")
      ->required();
  program.add_option("--accounts", description.accountCount, "Top-level accounts")
      ->option_text("N")
      ->required();
  program.add_option("--version", description.version, "The stored version (default 0)")
      ->option_text("V");
  program
      .add_option("--legacy", description.legacyStores,
                  "Legacy stores, with an account for every four: none (default), mail, exchange\n"
                  "or both")
      ->option_text("STORES")
      ->transform(CLI::Transformer(legacyNames));
  try {
    program.parse(argumentCount, arguments);
  } catch (const CLI::Success& request) {
    return program.exit(request);
  } catch (const CLI::Error& error) {
    program.exit(error);
    return UnusableArguments;
  }

  if (const auto failure = accounts::writeDeviceRoot(description)) {
    std::fprintf(stderr, "make-device-root: %s\n", failure->c_str());
    return CannotCreate;
  }
  return Success;
}
