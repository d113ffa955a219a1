#include "accountsettings/MailServices.h"

#include <array>

#include "accountsettings/Log.h"
#include "accountsettings/Process.h"

namespace accounts {

namespace {

constexpr std::string_view kResourceName = "MailServices";
constexpr std::string_view kOperationName = "MailServices::current";

struct ServiceKey {
  std::string_view key;
  std::string MailServices::*name;
};

constexpr std::array<ServiceKey, 7> kServiceKeys = {{
    {"Gmail User Domain", &MailServices::gmailUserDomain},
    {"Gmail IMAP Host", &MailServices::gmailIMAPHost},
    {"Yahoo IMAP Host", &MailServices::yahooIMAPHost},
    {"Google CalDAV Host", &MailServices::googleCalDAVHost},
    {"Yahoo CalDAV Host", &MailServices::yahooCalDAVHost},
    {"Earliest Hosted Domain", &MailServices::earliestHostedDomain},
    {"Later Hosted Domain", &MailServices::laterHostedDomain},
}};

MailServices readMailServices() {
  BundleResources& resources = Process::current().platform.bundleResources;
  if (!resources.hasPropertyList(kResourceName)) {
    failAssertion(kOperationName, kMailServicesSourceFile, "Could not find MailServices.plist");
  }
  const std::optional<PropertyDictionary> table = resources.readPropertyList(kResourceName);
  if (!table) {
    failAssertion(kOperationName, kMailServicesSourceFile, "Could not load MailServices.plist");
  }
  MailServices services;
  for (const ServiceKey& service : kServiceKeys) {
    const std::optional<Text> name = table->textForKey(service.key);
    // An empty name would match every mail directory and every account without a server.
    if (!name || name->empty()) {
      failAssertion(kOperationName, kMailServicesSourceFile,
                    "Malformed MailServices information. Could not find the %@", {service.key});
    }
    services.*service.name = name->string();
  }
  return services;
}

}  // namespace

const MailServices& MailServices::current() {
  return Process::current().mailServices.get(readMailServices);
}

}  // namespace accounts
