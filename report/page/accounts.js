// How a row is shown: its accounts with what became of them, their dataclasses and their properties.

const kSources = { mailStore: "legacy mail store", exchangeStore: "legacy Exchange store" };

/** Whether the filter shows a row for its own sake, and not for its children's. */
function isChosen(row) {
  const { marks, accounts } = row;
  return (!filter.changedOnly || marks.length > 0) &&
    (filter.mark === null || (filter.mark === kUnchanged ? isUnchanged(row) : marks.includes(filter.mark))) &&
    matches(row, () => accounts.flatMap(textsOf));
}

/** What of an account a filter looks through: what is shown of it, its properties' paths included. */
function textsOf({ content, properties }) {
  const { title, identifier, type, class: className, dataclasses } = content;
  return collectTexts([title, identifier, type, className, dataclasses, ...properties.keys(),
                       ...properties.values()], []);
}

function badge(mark, words = kMarkNames[mark] ?? mark) {
  return make("span", { class: `badge ${mark}` },
    make("span", { "aria-hidden": "true" }, `${kMarks[mark] ?? "•"} `), words);
}

/** A mark of a row, with what its account was joined into or why it was not carried over. */
function badgeOf(mark, { before }) {
  const words = {
    joined: () => `joined into ${before.others.map(({ title }) => title).join(", ")}`,
    lost: () => `not carried over: ${before.entry.reason ?? ""}`,
  }[mark];
  return words === undefined ? badge(mark) : badge(mark, shown(words()));
}

function shortName(dataclass) {
  return String(dataclass).split(".").pop();
}

/** What a dataclass of a side is, next to the partner's of its name: "added", "removed", "changed" or null. */
function markOfDataclass(dataclass, other, side) {
  if (other === undefined || (dataclass.enabled && !other.enabled)) {
    return side === "before" ? "removed" : "added";
  }
  // What only the partner has enabled is said there.
  return isSame(dataclass, other) || other.enabled !== dataclass.enabled ? null : "changed";
}

/** The dataclasses as a line of names; those that are not enabled are dim, those that differ are marked. */
function dataclassLine(account) {
  const { dataclasses } = account.content;
  if (!dataclasses?.length) {
    return null;
  }
  const others = new Map((account.partner?.content.dataclasses ?? []).map((each) => [each.name, each]));
  return make("span", { class: "dataclasses" }, dataclasses.map((each) => {
    const mark = account.partner === null ? null : markOfDataclass(each, others.get(each.name), account.side);
    const state = [each.enabled ? "enabled" : "not enabled",
                   each.provisioned ? "provisioned" : "not provisioned"].join(", ");
    return make("span", {
      class: `dataclass ${each.enabled ? "on" : "off"} ${mark ?? ""}`,
      title: shown(`${each.name}: ${state}`),
    }, mark === null ? null : make("span", { "aria-hidden": "true" }, `${kMarks[mark]} `),
      marked(shown(shortName(each.name))),
      make("span", { class: "unseen" }, ` (${state}${mark === null ? "" : `, ${mark}`}) `));
  }));
}

/** A row's account of one side, after with what became of it; a gap if there is neither. */
function accountCell(row, side) {
  const account = row[side];
  const marks = side === "after" ? row.marks : [];
  if (account === null && marks.length === 0) {
    return make("span", { class: `cell ${side} gap` });
  }
  const source = kSources[account?.content.source];
  const name = side === "before" ? "Before" : "After";
  return make("span", { class: `cell ${side}` },
    make("span", { class: "line" }, make("span", { class: "side unseen" }, `${name}: `),
      account && data("strong", { class: "title" }, account.title),
      source ? make("span", { class: "source" }, source) : null, marks.map((mark) => badgeOf(mark, row))),
    account && dataclassLine(account));
}

function rowSummary(row) {
  return make("span", { class: "cells" }, accountCell(row, "before"), accountCell(row, "after"));
}

/** What is known of an account by the words for it: what it is, and the properties. */
function valuesOf({ content, properties }) {
  const facts = [["Identifier", content.identifier], ["Type", content.type], ["Class", content.class]];
  return new Map([...facts.filter(([, value]) => value), ...properties]);
}

/** The values of a row's accounts; those that differ stand beside each other. */
function valueTable({ before, after, accounts }) {
  const values = accounts.map(valuesOf);
  const paths = [...new Set(values.flatMap((each) => [...each.keys()]))];
  const names = ["Property", before && "Before", after && "After"].filter((name) => name !== null);
  const differs = (path) => !values.every((each) => each.has(path) && isSame(each.get(path), values[0].get(path)));
  const shownPaths = accounts.length === 2 && filter.changedOnly ? paths.filter(differs) : paths;
  return shownPaths.length === 0 ? null : makeTable("values", names, shownPaths.map((path) => {
    const value = values[0].get(path);
    const texts = values.map((each) => (each.has(path) ? describe(each.get(path)) : null));
    return make("tr", {}, data("th", { scope: "row" }, path), differs(path) ? differenceCells(...texts) :
      make("td", { colspan: values.length }, data("span", { class: `value ${typeof value}` }, texts[0])));
  }));
}

/** Where a row's account stands on a side: its place and whose child it is. */
function standingOf(account) {
  return account?.content.place && [account.content.place, account.parent?.title];
}

function rowBody(row, page) {
  return [placeLine(standingOf(row.before), standingOf(row.after)), valueTable(row),
          links({ before: row.before ?? row.after.partner, after: row.after ?? row.before.partner }, page, row)];
}

/** Places before and after, each with the title of the account that it is below, as a line; none without any. */
function placeLine(before, after) {
  const [was, is] = [before, after].map((standing) =>
    (standing ? standing.filter((each) => each).join(", below ") : null));
  return was || is ? make("p", { class: "place" }, "Place: ",
    data("span", {}, was && is && was !== is ? `${was} → ${is}` : is || was)) : null;
}

/** Ways to where an account stands before and after, which may be one row; none to the row that they are in. */
function links({ before, after }, page, within = null) {
  const ways = before?.row === after?.row ? [["Show it", after]] :
    [["Show it before", before], ["Show it after", after]];
  const buttons = ways.filter(([, account]) => account && account.row !== within)
    .map(([words, account]) => button(words, () => page.reveal(account.row)));
  return buttons.length > 0 ? make("p", { class: "links" }, buttons) : null;
}
