#pragma once

#include "accountsettings/BasicAccount.h"
#include "migrator/CalDAVEndpoints.h"

namespace accounts {

/// Where an account of the class "MobileCalDAVAccount" keeps its calendars.
CalDAVEndpoint calDAVEndpointOf(const BasicAccount& calDAVAccount);

/// Where the calendars of a mail account are expected; nowhere for a class whose service has no
/// calendars and for an account without a user name.
ExpectedCalDAV expectedCalDAVOf(const BasicAccount& umbrellaAccount);

}  // namespace accounts
