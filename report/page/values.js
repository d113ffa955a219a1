// Values of a report as texts: what people read, and how two of them differ.

const kLongestText = 2000;

// What would not be seen or would turn the text around it: controls, line breaks, directions.
const kUnseen = /[\u0000-\u001f\u007f-\u009f\u061c\u200e\u200f\u2028-\u202e\u2066-\u2069\ufeff]/g;
const kLoneSurrogate = /[\ud800-\udbff](?![\udc00-\udfff])|(?<![\ud800-\udbff])[\udc00-\udfff]/g;
// A text that looks like a value of another kind, or like none.
const kAmbiguous = /^$|^\s|\s$|^["[{<]|^(true|false|null|NaN)$|^[-+]?[0-9.]+([eE][-+]?\d+)?$/;

/** A text from the report as it can be shown: on one line, with nothing unseen in it. */
function shown(text) {
  return String(text)
    .replace(kLoneSurrogate, "\ufffd")
    .replace(kUnseen, (unseen) => "\\u" + unseen.charCodeAt(0).toString(16).padStart(4, "0"));
}

/** A value on one line. Texts stand as they are, in quotation marks where they could be mistaken. */
function describe(value) {
  const isText = typeof value === "string";
  // With blanks after commas, so that a long list is broken between its elements.
  const text = isText && !kAmbiguous.test(value) ? value :
    JSON.stringify(value, null, 1).replace(/(?<=[[{])\n *|\n *(?=[\]}])/g, "").replace(/\n */g, " ");
  const whole = shown(text);
  return whole.length <= kLongestText ? whole :
    `${shown(text.slice(0, kLongestText))}… (${text.length} characters)`;
}

function isDictionary(value) {
  return typeof value === "object" && value !== null && !Array.isArray(value);
}

/** Whether two values are the same, whatever the order of keys. */
function isSame(one, other) {
  if (typeof one !== "object" || typeof other !== "object" || one === null || other === null) {
    return one === other;
  }
  if (Array.isArray(one) !== Array.isArray(other)) {
    return false;
  }
  const keys = Object.keys(one);
  return keys.length === Object.keys(other).length &&
    keys.every((key) => Object.hasOwn(other, key) && isSame(one[key], other[key]));
}

/**
 * The values of a dictionary by their paths, keys joined by "/", in the order of the keys.
 * Dictionaries within it are walked into; anything else is one value.
 */
function valuesByPath(dictionary, found = new Map(), prefix = "") {
  for (const key of Object.keys(dictionary).sort()) {
    const value = dictionary[key];
    if (isDictionary(value) && Object.keys(value).length > 0) {
      valuesByPath(value, found, `${prefix}${key}/`);
    } else {
      found.set(prefix + key, value);
    }
  }
  return found;
}

/** Every text within a value, keys included, appended to a list: what a filter looks through. */
function collectTexts(value, texts) {
  if (Array.isArray(value)) {
    value.forEach((element) => collectTexts(element, texts));
  } else if (isDictionary(value)) {
    for (const [key, element] of Object.entries(value)) {
      texts.push(key);
      collectTexts(element, texts);
    }
  } else if (value !== undefined && value !== null) {
    texts.push(shown(value));
  }
  return texts;
}

/**
 * Where two texts differ: the length of what they begin with in common, and of what they end with
 * in common.
 */
function commonEnds(one, other) {
  const limit = Math.min(one.length, other.length);
  let start = 0;
  while (start < limit && one[start] === other[start]) {
    start += 1;
  }
  let end = 0;
  while (end < limit - start && one[one.length - 1 - end] === other[other.length - 1 - end]) {
    end += 1;
  }
  return { start, end };
}

/** "1 account", "2 accounts", "10,000 accounts". */
function counted(count, noun) {
  return `${count.toLocaleString("en")} ${noun}${count === 1 ? "" : "s"}`;
}

/** A duration as people say it. */
function duration(seconds) {
  return seconds >= 1 ? `${seconds.toFixed(2)} s` :
    seconds >= 0.01 ? `${(seconds * 1000).toFixed(0)} ms` : `${(seconds * 1000).toFixed(1)} ms`;
}
