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

function pair(one, other) {
  one.partner = other;
  other.partner = one;
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
      pair(account, partner);
    }
  }
}

/** The accounts that have no partner yet and alone have their type and name in their store. */
function aloneWithTheirName(accounts) {
  const byName = new Map();
  for (const account of accounts.filter((each) => each.partner === null)) {
    const { type, source, properties } = account.content;
    if (type && properties?.DisplayName) {
      const name = `${source} ${account.title}`;
      byName.set(name, byName.has(name) ? null : account);
    }
  }
  return byName;
}

/** Pairs accounts that got another identifier: those that alone have their name on both sides. */
function pairRenamed(before, after) {
  const candidates = aloneWithTheirName(after);
  for (const [name, account] of aloneWithTheirName(before)) {
    const partner = candidates.get(name) ?? null;
    if (account !== null && partner !== null) {
      pair(account, partner);
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
  pairRenamed(sides.allBefore, sides.allAfter);
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

/** The account with an identifier as one side has it, also if its identifier is another one there. */
function accountOn(side, identifier, { withIdentifier }) {
  const otherSide = side === "before" ? "after" : "before";
  return withIdentifier[side].get(identifier) ?? withIdentifier[otherSide].get(identifier)?.partner ?? null;
}
