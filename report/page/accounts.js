// How an account is shown: its title, what became of it, its dataclasses, its properties.

const kSources = { mailStore: "legacy mail store", exchangeStore: "legacy Exchange store" };

/** Whether the filter shows an account for its own sake, and not for its children's. */
function isChosen(account) {
  const { marks } = account;
  return (!filter.changedOnly || marks.length > 0) &&
    (filter.mark === null || (filter.mark === kUnchanged ? isUnchanged(account) : marks.includes(filter.mark))) &&
    matches(account, () => textsOf(account));
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

/** A mark of an account, with what it was joined into or why it was not carried over. */
function badgeOf(mark, { others, entry, side }) {
  if (side === "before" && mark === "joined") {
    return badge(mark, shown(`joined into ${others.map(({ title }) => title).join(", ")}`));
  }
  return side === "before" && mark === "lost" ? badge(mark, shown(`not carried over: ${entry.reason ?? ""}`)) : badge(mark);
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

function accountSummary(account) {
  const source = kSources[account.content.source];
  return [
    make("span", { class: "line" }, data("strong", { class: "title" }, account.title),
      source ? make("span", { class: "source" }, source) : null, account.marks.map((mark) => badgeOf(mark, account))),
    dataclassLine(account),
  ];
}

/** What an account has beside its properties, as a list of terms. */
function accountFacts(account) {
  const { content } = account;
  const facts = [["Identifier", content.identifier], ["Type", content.type], ["Class", content.class],
                 ["Place", content.place], ["Below", account.parent?.title]];
  return make("dl", { class: "facts" }, facts.filter(([, value]) => value)
    .map(([name, value]) => make("div", {}, make("dt", {}, name), data("dd", {}, value))));
}

/** The properties of an account; those that its partner has otherwise or not at all are marked. */
function propertyRows(account) {
  const other = account.partner?.properties;
  const rows = [];
  for (const [path, value] of account.properties) {
    const isChanged = other !== undefined && !(other.has(path) && isSame(value, other.get(path)));
    if (filter.changedOnly && other !== undefined && !isChanged) {
      continue;
    }
    rows.push(make("tr", { class: isChanged ? `changed ${account.side}` : null },
      data("th", { scope: "row" }, path),
      make("td", {}, data(isChanged ? (account.side === "before" ? "del" : "ins") : "span",
                          { class: `value ${typeof value}` }, describe(value)))));
  }
  return rows;
}

function accountBody(account, page) {
  const rows = propertyRows(account);
  const otherSide = account.side === "before" ? "after" : "before";
  return [
    accountFacts(account),
    rows.length === 0 ? null : make("table", { class: "properties" },
      make("caption", { class: "unseen" }, "Properties"), make("tbody", {}, rows)),
    account.partner === null ? null :
      make("p", { class: "links" }, button(`Show it ${otherSide}`, () => page.reveal(account.partner))),
  ];
}
