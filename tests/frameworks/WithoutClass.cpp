#include "platform/AccountFramework.h"

// A framework that registers nothing.
void RegisterClasses(accounts::ClassRegistry& /*registry*/) {}
