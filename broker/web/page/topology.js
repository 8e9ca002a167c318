// A picture of the host: cards, their ports, and the targets that these reach with their units. Side by side where there is
// room, below one another where there is not.

import {draw, make} from "./dom.js";
import {hrefOfClass, hrefOfObject} from "./paths.js";

const lineHeight = 18;
const padding = 8;
const gap = 12;
const characterWidth = 7.4; // of the font of the picture, at the most
const wideEnough = 760;
const mostTargets = 40; // of all ports together; what a port has beyond its part of them is one box
const fewestTargets = 3; // of a port
const mostUnits = 40; // of all targets together; of more than these a target has a line that leads to their table
const unitClass = "CIM_LogicalDevice"; // which all units are, of whatever sort

/** The nodes of that kind below a node, and none below these. */
export function descendants(node, kind, found = []) {
  for (const child of node.children)
    if (child.kind === kind)
      found.push(child);
    else
      descendants(child, kind, found);
  return found;
}

function factText(node, label) {
  return node.facts.find((fact) => fact.label === label)?.text ?? "";
}

function countText(count, word) {
  return count + " " + word + (Number(count) === 1 ? "" : "s");
}

const boxed = new Set(["Card", "FC port", "Virtual port", "Target"]);

/** What is wrong with it and with those of its parts that have no boxes of their own. */
function problemsOf(node) {
  return [...node.problems, ...node.children.filter((child) => !boxed.has(child.kind)).flatMap(problemsOf)];
}

/** "critical", "warning", or "" for what is well. */
function stateOf(problems) {
  const severities = problems.map((problem) => problem.severity);
  return severities.includes("critical") ? "critical" : severities.length ? "warning" : "";
}

function boxOf(node, title, lines, kind, found = []) {
  const problems = [...new Set(found.map((problem) => problem.text))];
  const said = problems.map((text) => text.toLowerCase());
  const rest = lines.filter((line) => line && !said.includes(line.toLowerCase()));
  return {node, kind, title, lines: rest, problems, state: stateOf(found), path: node.path,
    leads: [], links: [], parts: [], whole: null};
}

function cardBox(card) {
  return boxOf(card, factText(card, "model") || card.name, ["serial number " + factText(card, "serial number")], "Card", problemsOf(card));
}

/** With what was found of it beside the tree, such as errors that grow. */
function portBox(port, problems) {
  const fabric = factText(port, "fabric");
  const pair = [factText(port, "state"), factText(port, "speed")].filter(Boolean).join(", ");
  return boxOf(port, port.name, [pair, fabric && "fabric " + fabric], port.kind,
    [...problemsOf(port), ...problems.filter((problem) => problem.path && problem.path === port.path)]);
}

function nameOf(target) {
  return target.wwpn ?? target.name;
}

/** Lines of a target's box that lead somewhere themselves. */
function unitLeads(target, areFew) {
  if (!areFew || target.children.length === 0)
    return [{text: target.contents ?? "no units", href: hrefOfClass(unitClass, nameOf(target)),
      label: "Units of " + nameOf(target)}];
  return target.children.map((unit) => {
    const text = [unit.name, factText(unit, "capacity")].filter(Boolean).join(", ");
    return {text, href: hrefOfObject(unit.path), label: unit.kind + " " + text};
  });
}

function targetBox(target, areFew) {
  return {...boxOf(target, nameOf(target), [], "Target", problemsOf(target)), leads: unitLeads(target, areFew)};
}

/** Of each WWPN the node with the most units, since ports may see different ones. */
function fullestOf(targets) {
  const nodes = new Map();
  for (const target of targets) {
    const known = nodes.get(nameOf(target));
    if (!known || known.units < target.units)
      nodes.set(nameOf(target), target);
  }
  return nodes;
}

/** The boxes of targets, one for each WWPN, with the ports that reach them. */
class Targets {
  boxes = [];
  _known = new Map();

  constructor(root) {
    this._most = Math.max(fewestTargets, Math.floor(mostTargets / descendants(root, "FC port").length));
    this._nodes = fullestOf(descendants(root, "Target"));
    const units = [...this._nodes.values()].reduce((sum, target) => sum + Number(target.units), 0);
    this._areFewUnits = units <= mostUnits;
  }

  /** Joins the port with the box of that name, which is made where there is none yet. */
  _join(port, name, make) {
    if (!this._known.has(name)) {
      this._known.set(name, make());
      this.boxes.push(this._known.get(name));
    }
    port.links.push(this._known.get(name));
  }

  seenBy(port) {
    const listed = ownTargets(port.node);
    if (listed.length > 0)
      this._reach(port, listed);
    else if (port.node.targets)
      this._count(port, port.node);
  }

  _reach(port, targets) {
    for (const target of targets.slice(0, this._most))
      this._join(port, nameOf(target), () => targetBox(this._nodes.get(nameOf(target)), this._areFewUnits));
    const rest = targets.slice(this._most);
    if (rest.length > 0)
      this._join(port, rest.map(nameOf).join(),
        () => boxOf(port.node, countText(rest.length, "more target"), [], "Targets"));
  }

  _count(port, {targets, ...node}) {
    this._join(port, node.name, () => boxOf(node, countText(targets, "target"), [node.contents && node.contents + " behind the port"], "Targets"));
  }
}

/** Targets of the port itself, not of the virtual ports on it. */
function ownTargets(port) {
  return descendants({children: port.children.filter((child) => child.kind !== "Virtual port")}, "Target");
}

function columnsOf({root, problems}) {
  const cards = [];
  const ports = [];
  const targets = new Targets(root);
  const drawn = new Set();
  const addPort = (port, whole = null) => {
    const place = {...portBox(port, problems), whole};
    ports.push(place);
    drawn.add(port);
    targets.seenBy(place);
    place.parts = descendants(port, "Virtual port").map((each) => addPort(each, place));
    return place;
  };
  for (const card of descendants(root, "Card"))
    cards.push({...cardBox(card), links: descendants(card, "FC port").map((port) => addPort(port))});
  for (const port of [...descendants(root, "FC port"), ...descendants(root, "Virtual port")])
    if (!drawn.has(port)) // what holds it could not be read
      addPort(port);
  return [cards, ports, targets.boxes];
}

function heightOf(box) {
  return 2 * padding + lineHeight * (1 + box.lines.length + box.problems.length + box.leads.length);
}

/** Sets x, y, width and height of boxes one below the other; gives the height of all. */
function stack(boxes, x, width) {
  let y = 1;
  for (const box of boxes) {
    const inset = box.whole ? 16 : 0;
    Object.assign(box, {x: x + inset, y, width: width - inset, height: heightOf(box)});
    y += box.height + gap;
  }
  return y - gap + 1;
}

function middle(boxes) {
  const tops = boxes.map((box) => box.y);
  const feet = boxes.map((box) => box.y + box.height);
  return (Math.min(...tops) + Math.max(...feet)) / 2;
}

/** Moves boxes down to the middle of what they lead to, where the one above leaves room. */
function align(boxes) {
  let free = 1;
  for (const box of boxes) {
    const wanted = box.links.length ? middle(box.links) - box.height / 2 : box.y;
    box.y = Math.max(free, wanted);
    free = box.y + box.height + gap;
  }
  return free;
}

function layWide(columns, width) {
  const between = 56;
  const columnWidth = (width - 2 * between - 2) / 3;
  const heights = columns.map((boxes, at) => stack(boxes, 1 + at * (columnWidth + between), columnWidth));
  const grown = [columns[1], columns[0]].map(align);
  return Math.max(...heights, ...grown);
}

/** A target stands below the first port that reaches it; the others say so in words. */
function inOrderOf([cards, ports]) {
  const inOrder = [];
  const placed = new Set();
  const placePort = (port) => {
    inOrder.push([port, port.whole ? 2 : 1]);
    const above = port.links.filter((target) => placed.has(target));
    port.lines.push(...above.map((target) => "and " + target.title + " above"));
    port.links = port.links.filter((target) => !placed.has(target));
    for (const box of [port, ...port.links])
      placed.add(box);
    inOrder.push(...port.links.map((target) => [target, 3]));
    port.parts.forEach(placePort);
  };
  for (const card of cards) {
    inOrder.push([card, 0]);
    card.links.forEach(placePort);
  }
  ports.filter((port) => !port.whole && !placed.has(port)).forEach(placePort);
  return inOrder;
}

function layNarrow(columns, width) {
  const step = 14;
  const inOrder = inOrderOf(columns);
  let y = 1;
  for (const [box, depth] of inOrder) {
    const x = 1 + depth * step;
    Object.assign(box, {x, y, width: width - x - 1, height: heightOf(box)});
    y += box.height + gap;
  }
  return y - gap + 1;
}

function cut(text, width) {
  const room = Math.floor((width - 2 * padding) / characterWidth);
  return text.length > room ? text.slice(0, Math.max(1, room - 1)) + "…" : text;
}

function drawText(box, row, content, style) {
  return draw("text",
    {x: box.x + padding + 4, y: box.y + padding + lineHeight * (row + 0.5), class: style, "dominant-baseline": "middle"},
    cut(content, box.width - 4));
}

function drawLead(box, row, {text, href, label}) {
  return draw("a", {class: "lead", href, "aria-label": label},
    draw("title", {}, label),
    draw("rect", {x: box.x + padding, y: box.y + padding + lineHeight * row, width: box.width - 2 * padding,
      height: lineHeight, rx: 3}),
    drawText(box, row, text, "line"));
}

/** A box, and above it the lines that are links themselves. */
function drawBox(box) {
  const rows = [[box.title, "title"], ...box.problems.map((problem) => [problem, "problem"]),
    ...box.lines.map((line) => [line, "line"])];
  const label = [box.kind, box.title, ...box.problems, ...box.lines].join(", ");
  const shapes = [
    draw("title", {}, label),
    draw("rect", {class: "box", x: box.x, y: box.y, width: box.width, height: box.height, rx: 5}),
    draw("rect", {class: "edge", x: box.x, y: box.y, width: 4, height: box.height, rx: 2}),
    rows.map(([content, style], row) => drawText(box, row, content, style)),
  ];
  const style = "node " + box.kind.toLowerCase().replace(" ", "-") + " " + box.state;
  const drawn = box.path
    ? draw("a", {class: style, href: hrefOfObject(box.path), "aria-label": label}, shapes)
    : draw("g", {class: style}, shapes);
  return [drawn, ...box.leads.map((lead, at) => drawLead(box, rows.length + at, lead))];
}

function drawLine(from, to, isWide) {
  const y1 = from.y + from.height / 2;
  const y2 = to.y + to.height / 2;
  if (isWide) {
    const x1 = from.x + from.width;
    const bend = (to.x - x1) / 2;
    return draw("path", {class: "line " + from.state, d: `M${x1} ${y1}C${x1 + bend} ${y1} ${to.x - bend} ${y2} ${to.x} ${y2}`});
  }
  const x = from.x + 7;
  return draw("path", {class: "line " + from.state, d: `M${x} ${from.y + from.height}V${y2}H${to.x}`});
}

/** The picture of a host in so many pixels of width. */
export function pictureOf(host, width) {
  const columns = columnsOf(host);
  const boxes = columns.flat();
  if (boxes.length === 0)
    return make("p", {class: "notice"}, "No adapter is known.");
  const isWide = width >= wideEnough;
  const height = Math.ceil((isWide ? layWide : layNarrow)(columns, width));
  const lines = boxes.flatMap((from) => [...from.links.map((to) => drawLine(from, to, isWide)),
    ...from.parts.map((part) => drawLine(from, part, false))]);
  return draw("svg", {viewBox: `0 0 ${width} ${height}`, width, height, role: "group", "aria-label": "Cards, ports and targets"},
    lines, boxes.map(drawBox));
}
