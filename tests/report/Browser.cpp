#include "tests/report/Browser.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>
#include <string_view>

#include "tests/program/RunProgram.h"

namespace accounts {
namespace {

constexpr std::string_view kNotesStart = "<pre id=\"notes\">";
constexpr std::string_view kNotesEnd = "</pre>";

// The page is in a frame, so that it can have any width, and whoever drives it is outside: the
// page's own content security policy and whether it may run scripts do not bind the driver.
constexpr std::string_view kDriverStart = R"js(
  const frame = document.querySelector("iframe");
  const view = frame.contentWindow;
  const page = frame.contentDocument;
  const notes = {};
  const note = (name, value) => { notes[name] = value; };
  const all = (selector) => [...page.querySelectorAll(selector)];
  const one = (selector) => page.querySelector(selector);
  const pause = () => new Promise((done) => setTimeout(done, 500));
  const enter = (text) => {
    one("#filter").value = text;
    one("#filter").dispatchEvent(new view.Event("input", { bubbles: true }));
    return pause();
  };
  const press = (key) => {
    (page.activeElement ?? page.body).dispatchEvent(
      new view.KeyboardEvent("keydown", { key, bubbles: true, cancelable: true }));
  };
  const drive = async () => {
    // A long report is expanded first.
    while (one("#report")?.type === "application/gzip" && one("h1") === null) {
      await pause();
    }
)js";

// The notes are plain ASCII without what a document would escape.
constexpr std::string_view kDriverEnd = R"js(
  };
  drive().then(() => {
    const text = JSON.stringify(notes).replace(/[^ -~]|[<>&]/g,
      (each) => "\\u" + each.charCodeAt(0).toString(16).padStart(4, "0"));
    const element = document.createElement("pre");
    element.id = "notes";
    element.textContent = text;
    document.documentElement.replaceChildren(element);
  });
)js";

/// A directory that is there for as long as this object.
class ScratchDirectory {
 public:
  ScratchDirectory() {
    std::string path = (std::filesystem::temp_directory_path() / "report-XXXXXX").string();
    if (mkdtemp(path.data()) == nullptr) {
      ADD_FAILURE() << "no directory for the browser";
    }
    _path = path;
  }
  ~ScratchDirectory() {
    std::error_code ignored;
    std::filesystem::remove_all(_path, ignored);
  }
  ScratchDirectory(const ScratchDirectory&) = delete;
  ScratchDirectory& operator=(const ScratchDirectory&) = delete;

  /// Writes a file and returns its path.
  [[nodiscard]] std::string write(const std::string& name, const std::string& text) const {
    std::ofstream(_path / name, std::ios::binary) << text;
    return (_path / name).string();
  }
  [[nodiscard]] std::string pathOf(const std::string& name) const {
    return (_path / name).string();
  }

 private:
  std::filesystem::path _path;
};

std::string asAttribute(const std::string& text) {
  std::string escaped;
  escaped.reserve(text.size() + text.size() / 4);
  for (const char character : text) {
    if (character == '&') {
      escaped += "&amp;";
    } else if (character == '"') {
      escaped += "&quot;";
    } else {
      escaped += character;
    }
  }
  return escaped;
}

std::string framed(const std::string& html, const std::string& driver, const View& view) {
  std::ostringstream document;
  document << "<!DOCTYPE html><meta charset=\"utf-8\"><body style=\"margin: 0\">"
           << "<iframe style=\"border: 0; height: 900px; width: " << view.width << "px\" "
           << (view.scripts == View::Scripts::forbidden ? "sandbox=\"allow-same-origin\" " : "")
           << "srcdoc=\"" << asAttribute(html) << "\"></iframe>"
           << "<script>addEventListener(\"load\", () => {" << kDriverStart << driver << kDriverEnd
           << "});</script>";
  return document.str();
}

ProgramResult runBrowser(const ScratchDirectory& directory, std::vector<std::string> arguments,
                         const std::string& page) {
  // Time within the page runs as fast as it can: what waits there is not waited for here.
  std::vector<std::string> all = {"--headless=new",
                                  "--no-sandbox",
                                  "--disable-gpu",
                                  "--disable-dev-shm-usage",
                                  "--disable-background-networking",
                                  "--no-first-run",
                                  "--hide-scrollbars",
                                  "--enable-logging=stderr",
                                  "--window-size=1300,900",
                                  "--virtual-time-budget=30000",
                                  "--user-data-dir=" + directory.pathOf("profile")};
  all.insert(all.end(), arguments.begin(), arguments.end());
  all.push_back("file://" + page);
  return runProgram({.program = "chromium",
                     .arguments = std::move(all),
                     .environment = {{"HOME", directory.pathOf("home")}},
                     .timeLimit = std::chrono::seconds(120)});
}

std::vector<std::string> consoleLinesOf(const ProgramResult& result) {
  std::vector<std::string> lines = result.errorLines();
  std::erase_if(
      lines, [](const std::string& line) { return line.find(":CONSOLE:") == std::string::npos; });
  return lines;
}

}  // namespace

Visit visitPage(const std::string& html, const std::string& driver, const View& view) {
  const ScratchDirectory directory;
  const bool isDark = view.colours == View::Colours::dark;
  const ProgramResult result = runBrowser(directory,
                                          {isDark ? "--blink-settings=preferredColorScheme=0"
                                                  : "--blink-settings=preferredColorScheme=1",
                                           "--dump-dom"},
                                          directory.write("page.html", framed(html, driver, view)));
  Visit visit{nullptr, consoleLinesOf(result)};
  const std::size_t start = result.output.find(kNotesStart);
  const std::size_t end = result.output.find(kNotesEnd, start);
  if (start == std::string::npos || end == std::string::npos) {
    ADD_FAILURE() << "the driver did not come to its end; exit status " << result.exitStatus << "\n"
                  << testing::PrintToString(visit.consoleLines);
    return visit;
  }
  const std::size_t first = start + kNotesStart.size();
  visit.noted = nlohmann::json::parse(result.output.substr(first, end - first), nullptr, false);
  return visit;
}

nlohmann::json notedOn(const std::string& html, const std::string& driver, const View& view) {
  const Visit visit = visitPage(html, driver, view);
  EXPECT_THAT(visit.consoleLines, testing::IsEmpty());
  return visit.noted;
}

std::size_t printedSheets(const std::string& html) {
  const ScratchDirectory directory;
  const std::string printed = directory.pathOf("page.pdf");
  runBrowser(directory, {"--print-to-pdf=" + printed}, directory.write("page.html", html));
  std::ifstream file(printed, std::ios::binary);
  const std::string content(std::istreambuf_iterator<char>(file), {});
  // Each sheet is an object of its own in the printed file.
  const std::regex sheet("/Type /Page\\s");
  return static_cast<std::size_t>(
      std::distance(std::sregex_iterator(content.begin(), content.end(), sheet), {}));
}

}  // namespace accounts
