#include <dlfcn.h>

#include <clocale>

#include "tests/program/plugins/Attempts.h"

// To be loaded before a program's own libraries: in the place of the functions with which its
// decoders of XML and of JSON begin, it tries to do what no decoder does. So does a decoder that
// was taken over by what it read.

namespace {

template <class Function>
Function* original(const char* name) {
  return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

}  // namespace

extern "C" void* XML_ParserCreate(const char* encoding) {
  accounts::makeAttempt();
  return original<void*(const char*)>("XML_ParserCreate")(encoding);
}

extern "C" lconv* localeconv() noexcept {
  accounts::makeAttempt();
  return original<lconv*()>("localeconv")();
}
