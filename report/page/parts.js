// The pieces of the page: elements, and parts that fold and are built when they are first opened.

const kGroupSize = 100;
const kOpenedByFilter = 10;
const kSliceMilliseconds = 30;

// What builds the content of a part that was never open, the item that a part is of, the items whose
// parts a person opened, and the innermost group that is to hold an item in a long list.
const builders = new WeakMap();
const itemOfPart = new WeakMap();
const openedItems = new Set();
const groupOfItem = new WeakMap();

/** An element with its attributes, those that are null left out, and its children, also texts. */
function make(tag, attributes, ...children) {
  const element = document.createElement(tag);
  for (const [name, value] of Object.entries(attributes)) {
    if (value !== null && value !== undefined) {
      element.setAttribute(name, value);
    }
  }
  element.append(...children.flat(Infinity).filter((child) => child !== null));
  return element;
}

/** A text from the report, with the filter's words marked. */
function data(tag, attributes, text) {
  return make(tag, { dir: "auto", ...attributes }, marked(shown(text)));
}

function button(text, action) {
  const element = make("button", { type: "button", class: "link" }, text);
  element.addEventListener("click", action);
  return element;
}

/** Builds the content of a part unless it was. */
function buildPart(part) {
  const build = builders.get(part);
  if (build !== undefined) {
    builders.delete(part);
    part.append(make("div", { class: "body" }, build()));
  }
}

function openPart(part) {
  buildPart(part);
  part.open = true;
}

/**
 * A part that folds. `summary` is what is seen of it when it is folded, `build` gives its content, and
 * `item` is what of the report it shows, if a person's opening it is to be remembered. `hasMatch` says
 * whether the filter's words are in the item, for which it may be opened.
 */
function makePart(attributes, summary, build, item = null, hasMatch = item !== null) {
  const part = make("details", attributes, make("summary", {}, summary));
  builders.set(part, build);
  if (item !== null) {
    itemOfPart.set(part, item);
  }
  // An item within the content of a folded one would be lost to whoever filters for it.
  const hidesMatch = hasMatch && filter.words.length > 0 && !hasWords(part.textContent);
  if (openedItems.has(item) || (hidesMatch && matchesAreFew)) {
    openPart(part);
  }
  return part;
}

// Whether so little is left by the filter that it is opened to where the words are.
let matchesAreFew = false;

function setMatchCount(count) {
  matchesAreFew = count <= kOpenedByFilter;
}

/**
 * Fills a list with an element for each item. A long list gets groups instead, which fold, and those of
 * a very long one are groups of groups: no more than the size of a group is ever built at once.
 */
function fillList(list, items, makeItem, nameOf, first = 1) {
  if (items.length <= kGroupSize) {
    list.append(...items.map((item) => make("li", {}, makeItem(item))));
    return list;
  }
  let size = kGroupSize;
  while (size * kGroupSize < items.length) {
    size *= kGroupSize;
  }
  for (let start = 0; start < items.length; start += size) {
    const members = items.slice(start, start + size);
    const from = first + start;
    const summary = [
      make("strong", {}, `${from.toLocaleString("en")} to ${(from + members.length - 1).toLocaleString("en")}`),
      make("span", { class: "dim", dir: "auto" },
           shown(`${nameOf(members[0])} … ${nameOf(members[members.length - 1])}`)),
    ];
    const group = makePart({ class: "group" }, summary,
      () => fillList(make("ul", {}), members, makeItem, nameOf, from));
    members.forEach((member) => groupOfItem.set(member, group));
    list.append(make("li", {}, group));
  }
  return list;
}

/** Opens every part, those that are built on the way included, and gives each that was folded. */
function* openEverything(root) {
  const waiting = [...root.querySelectorAll("details")];
  for (let index = 0; index < waiting.length; index += 1) {
    const part = waiting[index];
    const isNew = builders.has(part);
    if (!part.open) {
      openPart(part);
      yield part;
    }
    if (isNew) {
      part.querySelectorAll("details").forEach((inner) => waiting.push(inner));
    }
  }
}

// The opening that is under way; another one, or folding, ends it.
let opening = null;

/** Opens everything, a slice of time after the other, so that the page answers meanwhile. */
function expandAll(root) {
  const steps = openEverything(root);
  opening = steps;
  const slice = () => {
    const end = performance.now() + kSliceMilliseconds;
    while (opening === steps && performance.now() < end) {
      if (steps.next().done) {
        opening = null;
      }
    }
    if (opening === steps) {
      setTimeout(slice);
    }
  };
  slice();
}

function foldAll(root) {
  opening = null;
  openedItems.clear();
  root.querySelectorAll("details[open]").forEach((part) => { part.open = false; });
}

/** Builds parts when they are opened, and remembers those that a person opened. */
function watchParts(root) {
  root.addEventListener("toggle", (event) => {
    if (event.target.open) {
      buildPart(event.target);
    }
  }, true);
  root.addEventListener("click", (event) => {
    const part = event.target.closest("summary")?.parentElement;
    const item = part && itemOfPart.get(part);
    if (item) {
      // The part is about to change.
      part.open ? openedItems.delete(item) : openedItems.add(item);
    }
  });
}
