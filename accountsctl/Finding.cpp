#include "accountsctl/Finding.h"

namespace accounts {

std::string_view nameOf(Effect effect) {
  switch (effect) {
    case Effect::Dropped:
      return "dropped";
    case Effect::Repaired:
      return "repaired";
    case Effect::Ignored:
      return "ignored";
    case Effect::Refused:
      return "refused";
    case Effect::Noted:
      return "noted";
  }
  return "";
}

}  // namespace accounts
