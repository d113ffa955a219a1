#pragma once

#include "platform/MigrationPluginBase.h"
#include "platform/Platform.h"

extern "C" {
/// The bundle's entry point: a new instance of the principal class, which the caller destroys with
/// `delete`. The platform must stay alive as long as the plug-in is loaded.
accounts::MigrationPluginBase* CreateMigrationPlugin(accounts::Platform& platform);
}
