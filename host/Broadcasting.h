#pragma once

#include "host/RunReport.h"

namespace accounts {

/// Announces on the system's D-Bus what a migration announced. That the bus cannot be told is a
/// warning of the report and nothing more: the migration is done.
void broadcastOnDBus(RunReport& report);

}  // namespace accounts
