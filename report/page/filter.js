// What is shown: the words of the filter, whether only changes are, and the one mark of accounts that
// is looked for.

const filter = { words: [], changedOnly: false, mark: null };

// The texts that items of the report are searched by, made when they are first asked for.
const searchTexts = new WeakMap();

/** Whether a text has every word of the filter. */
function hasWords(text) {
  const folded = text.toLowerCase();
  return filter.words.every((word) => folded.includes(word));
}

/** Whether an item's texts, its keys and values unless others are given, have every word of the filter. */
function matches(item, textsOf = () => collectTexts(item, [])) {
  if (filter.words.length === 0) {
    return true;
  }
  if (!searchTexts.has(item)) {
    searchTexts.set(item, textsOf().join("\n").toLowerCase());
  }
  const text = searchTexts.get(item);
  return filter.words.every((word) => text.includes(word));
}

/** A text as nodes in which the words of the filter are marked. */
function marked(text) {
  if (filter.words.length === 0) {
    return [text];
  }
  const escaped = filter.words.map((word) => word.replace(/[.*+?^${}()|[\]\\]/g, "\\$&"));
  // Whatever the pattern catches comes at every second place.
  return text.split(new RegExp(`(${escaped.join("|")})`, "iu"))
    .map((piece, index) => (index % 2 === 1 ? make("mark", {}, piece) : piece));
}

/** Takes over what the person entered. */
function setFilter(text, changedOnly, mark = null) {
  filter.mark = mark;
  filter.words = shown(text).toLowerCase().split(/\s+/).filter((word) => word !== "");
  filter.changedOnly = changedOnly;
}
