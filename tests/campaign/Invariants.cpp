#include "tests/campaign/Invariants.h"

#include "tests/campaign/BareInvariants.h"
#include "tests/campaign/RestorationInvariants.h"
#include "tests/campaign/TransactionInvariants.h"

namespace accounts {

std::unique_ptr<Invariants> Invariants::of(const Scenario& scenario) {
  if (scenario.action == Scenario::Action::Restoration) {
    return std::make_unique<RestorationInvariants>(scenario);
  }
  if (scenario.host == Scenario::Host::Transaction) {
    return std::make_unique<TransactionInvariants>(scenario);
  }
  return std::make_unique<BareInvariants>(scenario);
}

}  // namespace accounts
