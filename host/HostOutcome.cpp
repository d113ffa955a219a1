#include "host/HostOutcome.h"

#include <utility>
#include <variant>

namespace accounts {

HostOutcome failedOutcome(const ProgramError& error) {
  return {reportOf(error), {}};
}

HostOutcome outcomeOf(PluginOutcome plugin) {
  return {reportOf(std::move(plugin.report)), std::move(plugin.recorded)};
}

HostOutcome outcomeOnDevice(
    const DeviceOptions& options,
    const std::function<HostOutcome(const OpenedDevice& device, StopSignals& stop)>& command) {
  StopSignals stop;
  const std::variant<OpenedDevice, ProgramError> opened = openDevice(options);
  const auto* error = std::get_if<ProgramError>(&opened);
  HostOutcome outcome =
      error != nullptr ? failedOutcome(*error) : command(std::get<OpenedDevice>(opened), stop);
  outcome.report.root = options.root;
  return outcome;
}

}  // namespace accounts
