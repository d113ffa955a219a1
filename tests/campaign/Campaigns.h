#pragma once

#include <vector>

#include "tests/campaign/Report.h"
#include "tests/campaign/Scenario.h"

namespace accounts {

/// Each system call of each scenario fails in every way, once and from then on; then the action is
/// run again to its end.
bool runFaultCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

/// The process is killed before and after each system call of each scenario; then the action is
/// run again, killed again at each of its calls, and run to its end.
bool runKillCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

/// The power fails after each change that a scenario makes to the disk, with everything that the
/// disk may then hold (PowerLoss.h); then the action is run again to its end.
bool runPowerLossCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

/// The process is killed before each system call of each scenario; then something happens on the
/// device (a file comes back from a backup, another program writes, and so on), and the action is
/// run again, killed again at each of its calls, and run to its end.
bool runInterludeCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

/// Another program writes, replaces, removes or brings back a file of the migration before each
/// system call of each scenario, once or again and again.
bool runOtherProgramsCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

/// The worker ends after each byte that it hands over in each scenario, or hands over less than it
/// says.
bool runHandoverCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

/// Each allocation of the codecs and of each scenario fails; then the action is run again to its
/// end.
bool runAllocationCampaign(const std::vector<Scenario>& scenarios, const Selection& selection);

}  // namespace accounts
