// What came of the migration: one sentence, its facts, and what people must know of it.

// The sentence for each outcome, by command. `%` stands for the versions, if they are known.
const kSentences = {
  run: {
    migrated: "The accounts were migrated%.",
    unchanged: "The migration succeeded and changed no account.",
    losses: "The accounts were migrated%, but not everything was carried over.",
    unverified: "The result could not be verified, so nothing was changed.",
    failed: "The migration failed.",
  },
  plan: {
    migrated: "A migration would bring the accounts up to date%.",
    unchanged: "A migration would change no account.",
    losses: "A migration would bring the accounts up to date%, but not carry everything over.",
    unverified: "The result of a migration could not be verified.",
    failed: "A migration would fail.",
  },
};

/** The outcome of a report: a key of kSentences' rows. */
function outcomeOf(report, counts) {
  if (report.result !== true) {
    return "failed";
  }
  if ((report.exitStatus ?? 0) !== 0) {
    return { 2: "unverified", 3: "losses" }[report.exitStatus] ?? "failed";
  }
  const { before, after } = report.versions ?? {};
  // Without a ledger nobody knows.
  const isChanged = !report.ledger || Object.keys(kMarks).some((mark) => counts[mark] > 0);
  return isChanged || before !== after ? "migrated" : "unchanged";
}

function versionWords({ before, after } = {}) {
  if (after === null || after === undefined) {
    return "";
  }
  return before === null || before === undefined ? ` to version ${after}` :
    before === after ? `; their version stays ${after}` : ` from version ${before} to ${after}`;
}

/** How many accounts of the inputs have each mark, and how many of the result are new. */
function countMarks({ allRows }) {
  const counts = { unchanged: 0, added: 0 };
  // What stands in a row of its own after was counted where it stands before.
  for (const row of allRows.filter(({ before, marks }) => before !== null || marks.includes("added"))) {
    for (const mark of isUnchanged(row) ? [kUnchanged] : row.marks) {
      counts[mark] = (counts[mark] ?? 0) + 1;
    }
  }
  return counts;
}

function timeOf(text) {
  const date = new Date(text);
  return Number.isNaN(date.getTime()) ? data("span", {}, text) :
    make("time", { datetime: date.toISOString() },
      date.toISOString().replace("T", " ").replace(/(\.\d+)?Z$/, " UTC"));
}

function overviewFacts(report) {
  const versions = report.versions ?? {};
  const seconds = (report.stages ?? []).reduce((sum, stage) => sum + (stage.seconds ?? 0), 0);
  const facts = [
    ["Root", report.root && data("code", {}, report.root)],
    ["Time", report.time && timeOf(report.time)],
    ["Version", "before" in versions || "after" in versions ?
      `${versions.before ?? "none"} → ${versions.after ?? "none"}` : null],
    ["Took", seconds > 0 ? duration(seconds) : null],
    ["Exit status", report.exitStatus === undefined ? null : shown(report.exitStatus)],
  ];
  return make("dl", { class: "facts" }, facts.filter(([, value]) => value)
    .map(([name, value]) => make("div", {}, make("dt", {}, name), make("dd", {}, value))));
}

/** A box with a heading and a list of texts; none if there is none. */
function notice(kind, heading, texts) {
  return texts.length === 0 ? null : make("section", { class: `notice ${kind}` },
    make("h2", {}, heading), make("ul", {}, texts.map((text) => make("li", {}, data("span", {}, text)))));
}

/** A count of accounts, which shows these alone when it is pressed. */
function chip(mark, count) {
  return make("button", { type: "button", class: `badge ${mark}`, "data-mark": mark, "aria-pressed": "false" },
    `${count.toLocaleString("en")} ${kMarkNames[mark] ?? mark}`);
}

/** The top of the page. */
function overview(report, accounts) {
  const counts = countMarks(accounts);
  const outcome = outcomeOf(report, counts);
  const sentence = (kSentences[report.command] ?? kSentences.run)[outcome]
    .replace("%", () => shown(versionWords(report.versions)));
  const marks = [...Object.keys(kMarks), kUnchanged].filter((mark) => counts[mark] > 0);
  const kept = report.keptInputs ?? [];
  return [
    make("p", { class: "kind" }, report.command === "plan" ? "Plan of a migration" : "Report of a migration"),
    make("h1", { class: outcome }, make("span", { class: "sign", "aria-hidden": "true" },
      { failed: "✕", unverified: "✕", losses: "!" }[outcome] ?? "✓"), sentence),
    make("p", { class: "counts", role: "group", "aria-label": "Accounts to show" },
      marks.map((mark) => [chip(mark, counts[mark]), " "])),
    overviewFacts(report),
    notice("error", "Error", report.error ? [report.error] : []),
    notice("warning", "Not carried over", report.ledger?.losses ?? []),
    notice("warning", (report.warnings ?? []).length === 1 ? "Warning" : "Warnings", report.warnings ?? []),
    notice("kept", "Kept inputs", kept),
  ];
}

/** Whom the migration told of its changes, or would tell; none if nobody. */
function announcements(report) {
  const [was, were] = report.command === "plan" ? ["would be", "would be"] : ["was", "were"];
  const lines = (report.broadcasts ?? []).map((each) => make("li", {},
    data("code", {}, each.application ?? ""), ` ${was} told that `, data("code", {}, each.key ?? ""), " changed"));
  if (report.cloudTabAnnouncements > 0) {
    lines.push(make("li", {}, `Cloud tabs ${were} announced `,
      report.cloudTabAnnouncements === 1 ? "once" : `${report.cloudTabAnnouncements} times`));
  }
  return lines.length === 0 ? null : make("ul", { class: "announcements" }, lines);
}
