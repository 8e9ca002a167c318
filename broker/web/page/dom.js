// Elements out of data. Text becomes text nodes and attributes are of a known kind, so that no value of the hardware can
// become markup.

const svgSpace = "http://www.w3.org/2000/svg";
const attributeNames = new Set(["autocomplete", "class", "colspan", "d", "dominant-baseline", "for", "height",
  "hidden", "id", "inputmode", "list", "max", "name", "open", "placeholder", "points", "preserveAspectRatio",
  "required", "role", "rows", "rx", "scope", "selected", "spellcheck", "tabindex", "title", "type", "value",
  "viewBox", "width", "x", "x1", "x2", "y", "y1", "y2"]);

// What is not seen, or has the text around it shown in another order.
const unseen = /[\u0000-\u001f\u007f-\u009f\u00ad\u061c\u200b-\u200f\u2028-\u202e\u2060-\u2069\ufeff\ufff9-\ufffb]/g;

/** A text as people can see it: what has no shape is written as its number. */
export function visible(text) {
  return String(text).replace(unseen, (c) => "\\u" + c.charCodeAt(0).toString(16).padStart(4, "0"));
}

function setAttribute(node, name, value) {
  if (value === null || value === undefined || value === false)
    return;
  if (name === "href") {
    if (!value.startsWith("#"))
      throw new Error("links lead to views of this page alone");
  } else if (!attributeNames.has(name) && !/^(aria|data)-[a-z]+$/.test(name)) {
    throw new Error(name + " is no attribute of this page");
  }
  node.setAttribute(name, value === true ? "" : name === "value" ? String(value) : visible(value));
}

function fill(node, attributes, children) {
  for (const [name, value] of Object.entries(attributes))
    if (typeof value === "function")
      node.addEventListener(name, value);
    else
      setAttribute(node, name, value);
  append(node, children);
  return node;
}

/** Appends nodes and texts, also of nested lists; null and undefined are nothing. */
export function append(node, ...children) {
  for (const child of children.flat(Infinity))
    if (child !== null && child !== undefined && child !== false)
      node.append(child instanceof Node ? child : visible(child));
  return node;
}

/** An element of HTML; a function among the attributes listens to the event of its name. */
export function make(tag, attributes = {}, ...children) {
  return fill(document.createElement(tag), attributes, children);
}

/** The same of SVG. */
export function draw(tag, attributes = {}, ...children) {
  return fill(document.createElementNS(svgSpace, tag), attributes, children);
}

export function replace(node, ...children) {
  node.textContent = "";
  return append(node, ...children);
}

/** What tells a link or a button from others of its place, also when it is made anew; the last where its text has changed. */
function identitiesOf(node) {
  const own = node.getAttribute("href") ?? "";
  const label = node.getAttribute("aria-label") ?? node.textContent;
  return [own + " " + label, own || label];
}

/** As replace(), of a place that is shown anew now and again: what is equal stays, with what is selected in it; the focus
 *  goes to the link or button that it was on, and what was unfolded stays so. All stays while a button in it is at work. */
export function renew(place, ...children) {
  const fresh = append(place.cloneNode(false), ...children);
  const unfolded = new Set([...place.querySelectorAll("details[open] > summary")].map((each) => each.textContent));
  for (const summary of fresh.querySelectorAll("details > summary"))
    summary.parentNode.open = unfolded.has(summary.textContent);
  if (fresh.isEqualNode(place) || place.querySelector("button[aria-disabled]"))
    return;
  const focused = place.contains(document.activeElement) ? identitiesOf(document.activeElement) : [];
  place.replaceChildren(...fresh.childNodes);
  const all = [...place.querySelectorAll("a, button, summary")];
  const [same] = focused.flatMap((identity, at) => all.filter((each) => identitiesOf(each)[at] === identity));
  same?.focus({preventScroll: true});
}

export function link(href, ...children) {
  return make("a", {href}, ...children);
}

/** Takes no second click until what the first one began has ended. It is not disabled meanwhile: it would lose the focus. */
export function button(text, click, attributes = {}) {
  const node = make("button", {type: "button", ...attributes}, text);
  node.addEventListener("click", async (event) => {
    if (!click || node.hasAttribute("aria-disabled"))
      return;
    node.setAttribute("aria-disabled", "true");
    try {
      await click(event);
    } finally {
      node.removeAttribute("aria-disabled");
    }
  });
  return node;
}

/** A word with the colour of how bad it is: "ok", "warning", "critical" or "quiet". */
export function badge(state, text) {
  return make("span", {class: "badge " + state}, text);
}

/** A table with a caption for those who cannot see it; cells are what append() takes. */
export function table(caption, heads, rows, attributes = {class: "list"}) {
  return make("div", {class: "scroll", role: "region", tabindex: "0", "aria-label": caption},
    make("table", attributes,
      make("thead", {}, make("tr", {}, heads.map((head) => make("th", {scope: "col"}, head)))),
      make("tbody", {}, rows.map((cells) => make("tr", {}, cells.map((cell) => make("td", {}, cell)))))));
}

let told;
/** Says something at the foot of the page, also to those who cannot see it. */
export function tell(text) {
  const place = document.getElementById("told");
  replace(place, text);
  place.classList.add("shown");
  clearTimeout(told);
  told = setTimeout(() => place.classList.remove("shown"), 8000);
}
