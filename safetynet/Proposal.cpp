#include "safetynet/Proposal.h"

#include <algorithm>
#include <array>

#include "safetynet/FlatBytes.h"

namespace accounts {
namespace {

using Action = ProposedChange::Action;

constexpr std::uint32_t kFirstMark = 0x41434d31;
constexpr std::uint32_t kEndMark = 0x444f4e45;
constexpr std::size_t kLongestName = 100;

/// In what way a place can be changed; those that are not here cannot be.
struct Allowed {
  DevicePlace place;
  Action action;
};
constexpr Allowed kAllowed[] = {{DevicePlace::Settings, Action::Write},
                                {DevicePlace::LegacyExchange, Action::Remove},
                                {DevicePlace::LegacyExchangeOriginal, Action::Remove},
                                {DevicePlace::LegacyMail, Action::Remove},
                                {DevicePlace::LegacyMailOriginal, Action::Remove},
                                {DevicePlace::RemovalSentinel, Action::Remove},
                                {DevicePlace::CopyAside, Action::CopySettings},
                                {DevicePlace::CopyAside, Action::Remove},
                                {DevicePlace::AutoFetchEnabled, Action::Remove},
                                {DevicePlace::InformationDirectory, Action::Write},
                                {DevicePlace::InformationDirectory, Action::MakeDirectory},
                                {DevicePlace::CommitRecord, Action::Write},
                                {DevicePlace::CommitRecord, Action::Remove}};

bool isNameOfInformationFile(std::string_view name) {
  return name.starts_with(kInformationFilePrefix) && name.ends_with(kInformationFileSuffix) &&
         std::ranges::all_of(name, [](char each) {
           return (each >= '0' && each <= '9') || (each >= 'A' && each <= 'Z') ||
                  (each >= 'a' && each <= 'z') || each == '-' || each == '.';
         });
}

ProposedChange takeChange(FlatReader& reader, std::uint64_t memoryFileSize) {
  ProposedChange change;
  const auto place = reader.take<std::uint8_t>();
  const auto action = reader.take<std::uint8_t>();
  change.offset = reader.take<std::uint64_t>();
  change.length = reader.take<std::uint64_t>();
  if (reader.takeBoolean()) {
    change.owner.emplace();
    change.owner->user = reader.take<std::uint32_t>();
    change.owner->group = reader.take<std::uint32_t>();
  }
  const auto* const allowed = std::ranges::find_if(kAllowed, [&](const Allowed& each) {
    return indexOf(each.place) == place && static_cast<std::uint8_t>(each.action) == action;
  });
  const bool isWithin =
      change.offset <= memoryFileSize && change.length <= memoryFileSize - change.offset;
  if (allowed == std::end(kAllowed) || !isWithin ||
      (change.owner && allowed->place != DevicePlace::Settings)) {
    reader.refuse();
  } else {
    change.place = allowed->place;
    change.action = allowed->action;
  }
  return change;
}

/// A status that a migration may end with.
ExitStatus takeStatus(FlatReader& reader) {
  constexpr std::array kStatuses = {
      ExitStatus::Success,           ExitStatus::MigrationFailed,  ExitStatus::NotVerified,
      ExitStatus::NotAllCarriedOver, ExitStatus::MissingInput,     ExitStatus::PluginEnded,
      ExitStatus::InputOutputError,  ExitStatus::TemporaryFailure, ExitStatus::CannotCreate};
  const auto status = static_cast<ExitStatus>(reader.take<std::uint8_t>());
  if (std::ranges::find(kStatuses, status) == kStatuses.end()) {
    reader.refuse();
  }
  return status;
}

}  // namespace

const ProposedChange* Proposal::changeOf(DevicePlace place) const {
  const auto found = std::ranges::find(changes, place, &ProposedChange::place);
  return found != changes.end() ? &*found : nullptr;
}

std::string bytesOf(const Proposal& proposal) {
  FlatWriter writer;
  writer.add(kFirstMark);
  writer.add(static_cast<std::uint8_t>(proposal.status));
  writer.add(static_cast<std::uint8_t>(proposal.keepsFiles));
  writer.add(static_cast<std::uint8_t>(proposal.recordStays));
  writer.addText(proposal.informationFileName);
  writer.add(static_cast<std::uint8_t>(proposal.changes.size()));
  for (const ProposedChange& each : proposal.changes) {
    writer.add(static_cast<std::uint8_t>(each.place));
    writer.add(static_cast<std::uint8_t>(each.action));
    writer.add(each.offset);
    writer.add(each.length);
    writer.add(static_cast<std::uint8_t>(each.owner.has_value()));
    if (each.owner) {
      writer.add(each.owner->user);
      writer.add(each.owner->group);
    }
  }
  writer.add(kEndMark);
  return writer.take();
}

std::optional<Proposal> proposalFrom(std::string_view bytes, std::uint64_t memoryFileSize) {
  FlatReader reader(bytes);
  Proposal proposal;
  if (reader.take<std::uint32_t>() != kFirstMark) {
    reader.refuse();
  }
  proposal.status = takeStatus(reader);
  proposal.keepsFiles = reader.takeBoolean();
  proposal.recordStays = reader.takeBoolean();
  proposal.informationFileName = reader.takeText(kLongestName);
  const auto count = reader.take<std::uint8_t>();
  for (unsigned number = 0; number < count && reader.isGood(); ++number) {
    const ProposedChange change = takeChange(reader, memoryFileSize);
    if (proposal.changeOf(change.place) != nullptr) {
      reader.refuse();
    }
    proposal.changes.push_back(change);
  }
  const ProposedChange* const information = proposal.changeOf(DevicePlace::InformationDirectory);
  const bool hasInformation = information != nullptr && information->action == Action::Write;
  if (hasInformation ? !isNameOfInformationFile(proposal.informationFileName)
                     : !proposal.informationFileName.empty()) {
    reader.refuse();
  }
  if (reader.take<std::uint32_t>() != kEndMark || !reader.isAtEnd() || !reader.isGood()) {
    return std::nullopt;
  }
  return proposal;
}

}  // namespace accounts
