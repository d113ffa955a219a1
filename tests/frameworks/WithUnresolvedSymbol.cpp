#include "platform/AccountFramework.h"

// A framework that needs a function which no library has.
extern "C" void functionThatNobodyDefines();

void RegisterClasses(accounts::ClassRegistry&) {
  functionThatNobodyDefines();
}
