#include "host/Announcements.h"

#include "platform/linux/DBusBroadcast.h"
#include "safetynet/FlatBytes.h"

namespace accounts {
namespace {

constexpr std::size_t kLongestText = 4096;

}  // namespace

std::string bytesOf(const Announcements& announcements) {
  FlatWriter writer;
  writer.add(static_cast<std::uint64_t>(announcements.cloudTabs));
  writer.add(static_cast<std::uint32_t>(announcements.broadcasts.size()));
  for (const PreferencesChange& each : announcements.broadcasts) {
    writer.addText(each.application);
    writer.addText(each.key);
  }
  return writer.take();
}

std::optional<Announcements> announcementsFrom(std::string_view bytes) {
  FlatReader reader(bytes);
  Announcements announcements;
  announcements.cloudTabs = static_cast<std::size_t>(reader.take<std::uint64_t>());
  const auto count = reader.take<std::uint32_t>();
  for (std::uint32_t number = 0; number < count && reader.isGood(); ++number) {
    std::string application = reader.takeText(kLongestText);
    std::string key = reader.takeText(kLongestText);
    announcements.broadcasts.push_back({std::move(application), std::move(key)});
  }
  return reader.isGood() && reader.isAtEnd() ? std::optional(std::move(announcements))
                                             : std::nullopt;
}

std::optional<std::string> broadcastOnDBus(const Announcements& announcements) {
  DBusBroadcast bus({.address = systemBusAddress()});
  for (const PreferencesChange& change : announcements.broadcasts) {
    bus.announceChange(change.application, change.key);
  }
  for (std::size_t count = 0; count < announcements.cloudTabs; ++count) {
    bus.announce(CloudTabs::On);
  }
  const Result delivered = bus.deliver();
  return delivered ? std::nullopt
                   : std::optional("Nobody was told of the changes: " + delivered.error().text);
}

}  // namespace accounts
