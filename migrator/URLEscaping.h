#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// A text as one component of a URL's path: letters, digits and -_.~!*'();:&=+$, stand as they are,
/// every other byte becomes "%" and two upper-case hexadecimal digits.
std::string urlEscapedComponent(std::string_view text);

}  // namespace accounts
