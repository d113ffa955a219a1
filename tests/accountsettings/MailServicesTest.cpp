#include "accountsettings/MailServices.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tests/fakes/FakePlatform.h"

namespace accounts {
namespace {

constexpr const char* kServicesResource = "MailServices";

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
  EXPECT_EQ(std::count(reads.begin(), reads.end(), kServicesResource), 1);
}

TEST(MailServicesDeathTest, AMissingResourceEndsTheProcess) {
  FakeProcess device;
  device.bundleResources.replaced[kServicesResource] = std::nullopt;
  EXPECT_DEATH(MailServices::current(), "MailServices: Could not find MailServices.plist");
}

TEST(MailServicesDeathTest, AnUnreadableResourceEndsTheProcess) {
  FakeProcess device;
  device.bundleResources.unreadable.insert(kServicesResource);
  EXPECT_DEATH(MailServices::current(), "MailServices: Could not load MailServices.plist");
}

TEST(MailServicesDeathTest, AMissingNameEndsTheProcessAndIsNamed) {
  FakeProcess device;
  PropertyDictionary incomplete = *device.bundleResources.readPropertyList(kServicesResource);
  incomplete.remove("Yahoo IMAP Host");
  device.bundleResources.replaced[kServicesResource] = incomplete;
  EXPECT_DEATH(
      MailServices::current(),
      "MailServices: Malformed MailServices information. Could not find the Yahoo IMAP Host");
}

TEST(MailServicesDeathTest, AnEmptyNameCountsAsMissing) {
  FakeProcess device;
  PropertyDictionary services = *device.bundleResources.readPropertyList(kServicesResource);
  services.set("Gmail IMAP Host", "");
  device.bundleResources.replaced[kServicesResource] = services;
  EXPECT_DEATH(MailServices::current(), "Could not find the Gmail IMAP Host");
}

}  // namespace
}  // namespace accounts
