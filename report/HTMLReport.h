#pragma once

#include <string>
#include <string_view>

namespace accounts {

/// The report of a migration as one HTML page that needs nothing else: no network, no other file.
/// `reportJSON` is the report as one JSON object in UTF-8 (docs/json.md). Whatever its texts hold
/// stays text: nothing in them can end the JSON within the page or be run. One of more than 4 MiB
/// is compressed, and the page expands it itself. A text that is no JSON gives a page that says so
/// when it is opened.
std::string htmlReport(std::string_view reportJSON);

}  // namespace accounts
