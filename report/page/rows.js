// The rows of accounts, those of children below their parents', and the way to one of them.

/** The rows that the filter leaves. */
function rowList(rows, page) {
  const shownRows = rows.filter(isShown);
  return shownRows.length === 0 ? make("p", { class: "dim" }, "None to show.") :
    fillList(make("ul", { class: "rows" }), shownRows, (row) => rowItem(row, page), titleOf);
}

function isShown(row) {
  return isChosen(row) || row.children.some(isShown);
}

function titleOf({ accounts }) {
  return accounts[0].title;
}

/** A row and, beneath it, its children: all of them if the filter chose the row itself. */
function rowItem(row, page) {
  const isItself = isChosen(row);
  row.part = makePart({ class: ["account", ...row.marks].join(" ") }, rowSummary(row), () => rowBody(row, page), row,
    isItself);
  const children = isItself && !filter.changedOnly ? row.children : row.children.filter(isShown);
  return children.length === 0 ? [row.part] : [row.part,
    fillList(make("ul", { class: "rows" }), children, (child) => rowItem(child, page), titleOf)];
}

/** Builds what a row stands in until the row itself is on the page. */
function buildTo(row) {
  if (row.parent !== null) {
    buildTo(row.parent);
  }
  while (!row.part?.isConnected && groupOfItem.get(row)?.isConnected) {
    openPart(groupOfItem.get(row));
  }
}

/** Unfolds a row and everything that it is in, and brings the person there. */
function goTo(row) {
  for (let part = row.part; part !== null; part = part.parentElement.closest("details")) {
    openPart(part);
  }
  row.part.scrollIntoView({ block: "center" });
  row.part.querySelector("summary").focus({ preventScroll: true });
}
