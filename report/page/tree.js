// The two trees of accounts, and the way from one account to the same one on the other side.

/** One side's accounts that the filter leaves, as a tree. */
function accountTree(accounts, page) {
  const shownAccounts = accounts.filter((account) => isShown(account));
  if (shownAccounts.length === 0) {
    return make("p", { class: "dim" }, accounts.length === 0 ? "No accounts." : "None to show.");
  }
  return fillList(make("ul", { class: "tree" }), shownAccounts,
    (account) => accountNode(account, page), (account) => account.title);
}

function isShown(account) {
  return isChosen(account) || account.children.some(isChosen);
}

/** An account and, beneath it, its children: all of them if the filter chose the account itself. */
function accountNode(account, page) {
  account.part = makePart({ class: ["account", ...account.marks].join(" ") }, accountSummary(account),
    () => accountBody(account, page), account, isChosen(account));
  page.accountOfPart.set(account.part, account);
  const children = isChosen(account) && !filter.changedOnly ? account.children :
    account.children.filter(isChosen);
  if (children.length === 0) {
    return [account.part];
  }
  return [account.part, fillList(make("ul", {}), children, (child) => accountNode(child, page),
    (child) => child.title)];
}

/** Builds what an account stands in until the account itself is on the page. */
function buildTo(account) {
  if (account.parent !== null) {
    buildTo(account.parent);
  }
  while (!account.part?.isConnected && groupOfItem.get(account)?.isConnected) {
    openPart(groupOfItem.get(account));
  }
}

/** Unfolds an account and everything that it is in, and brings the person there. */
function goTo(account) {
  for (let part = account.part; part !== null; part = part.parentElement.closest("details")) {
    openPart(part);
  }
  account.part.scrollIntoView({ block: "center" });
  account.part.querySelector("summary").focus({ preventScroll: true });
}

/** Marks, while an account is pointed at or has the focus, the same one on the other side. */
function watchPartners(root, page) {
  let marked = null;
  const mark = (event) => {
    const part = event.target.closest?.("details.account");
    const partner = (part && page.accountOfPart.get(part)?.partner?.part) ?? null;
    if (partner !== marked) {
      marked?.classList.remove("partner");
      partner?.classList.add("partner");
      marked = partner;
    }
  };
  root.addEventListener("pointerover", mark);
  root.addEventListener("focusin", mark);
}
