#pragma once

#include <string>

#include "accountsctl/FleetSummary.h"

namespace accounts {

/// A page for a browser over all images of a fleet: how many came out how, and each image with its
/// outcome, what a person should know, how long it took, and a link to the page of its report where
/// there is one. Images that need a person come first. `directory` is where the page will be, an
/// absolute path, from which links lead.
std::string fleetPage(const FleetSummary& summary, const std::string& directory);

}  // namespace accounts
