// Tries everything that can go wrong on a device, case by case, against the real plug-in on the
// real Linux platform over a simulated disk. docs/testing.md says how to repeat one case.

#include <CLI/CLI.hpp>
#include <array>
#include <exception>
#include <iostream>

#include "tests/campaign/Campaigns.h"

namespace {

using accounts::Scenario;
using accounts::Selection;

struct NamedCampaign {
  std::string_view name;
  bool (*run)(const std::vector<Scenario>&, const Selection&);
};

constexpr std::array kCampaigns = {
    NamedCampaign{"faults", accounts::runFaultCampaign},
    NamedCampaign{"kills", accounts::runKillCampaign},
    NamedCampaign{"power-loss", accounts::runPowerLossCampaign},
    NamedCampaign{"allocations", accounts::runAllocationCampaign},
    NamedCampaign{"interludes", accounts::runInterludeCampaign},
    NamedCampaign{"other-programs", accounts::runOtherProgramsCampaign},
    NamedCampaign{"handover", accounts::runHandoverCampaign},
};

int runSelected(const std::string& campaign, const Selection& selection) {
  const std::vector<Scenario> scenarios = accounts::allScenarios(selection.host);
  for (const NamedCampaign& each : kCampaigns) {
    if (each.name == campaign) {
      return each.run(scenarios, selection) ? 0 : 1;
    }
  }
  std::cerr << "campaign: there is no campaign \"" << campaign << "\"\n";
  return 64;
}

}  // namespace

int main(int argumentCount, char** arguments) {
  CLI::App application("Tries everything that can go wrong on a device, case by case.");
  std::string campaign;
  Selection selection;
  application
      .add_option("campaign", campaign,
                  "faults, kills, power-loss, allocations, interludes, other-programs "
                  "or handover")
      ->required();
  bool isBare = false;
  application.add_flag("--bare", isBare, "the plug-in alone on the device");
  application.add_option("--scenario", selection.scenario, "only this scenario");
  application.add_option("--operation", selection.operation, "only this operation");
  application.add_option("--fault", selection.fault, "only this fault");
  application.add_option("--every", selection.every, "only every n-th case")
      ->check(CLI::PositiveNumber);
  CLI11_PARSE(application, argumentCount, arguments);
  selection.host = isBare ? Scenario::Host::Bare : Scenario::Host::Transaction;
  try {
    return runSelected(campaign, selection);
  } catch (const std::exception& exception) {
    std::cerr << "campaign: " << exception.what() << '\n';
    return 70;
  }
}
