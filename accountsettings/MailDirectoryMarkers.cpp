#include "accountsettings/MailDirectoryMarkers.h"

#include <algorithm>

namespace accounts {

MailDirectoryMarkers makeMailDirectoryMarkers(const MailServices& services) {
  return {{
      {"Mail/Dorsa-", "MarrowAccount"},
      {"Mail/Velmora-", "VelmoraAccount"},
      {"Mail/AOL-", "AOLAccount"},
      {"Mail/Mailboxes", "LocalAccount"},
      {services.gmailUserDomain + "@" + services.gmailIMAPHost, "GmailAccount"},
      {"@" + services.yahooIMAPHost, "YahooAccount"},
      {"Mail/POP-", "POPAccount"},
      {"Mail/IMAP-", "IMAPAccount"},
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
