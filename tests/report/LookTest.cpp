#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/report/Browser.h"
#include "tests/report/SampleReports.h"

namespace accounts {
namespace {

using nlohmann::json;

constexpr int kPhone = 360;
constexpr int kDesk = 1280;

// What a text's contrast to what is behind it is, by the formula of the accessibility guidelines
// (WCAG 2, 1.4.3, which asks for 4.5). A canvas turns every notation of a colour into its
// components.
constexpr std::string_view kContrast = R"js(
  const context = document.createElement("canvas").getContext("2d", { willReadFrequently: true });
  const paint = (colours) => {
    context.clearRect(0, 0, 1, 1);
    for (const colour of colours) {
      context.fillStyle = colour;
      context.fillRect(0, 0, 1, 1);
    }
    return [...context.getImageData(0, 0, 1, 1).data];
  };
  const luminance = (colours) => {
    const [red, green, blue] = paint(colours).slice(0, 3).map((each) => each / 255)
      .map((each) => (each <= 0.04045 ? each / 12.92 : ((each + 0.055) / 1.055) ** 2.4));
    return 0.2126 * red + 0.7152 * green + 0.0722 * blue;
  };
  const behind = (element) => {
    const colours = [];
    for (let each = element; each !== null; each = each.parentElement) {
      colours.unshift(view.getComputedStyle(each).backgroundColor);
    }
    return colours;
  };
  const contrast = (element) => {
    const ground = luminance(behind(element));
    const text = luminance([...behind(element), view.getComputedStyle(element).color]);
    return (Math.max(ground, text) + 0.05) / (Math.min(ground, text) + 0.05);
  };
  const texts = () => all("body *").filter((each) => each.checkVisibility() && !each.closest(".unseen") &&
    [...each.childNodes].some((child) => child.nodeType === 3 && child.data.trim() !== ""));
)js";

json reportWithEverything() {
  json report = sampleReport();
  report["error"] = "an error, to see how it looks";
  report["stages"][2]["succeeded"] = false;
  return report;
}

json contrastsIn(View::Colours colours) {
  return notedOn(pageOf(reportWithEverything()), std::string(kContrast) + R"js(
    one("#expand").click();
    await pause();
    note("texts", texts().length > 300);
    note("ground", luminance(behind(page.body)));
    const faint = () => texts().filter((each) => contrast(each) < 4.5).map((each) => each.outerHTML.slice(0, 80));
    note("faint", faint());
    await enter("a");
    note("faintMarks", faint());
  )js",
                 {.colours = colours});
}

TEST(LookTest, EveryTextIsReadableOnALightPage) {
  const json noted = contrastsIn(View::Colours::light);

  EXPECT_GT(noted["ground"], 0.8);
  EXPECT_EQ(noted["texts"], true);
  EXPECT_EQ(noted["faint"], json::array());
  EXPECT_EQ(noted["faintMarks"], json::array());
}

TEST(LookTest, EveryTextIsReadableOnADarkPage) {
  const json noted = contrastsIn(View::Colours::dark);

  EXPECT_LT(noted["ground"], 0.05);
  EXPECT_EQ(noted["texts"], true);
  EXPECT_EQ(noted["faint"], json::array());
  EXPECT_EQ(noted["faintMarks"], json::array());
}

// A name without a place to break it, as paths and identifiers are.
json reportWithLongNames() {
  json report = reportWithEverything();
  const std::string longName(300, 'x');
  report["root"] = "/" + longName;
  report["error"] = longName;
  report["warnings"].push_back(longName);
  report["stages"][0]["title"] = longName;
  report["stages"][0]["name"] = longName;
  report["stages"][0]["log"] = {{{"to", "console"}, {"text", longName}}};
  report["accountsAfter"][0]["title"] = longName;
  report["accountsAfter"][0]["dataclasses"][0]["name"] = longName;
  report["accountsAfter"][0]["properties"][longName] = longName;
  return report;
}

// Everything open, what sticks out at the right, and where both sides stand.
constexpr std::string_view kMeasure = R"js(
  one("#expand").click();
  await pause();
  note("folded", all("details:not([open])").length);
  note("scrolls", page.documentElement.scrollWidth > page.documentElement.clientWidth);
  note("sticksOut", all("main *").filter((each) => each.checkVisibility() && !each.closest(".unseen") &&
    each.getBoundingClientRect().right > view.innerWidth + 1).map((each) => each.outerHTML.slice(0, 80)));
  const [before, after] = [one(".before"), one(".after")].map((each) => each.getBoundingClientRect());
  note("sideBySide", before.top === after.top && before.right <= after.left);
  note("belowOneAnother", before.bottom <= after.top && before.left === after.left);
)js";

TEST(LookTest, OnAPhoneNothingSticksOutAndTheSidesStandBelowOneAnother) {
  const json noted =
      notedOn(pageOf(reportWithLongNames()), std::string(kMeasure), {.width = kPhone});

  EXPECT_EQ(noted["folded"], 0);
  EXPECT_EQ(noted["scrolls"], false);
  EXPECT_EQ(noted["sticksOut"], json::array());
  EXPECT_EQ(noted["belowOneAnother"], true);
}

TEST(LookTest, OnADeskNothingSticksOutAndTheSidesStandBesideEachOther) {
  const json noted =
      notedOn(pageOf(reportWithLongNames()), std::string(kMeasure), {.width = kDesk});

  EXPECT_EQ(noted["folded"], 0);
  EXPECT_EQ(noted["scrolls"], false);
  EXPECT_EQ(noted["sticksOut"], json::array());
  EXPECT_EQ(noted["sideBySide"], true);
}

TEST(LookTest, ALongTitleIsCutAfterTwoLines) {
  const json noted = notedOn(pageOf(reportWithLongNames()), R"js(
    const longOnes = all(".title").filter((each) => each.textContent.startsWith("xxx"));
    note("areCut", longOnes.map((each) => each.scrollHeight > each.clientHeight + 1));
    note("lines", longOnes.map((each) =>
      Math.round(each.getBoundingClientRect().height / parseFloat(view.getComputedStyle(each).lineHeight))));
  )js",
                             {.width = kPhone});

  EXPECT_EQ(noted["areCut"], json({true, true}));
  EXPECT_EQ(noted["lines"], json({2, 2}));
}

}  // namespace
}  // namespace accounts
