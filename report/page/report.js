// Starts the page: reads the report, shows it, and lets a person filter, fold and print it.

const kTypingMilliseconds = 150;

function byId(id) {
  return document.getElementById(id);
}

function contentOf(id) {
  return document.querySelector(`#${id} > .content`);
}

/** The report and what was made of it; `reveal` brings a person to a row. */
class Page {
  constructor(report) {
    this.report = report;
    this.stages = report.stages ?? [];
    this.accounts = accountsOf(report);
  }

  showAll() {
    byId("overview").replaceChildren(...overview(this.report, this.accounts).filter((each) => each !== null));
    const told = announcements(this.report);
    byId("announcements").hidden = told === null;
    contentOf("announcements").replaceChildren(told ?? "");
    const { allBefore, allAfter } = this.accounts;
    byId("accounts").hidden = allBefore.length + allAfter.length === 0;
    byId("steps").hidden = this.stages.length === 0;
    byId("toolbar").hidden = byId("accounts").hidden && byId("steps").hidden;
    byId("before-heading").append(make("span", { class: "dim" }, ` ${counted(allBefore.length, "account")}`));
    byId("after-heading").append(make("span", { class: "dim" }, ` ${counted(allAfter.length, "account")}`));
    this.showFiltered();
  }

  /** Shows what the filter leaves. */
  showFiltered() {
    const { allBefore, allAfter, rows, allRows } = this.accounts;
    const chosen = allRows.filter(isChosen);
    const counts = ["before", "after"].map((side) => chosen.filter((row) => row[side] !== null).length);
    const stages = this.stages.filter(showsStage).length;
    const isAll = filter.words.length === 0 && !filter.changedOnly && filter.mark === null;
    for (const chip of document.querySelectorAll(".counts .badge")) {
      chip.setAttribute("aria-pressed", String(chip.dataset.mark === filter.mark));
    }
    setMatchCount(chosen.length + stages);
    byId("shown").textContent = isAll ? "" : `Shown: ${stages} of ${counted(this.stages.length, "step")}, ` +
      `${counts[0].toLocaleString("en")} of ${counted(allBefore.length, "account")} before, ` +
      `${counts[1].toLocaleString("en")} of ${allAfter.length.toLocaleString("en")} after`;
    contentOf("steps").replaceChildren(timeline(this.stages, this));
    contentOf("accounts").replaceChildren(rowList(rows, this));
  }

  /** Brings the person to a row; a filter that hides it is taken away. */
  reveal(row) {
    if (!isChosen(row)) {
      byId("filter").value = "";
      byId("changed-only").checked = false;
      setFilter("", false);
      this.showFiltered();
    }
    buildTo(row);
    goTo(row);
  }
}

function watchFilter(page) {
  const apply = (mark = filter.mark) => {
    setFilter(byId("filter").value, byId("changed-only").checked, mark);
    page.showFiltered();
  };
  byId("overview").addEventListener("click", ({ target }) => {
    const mark = target.dataset.mark ?? null;
    if (mark !== null) {
      apply(mark === filter.mark ? null : mark);
    }
  });
  let typing = null;
  byId("filter").addEventListener("input", () => {
    clearTimeout(typing);
    typing = setTimeout(apply, kTypingMilliseconds);
  });
  byId("changed-only").addEventListener("change", () => apply());
  document.addEventListener("keydown", (event) => {
    const isTyping = event.target.closest?.("input, textarea, select");
    if (event.key === "/" && !isTyping && !event.ctrlKey && !event.metaKey && !event.altKey) {
      event.preventDefault();
      byId("filter").focus();
      byId("filter").select();
    }
  });
}

/** The report's JSON, which a long report holds compressed. */
async function expanded(text) {
  const characters = atob(text);
  const bytes = new Uint8Array(characters.length);
  // A function called for each would take a second for 20,000 accounts.
  for (let index = 0; index < bytes.length; index += 1) {
    bytes[index] = characters.charCodeAt(index);
  }
  const plain = new Blob([bytes]).stream().pipeThrough(new DecompressionStream("gzip"));
  return new Response(plain).text();
}

function start(json) {
  let report = null;
  try {
    report = JSON.parse(json);
  } catch (error) {
    byId("overview").replaceChildren(make("h1", { class: "failed" }, "This report cannot be read."),
      make("p", {}, shown(error.message)));
    return;
  }
  const page = new Page(isDictionary(report) ? report : {});
  document.title = `${report.command === "plan" ? "Plan" : "Report"} of a migration: ${shown(report.root ?? "")}`;
  page.showAll();
  const content = byId("content");
  watchParts(content);
  watchFilter(page);
  byId("expand").addEventListener("click", () => expandAll(content));
  byId("fold").addEventListener("click", () => foldAll(content));
}

const embedded = byId("report");
if (embedded.type === "application/gzip") {
  byId("overview").replaceChildren(make("p", { class: "dim" }, "The report is being expanded."));
  expanded(embedded.textContent).then(start, () => start(""));
} else {
  start(embedded.textContent);
}
