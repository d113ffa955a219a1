// The accounts before and after, and the rows in which they stand beside each other. What became of each
// is what the ledger of the migration says.

/** One account of one side. */
class Account {
  constructor(content, side, parent) {
    this.content = content;
    this.side = side;
    this.parent = parent;
    this.title = content.title || content.identifier || "an account";
    this.valuesByPath = null;
    this.row = null;
    this.children = (content.children ?? []).map((child) => new Account(child, side, this));
    // Before: the ledger's entry. What the account became, or was, on the other side; the first one
    // is what it is compared with.
    this.entry = null;
    this.others = [];
    this.partner = null;
  }

  /** Its values by their paths, made when they are first asked for. */
  get properties() {
    this.valuesByPath ??= propertiesOf(this.content);
    return this.valuesByPath;
  }
}

/** An account before and after, or one of the two beside a gap; and the rows of its children. */
class Row {
  constructor(before, after, parent) {
    this.before = before;
    this.after = after;
    this.parent = parent;
    this.part = null;
    this.accounts = [before, after].filter((account) => account !== null);
    this.accounts.forEach((account) => { account.row = this; });
    this.marks = [];
    this.children = rowsOf(before?.children ?? [], after?.children ?? [], this);
  }
}

// Each with the sign that tells it without its colour.
const kMarks = {
  added: "+", removed: "−", changed: "≠", moved: "⇄", converted: "⇒", renamed: "#", joined: "∪",
  rebuilt: "↻", earlier: "✓", lost: "✕",
};
const kMarkNames = {
  rebuilt: "made anew", earlier: "carried over by an earlier run", lost: "not carried over",
};
const kMarksOfFates = {
  changed: "changed", renamed: "renamed", converted: "converted", movedBelow: "moved",
  movedToOtherParent: "moved", joined: "joined", rebuilt: "rebuilt", carriedOverEarlier: "earlier",
  notCarriedOver: "lost",
};

/** An account's values by their paths, without the children, which are accounts of their own. */
function propertiesOf(content) {
  const properties = { ...content.properties };
  if (content.children?.length > 0) {
    delete properties.ChildAccounts;
  }
  return valuesByPath(properties);
}

/** Accounts or rows and their children, in one list. */
function flattened(items) {
  return items.flatMap((item) => [item, ...flattened(item.children)]);
}

function hasSameProperties(one, other) {
  return one.properties.size === other.properties.size &&
    [...one.properties].every(([path, value]) =>
      other.properties.has(path) && isSame(value, other.properties.get(path)));
}

function byElement(accounts) {
  return new Map(accounts.map((account) => [account.content.element, account]));
}

/** Lets each account know what the ledger's entries say of it. */
function pairByLedger(entries, { allAfter, beforeByElement }) {
  const after = byElement(allAfter);
  for (const entry of entries) {
    const account = beforeByElement.get(entry.place);
    if (account !== undefined) {
      account.entry = entry;
      account.others = (entry.now ?? []).map((place) => after.get(place)).filter((each) => each !== undefined);
      account.partner = account.others[0] ?? null;
      account.others.forEach((other) => other.others.push(account));
    }
  }
  const isItself = ({ entry }) => !["joined", "notCarriedOver"].includes(entry.fate);
  for (const account of allAfter) {
    account.partner = account.others.find(isItself) ?? account.others[0] ?? null;
  }
}

/** What became of an account of the inputs. */
function marksBefore(account) {
  const { content, entry, partner } = account;
  const mark = kMarksOfFates[entry?.fate];
  const mayAlsoChange = ["moved", "renamed"].includes(mark) && partner !== null;
  const isChanged = mayAlsoChange && (!hasSameProperties(account, partner) ||
                                      !isSame(content.dataclasses, partner.content.dataclasses));
  return [isChanged ? "changed" : null, mark].filter((each) => each);
}

/** What an account of the result is new in that stands beside a gap. */
function marksAfter({ others, partner }) {
  return others.length === 0 ? ["added"] : marksBefore(partner).filter((each) => !["joined", "lost"].includes(each));
}

/**
 * The accounts of both sides, or of one parent, in rows: each beside what it was if that stands below the
 * same parent, in the order before. What is alone after stands below the account that it follows there.
 */
function rowsOf(before, after, parent = null) {
  const besideOf = (account) => {
    const { partner } = account;
    return partner?.partner === account && (partner.parent?.row ?? null) === parent ? partner : null;
  };
  const alone = new Map([[null, []]]);
  let last = null;
  for (const account of after) {
    if (besideOf(account) === null) {
      alone.get(last).push(account);
    } else {
      last = account;
      alone.set(last, []);
    }
  }
  const rowsAlone = (followed) => alone.get(followed).map((account) => new Row(null, account, parent));
  const rows = rowsAlone(null);
  for (const account of before) {
    const other = besideOf(account);
    rows.push(new Row(account, other, parent), ...(other === null ? [] : rowsAlone(other)));
  }
  return rows;
}

// What chips call the accounts without a mark.
const kUnchanged = "unchanged";

function isUnchanged({ marks, before, after }) {
  return marks.length === 0 && (before?.entry ?? after?.partner ?? null) !== null;
}

/** Both sides of a report as accounts that know each other; without a ledger nobody knows. */
function accountsOf(report) {
  const before = (report.accountsBefore ?? []).map((each) => new Account(each, "before", null));
  const after = (report.accountsAfter ?? []).map((each) => new Account(each, "after", null));
  const sides = { allBefore: flattened(before), allAfter: flattened(after) };
  sides.beforeByElement = byElement(sides.allBefore);
  const hasLedger = Array.isArray(report.ledger?.accounts);
  if (hasLedger) {
    pairByLedger(report.ledger.accounts, sides);
  }
  sides.rows = rowsOf(before, after);
  sides.allRows = flattened(sides.rows);
  if (hasLedger) {
    sides.allRows.forEach((row) => { row.marks = row.before ? marksBefore(row.before) : marksAfter(row.after); });
  }
  sides.withIdentifier = { before: new Map(), after: new Map() };
  for (const account of [...sides.allBefore, ...sides.allAfter]) {
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

/** The account of a stage's change on each side, null for none. */
function accountsOfChange({ account, identifier }, accounts) {
  const itself = account === undefined ? null : accounts.beforeByElement.get(account) ?? null;
  return { before: itself ?? accountOn("before", identifier, accounts),
           after: itself?.partner ?? accountOn("after", identifier, accounts) };
}
