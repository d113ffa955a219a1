#include <algorithm>
#include <limits>

#include "fuzz/FuzzInput.h"
#include "fuzz/FuzzTarget.h"
#include "safetynet/Proposal.h"
#include "vocabulary/DevicePlaces.h"

namespace accounts {
namespace {

using Action = ProposedChange::Action;

/// Whether a place may be changed so, told in another way than reading it does: what people wrote
/// goes nowhere but to a new settings file, and nothing else is made but what is the host's own.
bool isAllowed(DevicePlace place, Action action) {
  switch (place) {
    case DevicePlace::Settings:
      return action == Action::Write;
    case DevicePlace::CopyAside:
      return action == Action::CopySettings || action == Action::Remove;
    case DevicePlace::InformationDirectory:
      return action == Action::Write || action == Action::MakeDirectory;
    case DevicePlace::CommitRecord:
      return action == Action::Write || action == Action::Remove;
    case DevicePlace::LoggingPreferences:
      return false;
    default:
      return indexOf(place) < kDevicePlaceCount && action == Action::Remove;
  }
}

void requireAllowed(const Proposal& proposal, std::uint64_t memoryFileSize) {
  for (const ProposedChange& each : proposal.changes) {
    require(isAllowed(each.place, each.action), "a place of the list is changed as it may be");
    require(std::ranges::count(proposal.changes, each.place, &ProposedChange::place) == 1,
            "a place is changed once");
    require(each.length <= std::numeric_limits<std::uint64_t>::max() - each.offset &&
                each.offset + each.length <= memoryFileSize,
            "contents lie within the memory file");
    require(!each.owner || each.place == DevicePlace::Settings,
            "the settings file alone is given away");
  }
  const std::string_view name = proposal.informationFileName;
  require(name.empty() || (name.starts_with(kInformationFilePrefix) &&
                           name.find_first_of(std::string_view("/\0", 2)) == name.npos),
          "a name is one of an information file, in its directory");
}

}  // namespace

/// Any bytes are no proposal, or one that touches nothing but what a migration may, and that says
/// all that the bytes say.
void runOneInput(std::string_view bytes) {
  FuzzInput input(bytes);
  const std::uint64_t memoryFileSize = input.number();
  const std::string_view list = bytes.substr(std::min(bytes.size(), sizeof memoryFileSize));
  if (const std::optional<Proposal> proposal = proposalFrom(list, memoryFileSize)) {
    requireAllowed(*proposal, memoryFileSize);
    require(bytesOf(*proposal) == list, "a proposal is written as it was read");
  }
}

}  // namespace accounts
