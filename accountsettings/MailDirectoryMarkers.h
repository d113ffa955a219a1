#pragma once

#include <array>
#include <string>
#include <string_view>

#include "accountsettings/MailServices.h"

namespace accounts {

/// A text in the path of a mail directory that tells the class of the account it belongs to.
struct MailDirectoryMarker {
  std::string marker;
  std::string_view accountClass;
};

/// The markers in the order in which they are tested: the first that occurs anywhere in the path
/// decides, wherever in the path it stands.
using MailDirectoryMarkers = std::array<MailDirectoryMarker, 8>;

MailDirectoryMarkers makeMailDirectoryMarkers(const MailServices& services);

/// The class that a mail directory's path tells, empty when no marker occurs in it.
std::string_view mailClassForDirectory(const MailDirectoryMarkers& markers, std::string_view path);

}  // namespace accounts
