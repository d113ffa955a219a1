#include "accountsettings/MailDirectoryMarkers.h"

#include <algorithm>

#include "vocabulary/AccountClasses.h"

namespace accounts {

MailDirectoryMarkers makeMailDirectoryMarkers(const MailServices& services) {
  return {{
      {"Mail/Dorsa-", kMarrowAccountClass},
      {"Mail/Velmora-", kVelmoraAccountClass},
      {"Mail/AOL-", kAOLAccountClass},
      {"Mail/Mailboxes", kLocalMailAccountClass},
      {services.gmailUserDomain + "@" + services.gmailIMAPHost, kGmailAccountClass},
      {"@" + services.yahooIMAPHost, kYahooAccountClass},
      {"Mail/POP-", kPOPAccountClass},
      {"Mail/IMAP-", kIMAPAccountClass},
  }};
}

std::string_view mailClassForDirectory(const MailDirectoryMarkers& markers, std::string_view path) {
  const auto* found =
      std::find_if(markers.begin(), markers.end(), [&](const MailDirectoryMarker& candidate) {
        return path.find(candidate.marker) != std::string_view::npos;
      });
  return found != markers.end() ? found->accountClass : std::string_view();
}

}  // namespace accounts
