// The steps of a migration as a timeline, and what each of them changed, wrote and logged.

// What every upgrade step changes, whether it has work or not.
const kStamp = "Version";

/** Whether nothing but the settings file's next version was written. */
function isMereWriting(file) {
  return ["written", "given away"].includes(file.action) && file.error === undefined;
}

/** Whether a step did more than put its version on what it found, and write that. */
function changedAnything(stage) {
  return stage.accounts?.length > 0 || !(stage.files ?? []).every(isMereWriting) ||
    (stage.otherProperties ?? []).some((property) => property.path !== kStamp);
}

/** Whether the filter shows a step. */
function showsStage(stage) {
  return filter.mark === null && matches(stage) &&
    (!filter.changedOnly || changedAnything(stage) || stage.succeeded === false);
}

/** What of a step's list is shown: all of it if the step's own name has the words. */
function chosenOf(stage, list) {
  return hasWords(stageName(stage)) ? list ?? [] : (list ?? []).filter((item) => matches(item));
}

function stageName(stage) {
  return `${stage.title ?? ""} ${stage.name ?? ""}`;
}

/** The timeline of the steps that the filter leaves. */
function timeline(stages, page) {
  const shownStages = stages.filter(showsStage);
  if (shownStages.length === 0) {
    return make("p", { class: "dim" }, stages.length === 0 ? "No steps." : "None to show.");
  }
  const longest = Math.max(...stages.map((stage) => stage.seconds ?? 0));
  return fillList(make("ol", { class: "timeline" }), shownStages, (stage) =>
    makePart({ class: `stage ${resultOf(stage)} ${stage.accounts?.length > 0 ? "" : "idle"}` },
      stageSummary(stage, longest), () => stageBody(stage, page), stage),
  (stage) => stage.title ?? stage.name);
}

function resultOf(stage) {
  return stage.succeeded === undefined ? "" : stage.succeeded ? "succeeded" : "failed";
}

/** What a step did, in a word or two. */
function amountOf(stage) {
  const amounts = [["account", stage.accounts], ["file", stage.files]];
  const [noun, list] = amounts.find(([, each]) => each?.length > 0) ?? [];
  return noun ? counted(list.length, noun) : changedAnything(stage) ? "" : "no change";
}

function stageSummary(stage, longest) {
  const result = resultOf(stage);
  return [
    make("span", { class: "result" },
      make("span", { "aria-hidden": "true" }, { succeeded: "✓", failed: "✕" }[result] ?? "·"),
      make("span", { class: "unseen" }, `${result} `)),
    make("span", { class: "what" },
      data("strong", { class: "title" }, stage.title ?? stage.name ?? "a step"),
      stage.title && stage.name ? [" ", data("code", {}, stage.name)] : null),
    make("span", { class: "figures" },
      make("span", { class: stage.accounts?.length > 0 ? "count" : "dim" }, amountOf(stage)),
      typeof stage.seconds !== "number" ? make("span", { class: "time" }) :
        make("span", { class: "time" }, duration(stage.seconds),
        make("span", { class: "share", "aria-hidden": "true",
                       style: `--share: ${longest > 0 ? stage.seconds / longest : 0}` }))),
  ];
}

/** A titled list within a step; none if there is nothing to list. */
function titledList(title, items, makeItem, nameOf, attributes = {}) {
  return items.length === 0 ? null : [make("h3", {}, title),
    fillList(make("ul", attributes), items, makeItem, nameOf)];
}

function stageBody(stage, page) {
  const others = chosenOf(stage, stage.otherProperties);
  const accounts = chosenOf(stage, stage.accounts);
  const files = chosenOf(stage, stage.files);
  const log = chosenOf(stage, stage.log);
  const body = [
    titledList(counted(accounts.length, "account"), accounts,
      (change) => makePart({ class: `change ${change.change}` }, changeSummary(change),
        () => changeBody(change, page), change),
      (change) => change.title ?? "an account", { class: "changes" }),
    others.length === 0 ? null : [make("h3", {}, "Beside the accounts"), differenceTable(others)],
    titledList(counted(files.length, "file"), files, fileLine, (file) => file.path, { class: "files" }),
    titledList("Log", log, logLine, (line) => line.text, { class: "log" }),
  ].flat().filter((child) => child !== null);
  return body.length > 0 ? body : [make("p", { class: "dim" }, "Nothing to show.")];
}

function fileLine(file) {
  return [make("span", { class: `action ${file.action}` }, shown(file.action ?? "")), " ",
          data("code", {}, file.path ?? "")];
}

function logLine(line) {
  return [make("span", { class: "to" }, shown(line.to ?? "")), " ", data("code", {}, line.text ?? "")];
}

function changeSummary(change) {
  return make("span", { class: "line" }, badge(shown(change.change ?? "changed")),
    data("strong", { class: "title" }, change.title ?? "an account"),
    change.identifier ? data("code", { class: "dim" }, change.identifier) : null);
}

/** Where an account stands on a side: its place and whose child it is. */
function standing(where, side, page) {
  const parent = where?.parent;
  return where?.place && [where.place, parent && (accountOn(side, parent, page.accounts)?.title ?? parent)];
}

function changeBody(change, page) {
  return [
    change.properties?.length > 0 ? differenceTable(change.properties) : null,
    placeLine(standing(change.before, "before", page), standing(change.after, "after", page)),
    links(accountsOfChange(change, page.accounts), page),
  ];
}

/** The cell of one side of a changed value; what differs from the other side is marked in it. */
function differenceCell(tag, text, other) {
  if (text === null) {
    return make("td", { class: "none" }, make("span", { class: "dim" }, "none"));
  }
  const { start, end } = commonEnds(text, other ?? "");
  const isWhole = other === null || start + end < text.length / 4;
  const children = isWhole || filter.words.length > 0 ? marked(text) : [text.slice(0, start),
    make("span", { class: "differs" }, text.slice(start, text.length - end)), text.slice(text.length - end)];
  return make("td", {}, make(tag, { class: "value", dir: "auto" }, children));
}

/** The cells of both sides of a changed value; a side that has none gives null. */
function differenceCells(before, after) {
  return [differenceCell("del", before, after), differenceCell("ins", after, before)];
}

function makeTable(kind, names, rows) {
  return make("table", { class: kind },
    make("thead", {}, make("tr", {}, names.map((name) => make("th", { scope: "col" }, name)))),
    make("tbody", {}, rows));
}

/** Changed properties as a table: each with its value before and after. */
function differenceTable(properties) {
  const text = (property, side) => (Object.hasOwn(property, side) ? describe(property[side]) : null);
  return makeTable("differences", ["Property", "Before", "After"], properties.map((property) =>
    make("tr", {}, data("th", { scope: "row" }, property.path ?? ""),
      differenceCells(text(property, "before"), text(property, "after")))));
}
