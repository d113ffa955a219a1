#include "tests/campaign/Intruder.h"

#include "tests/campaign/DeviceProcess.h"
#include "tests/campaign/LegacyStores.h"
#include "tests/campaign/SettingsContents.h"

namespace accounts {

void Intruder::operator()(OtherProgram& program) {
  const std::string path = pathOf(act_.place);
  switch (act_.act) {
    case Act::Replaces:
      program.replace(path, next(program.disk()));
      break;
    case Act::ReplacesBlindly:
      program.replace(path, next(before_));
      break;
    case Act::Writes:
      program.writeInPlace(path, next(program.disk()));
      break;
    case Act::Removes:
      program.remove(path);
      break;
    case Act::BringsBack:
      program.bringBack(path, before_);
      break;
  }
  ++times_;
}

std::string Intruder::next(const SimulatedDisk& disk) {
  const std::string identifier = "OTHER-" + std::to_string(times_ + 1);
  const auto contents = disk.contentsOf(pathOf(act_.place));
  std::string& bytes = writings_[{act_.place, contents, identifier}];
  if (bytes.empty()) {
    bytes = with(contents, identifier);
  }
  written_ = bytes;
  return bytes;
}

std::string Intruder::with(const std::optional<std::string>& contents,
                           const std::string& identifier) const {
  switch (act_.place) {
    case DevicePlace::LegacyMail:
      return withFurtherMailAccount(contents, identifier);
    case DevicePlace::LegacyExchange:
      return withFurtherExchangeAccount(contents, identifier);
    default:
      return withFurtherAccount(contents, identifier);
  }
}

}  // namespace accounts
