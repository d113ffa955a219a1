#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

namespace accounts {

/// How a person looks at a page.
struct View {
  enum class Colours { light, dark };
  enum class Scripts { allowed, forbidden };

  Colours colours = Colours::light;
  /// In pixels. A browser's own window has a least width, so the page is in a frame of this one.
  int width = 1280;
  Scripts scripts = Scripts::allowed;
};

/// What a browser made of a page.
struct Visit {
  /// What the driver noted, by name.
  nlohmann::json noted;
  /// What the page wrote to the console: nothing, unless something is wrong.
  std::vector<std::string> consoleLines;
};

/// Opens a page in a browser without a window, and does there what a person would do. `driver` is
/// the body of an asynchronous function of JavaScript. It has
/// - `page`, the page's document, and `view`, its window;
/// - `all(selector)` and `one(selector)`, the elements;
/// - `note(name, value)`, for what the test wants to look at;
/// - `await enter(text)`, which types it into the filter, `press(key)` and `await pause()`, after
/// which
///   the page has done what it was about to do.
/// A driver that does not come to its end fails the test.
Visit visitPage(const std::string& html, const std::string& driver, const View& view = {});

/// As visitPage, for a page that writes nothing to the console; anything else fails the test.
nlohmann::json notedOn(const std::string& html, const std::string& driver, const View& view = {});

/// How many sheets of paper a page takes when it is printed.
std::size_t printedSheets(const std::string& html);

}  // namespace accounts
