#include "accountsettings/MailServices.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tests/fakes/FakePlatform.h"

namespace accounts {
namespace {

constexpr const char* servicesResource = "MailServices";

TEST(MailServices, TheBundleNamesEveryService) {
  FakeProcess device;

  const MailServices& services = MailServices::current();

  EXPECT_EQ(services.gmailUserDomain, "gmail.com");
  EXPECT_EQ(services.gmailIMAPHost, "imap.gmail.com");
  EXPECT_EQ(services.yahooIMAPHost, "imap.mail.yahoo.com");
  EXPECT_EQ(services.googleCalDAVHost, "www.google.com");
  EXPECT_EQ(services.yahooCalDAVHost, "caldav.calendar.yahoo.com");
  EXPECT_EQ(services.earliestHostedDomain, "marrow.example");
  EXPECT_EQ(services.laterHostedDomain, "velmora.example");
}

TEST(MailServices, TheyAreReadOnceAProcess) {
  FakeProcess device;

  const MailServices& first = MailServices::current();
  const MailServices& second = MailServices::current();

  EXPECT_EQ(&first, &second);
  const std::vector<std::string>& reads = device.bundleResources.reads;
  EXPECT_EQ(std::count(reads.begin(), reads.end(), servicesResource), 1);
}

TEST(MailServicesDeathTest, AMissingResourceEndsTheProcess) {
  FakeProcess device;
  device.bundleResources.replaced[servicesResource] = std::nullopt;
  EXPECT_DEATH(MailServices::current(), "MailServices: Could not find MailServices.plist");
}

TEST(MailServicesDeathTest, AnUnreadableResourceEndsTheProcess) {
  FakeProcess device;
  device.bundleResources.unreadable.insert(servicesResource);
  EXPECT_DEATH(MailServices::current(), "MailServices: Could not load MailServices.plist");
}

TEST(MailServicesDeathTest, AMissingNameEndsTheProcessAndIsNamed) {
  FakeProcess device;
  PropertyDictionary incomplete = *device.bundleResources.readPropertyList(servicesResource);
  incomplete.remove("Yahoo IMAP Host");
  device.bundleResources.replaced[servicesResource] = incomplete;
  EXPECT_DEATH(
      MailServices::current(),
      "MailServices: Malformed MailServices information. Could not find the Yahoo IMAP Host");
}

TEST(MailServicesDeathTest, AnEmptyNameCountsAsMissing) {
  FakeProcess device;
  PropertyDictionary services = *device.bundleResources.readPropertyList(servicesResource);
  services.set("Gmail IMAP Host", "");
  device.bundleResources.replaced[servicesResource] = services;
  EXPECT_DEATH(MailServices::current(), "Could not find the Gmail IMAP Host");
}

}  // namespace
}  // namespace accounts
