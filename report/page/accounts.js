// The accounts before and after, each account paired with what it was or became.

/** One account of one side. */
class Account {
  constructor(content, side, parent) {
    this.content = content;
    this.side = side;
    this.parent = parent;
    this.title = content.title || content.identifier || "an account";
    this.properties = propertiesOf(content);
    this.children = (content.children ?? []).map((child) => new Account(child, side, this));
    // The same account on the other side, and what became of it: rows of kMarks.
    this.partner = null;
    this.marks = [];
    this.part = null;
  }
}

// Each with the sign that tells it without its colour.
const kMarks = {
  added: "+", removed: "−", changed: "≠", moved: "⇄", converted: "⇒", identified: "#",
};
const kMarkNames = { identified: "new identifier" };
const kSources = { mailStore: "legacy mail store", exchangeStore: "legacy Exchange store" };

/** An account's values by their paths, without the children, which are accounts of their own. */
function propertiesOf(content) {
  const properties = { ...content.properties };
  if (content.children?.length > 0) {
    delete properties.ChildAccounts;
  }
  return valuesByPath(properties);
}

/** The accounts of a side and their children, in one list. */
function flattened(accounts) {
  return accounts.flatMap((account) => [account, ...flattened(account.children)]);
}

/** Pairs accounts that have no partner yet, those of equal keys in their order. */
function pairBy(keyOf, before, after) {
  const waiting = new Map();
  for (const account of after.filter((each) => each.partner === null).reverse()) {
    const key = keyOf(account);
    waiting.has(key) ? waiting.get(key).push(account) : waiting.set(key, [account]);
  }
  for (const account of before.filter((each) => each.partner === null)) {
    const partner = waiting.get(keyOf(account))?.pop();
    if (partner !== undefined) {
      account.partner = partner;
      partner.partner = account;
    }
  }
}

function identityOf(account) {
  const { identifier } = account.content;
  return identifier ? `identifier ${identifier}` : `title ${account.title}`;
}

function hasSameProperties(one, other) {
  return one.properties.size === other.properties.size &&
    [...one.properties].every(([path, value]) =>
      other.properties.has(path) && isSame(value, other.properties.get(path)));
}

/** What became of an account, or what it is new in. */
function marksOf(account) {
  const { content, partner } = account;
  if (partner === null) {
    return [account.side === "before" ? "removed" : "added"];
  }
  const marks = [];
  if (content.source !== partner.content.source) {
    marks.push("converted");
  } else if (!hasSameProperties(account, partner) ||
             !isSame(content.dataclasses, partner.content.dataclasses) ||
             content.type !== partner.content.type || content.class !== partner.content.class) {
    marks.push("changed");
  }
  const hasSameParent = account.parent === null ? partner.parent === null :
    partner.parent !== null && account.parent.partner === partner.parent;
  if (!hasSameParent) {
    marks.push("moved");
  }
  if (identityOf(account) !== identityOf(partner)) {
    marks.push("identified");
  }
  return marks;
}

/** Both sides of a report as accounts that know each other. */
function accountsOf(report) {
  const before = (report.accountsBefore ?? []).map((each) => new Account(each, "before", null));
  const after = (report.accountsAfter ?? []).map((each) => new Account(each, "after", null));
  const sides = { before, after, allBefore: flattened(before), allAfter: flattened(after) };
  pairBy((account) => `${account.content.source} ${identityOf(account)}`, sides.allBefore, sides.allAfter);
  pairBy(identityOf, sides.allBefore, sides.allAfter);
  // A step that gives accounts their identifiers leaves them their names.
  pairBy((account) => `${account.content.source} ${account.title}`, sides.allBefore, sides.allAfter);
  sides.withIdentifier = { before: new Map(), after: new Map() };
  for (const account of [...sides.allBefore, ...sides.allAfter]) {
    account.marks = marksOf(account);
    const known = sides.withIdentifier[account.side];
    if (account.content.identifier && !known.has(account.content.identifier)) {
      known.set(account.content.identifier, account);
    }
  }
  return sides;
}

/** Whether the filter shows an account for its own sake, and not for its children's. */
function isChosen(account) {
  return (!filter.changedOnly || account.marks.length > 0) && matches(account, () => textsOf(account));
}

/** What of an account a filter looks through: what is shown of it, its properties' paths included. */
function textsOf({ content, properties }) {
  const { title, identifier, type, class: className, dataclasses } = content;
  return collectTexts([title, identifier, type, className, dataclasses, ...properties.keys(),
                       ...properties.values()], []);
}

function badge(mark) {
  return make("span", { class: `badge ${mark}` },
    make("span", { "aria-hidden": "true" }, `${kMarks[mark] ?? "•"} `), kMarkNames[mark] ?? mark);
}

function shortName(dataclass) {
  return String(dataclass).split(".").pop();
}

/** The dataclasses as a line of names; those that are not enabled are dim, changed ones are marked. */
function dataclassLine(account) {
  const { dataclasses } = account.content;
  if (!dataclasses?.length) {
    return null;
  }
  const others = new Map((account.partner?.content.dataclasses ?? []).map((each) => [each.name, each]));
  return make("span", { class: "dataclasses" }, dataclasses.map((each) => {
    const state = [each.enabled ? "enabled" : "not enabled",
                   each.provisioned ? "provisioned" : "not provisioned"].join(", ");
    const isChanged = account.partner !== null && !isSame(each, others.get(each.name));
    return make("span", {
      class: `dataclass ${each.enabled ? "on" : "off"} ${isChanged ? "changed" : ""}`,
      title: shown(`${each.name}: ${state}`),
    }, marked(shown(shortName(each.name))),
      make("span", { class: "unseen" }, ` (${state}${isChanged ? ", changed" : ""}) `));
  }));
}

function accountSummary(account) {
  const source = kSources[account.content.source];
  return [
    make("span", { class: "line" }, data("strong", { class: "title" }, account.title),
      source ? make("span", { class: "source" }, source) : null, account.marks.map(badge)),
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
