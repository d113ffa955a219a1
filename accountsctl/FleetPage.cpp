#include "accountsctl/FleetPage.h"

#include <fmt/format.h>

#include <algorithm>
#include <filesystem>

namespace accounts {
namespace {

constexpr std::string_view kBeginning = R"(<!DOCTYPE html>
<html lang="en">
<head>
<meta charset="utf-8">
<meta name="viewport" content="width=device-width, initial-scale=1">
<title>Migrated images</title>
<style>
:root { color-scheme: light dark; }
body { font: 1rem/1.4 system-ui, sans-serif; margin: 1rem auto; max-width: 75rem; padding: 0 1rem; }
table { border-collapse: collapse; width: 100%; }
th, td { border-bottom: 1px solid #8884; padding: .3rem .6rem; text-align: left; vertical-align: top; }
td { overflow-wrap: anywhere; }
.number { text-align: right; white-space: nowrap; }
</style>
</head>
<body>
<main>
<h1>Migrated images</h1>
)";
constexpr std::string_view kEnd = "</table>\n</main>\n</body>\n</html>\n";

std::string escaped(std::string_view text) {
  std::string html;
  for (const char character : text) {
    switch (character) {
      case '&':
        html += "&amp;";
        break;
      case '<':
        html += "&lt;";
        break;
      case '>':
        html += "&gt;";
        break;
      case '"':
        html += "&quot;";
        break;
      default:
        html += character;
    }
  }
  return html;
}

/// A path as a relative URL.
std::string urlOf(const std::string& path) {
  constexpr std::string_view kPlain =
      "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-._~/";
  std::string url;
  for (const char character : path) {
    if (kPlain.find(character) != std::string_view::npos) {
      url += character;
    } else {
      url += fmt::format("%{:02X}", static_cast<unsigned char>(character));
    }
  }
  return url;
}

std::string nameOf(const RunResult& result, const std::string& directory) {
  const std::string name = escaped(result.root.value_or("(not named)"));
  if (!result.page) {
    return name;
  }
  const std::string path =
      std::filesystem::path(*result.page).lexically_proximate(directory).string();
  return fmt::format("<a href=\"{}\">{}</a>", urlOf(path), name);
}

std::string remarksOn(const RunResult& result) {
  std::string text = escaped(result.error.value_or(""));
  for (const std::string& warning : result.warnings) {
    text += (text.empty() ? "" : "<br>") + escaped(warning);
  }
  return text;
}

void appendImage(std::string& html, std::string_view name, std::string_view outcome,
                 std::string_view remarks, const std::optional<double>& seconds) {
  html += fmt::format("<tr><td>{}</td><td>{}</td><td>{}</td><td class=\"number\">{}</td></tr>\n",
                      name, outcome, remarks, seconds ? fmt::format("{:.3f} s", *seconds) : "");
}

void appendOutcomes(std::string& html, const FleetSummary& summary) {
  html += "<table>\n<tr><th class=\"number\">Images</th><th>Outcome</th></tr>\n";
  const auto append = [&](std::size_t count, std::string_view words) {
    html += fmt::format("<tr><td class=\"number\">{}</td><td>{}</td></tr>\n", count, words);
  };
  for (const auto& [exitStatus, count] : summary.exitStatuses()) {
    append(count, outcomeOf(exitStatus).words);
  }
  if (const std::size_t missing = summary.missingRoots().size(); missing > 0) {
    append(missing, "no result yet");
  }
  if (const std::size_t warned = summary.warningCount(); warned > 0) {
    append(warned, "of the migrated have warnings");
  }
  html += "</table>\n";
}

}  // namespace

std::string fleetPage(const FleetSummary& summary, const std::string& directory) {
  std::string html(kBeginning);
  appendOutcomes(html, summary);
  html +=
      "<h2>Images</h2>\n<table>\n<tr><th>Image</th><th>Outcome</th><th>What to know</th>"
      "<th class=\"number\">Took</th></tr>\n";
  for (const Remedy remedy : {Remedy::Attention, Remedy::Losses, Remedy::Retry, Remedy::None}) {
    std::vector<const RunResult*> results = summary.resultsWith(remedy);
    std::stable_partition(results.begin(), results.end(),
                          [](const RunResult* result) { return !result->warnings.empty(); });
    for (const RunResult* result : results) {
      appendImage(html, nameOf(*result, directory), outcomeOf(result->exitStatus).words,
                  remarksOn(*result), result->seconds);
    }
    if (remedy == Remedy::Retry) {
      for (const std::string& root : summary.missingRoots()) {
        appendImage(html, escaped(root), "no result yet", "", std::nullopt);
      }
    }
  }
  return html.append(kEnd);
}

}  // namespace accounts
