#pragma once

#include <string>

namespace accounts {

/// Names of outside mail and calendar services, as the bundle's "MailServices" resource gives them.
struct MailServices {
  std::string gmailUserDomain;
  std::string gmailIMAPHost;
  std::string yahooIMAPHost;
  std::string googleCalDAVHost;
  std::string yahooCalDAVHost;
  /// The mail domains of the hosted service: its earliest ("MarrowAccount") and its later one
  /// ("VelmoraAccount").
  std::string earliestHostedDomain;
  std::string laterHostedDomain;

  /// The current process's services, read once. A missing or unreadable resource is a fatal
  /// assertion: without these names accounts would silently be matched and completed wrongly.
  static const MailServices& current();
};

}  // namespace accounts
