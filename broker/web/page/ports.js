// The ports as they are now, and how their counters go on.

import {append, badge, button, link, make, renew, replace} from "./dom.js";
import {ask} from "./api.js";
import {hrefOfObject} from "./paths.js";
import {section, silent, unread} from "./visit.js";
import {barOf, plotOf} from "./plot.js";

const intervals = [1, 5, 15, 60]; // seconds
const mostSamples = 60;
const fewestPlotted = 20; // a plot has room for so many rates from its beginning
let seconds = 5;

// What was read of each counter, by port and name: it outlives a visit, so that nothing is lost by looking elsewhere.
const histories = new Map();

class History {
  first = null;
  samples = [];

  add(time, value) {
    const last = this.samples.at(-1);
    if (last && value < last.value) { // the counter began anew
      this.samples = [];
      this.first = null;
    }
    this.first ??= value;
    this.samples.push({time, value});
    this.samples = this.samples.slice(-mostSamples);
  }

  get grown() { return this.samples.at(-1).value - this.first; }
  /** Per second, between each two samples. */
  get rates() {
    return this.samples.slice(1).map((sample, at) => {
      const before = this.samples[at];
      return (sample.value - before.value) / Math.max(0.001, (sample.time - before.time) / 1000);
    });
  }
}

function historyOf(port, counter) {
  const key = port.path + "\n" + counter.name;
  if (!histories.has(key))
    histories.set(key, new History());
  return histories.get(key);
}

function numberText(value) {
  return Number(value).toLocaleString("en", {maximumFractionDigits: value < 10 ? 2 : 0});
}

function amountText(value, unit) {
  const units = ["", "k", "M", "G", "T"];
  let step = 0;
  let amount = value;
  for (; amount >= 10000 && step < units.length - 1; step++)
    amount /= 1000;
  return numberText(amount) + " " + units[step] + (unit === "bytes" ? "B" : "");
}

function rateText(history, unit) {
  const rate = history.rates.at(-1);
  return rate === undefined ? "–" : amountText(rate, unit).trimEnd() + "/s";
}

/** A row of a counter, changed in place while it is looked at. */
class CounterRow {
  constructor(port, counter) {
    this.name = make("th", {scope: "row"}, counter.label || counter.name);
    this.value = make("td", {class: "number"});
    this.rate = make("td", {class: "number"});
    this.plot = make("td", {});
    this.mark = make("td", {});
    this.node = make("tr", {"data-counter": counter.name}, this.name, this.value, this.rate, this.plot, this.mark);
  }

  show(counter, history) {
    renew(this.value, numberText(counter.value));
    renew(this.rate, rateText(history, counter.unit));
    const {rates} = history;
    renew(this.plot, plotOf(rates, Math.max(fewestPlotted, rates.length), (counter.label || counter.name) + " per second"));
    this.node.classList.toggle("grows", counter.grows);
    const grown = history.grown > 0 ? ", +" + numberText(history.grown) : "";
    renew(this.mark, counter.grows ? badge("warning", "grows" + grown) : null);
  }
}

function measureRow(measure) {
  const limits = [["low alarm", measure.lowAlarm], ["low warning", measure.lowWarning],
    ["warning", measure.highWarning], ["alarm", measure.highAlarm]]
    .filter(([, limit]) => typeof limit === "number").map(([name, limit]) => name + " at " + limit);
  return make("tr", {}, make("th", {scope: "row"}, measure.label),
    make("td", {class: "number"}, measure.value + " " + measure.unit), make("td", {}, barOf(measure)),
    make("td", {}, badge(measure.state, measure.state)), make("td", {class: "quiet"}, limits.join(", ")));
}

/** A port's part of the page. */
class PortPanel {
  constructor(port) {
    this.rows = new Map();
    this.facts = make("p", {});
    this.body = make("tbody", {});
    this.measures = make("div", {});
    this.node = section("", this.facts,
      make("div", {class: "scroll"}, make("table", {class: "counters"},
        make("caption", {}, "Counters of " + port.name),
        make("thead", {}, make("tr", {}, [["Counter"], ["Value", "number"], ["Rate", "number"], ["Over time"], [""]]
          .map(([head, style]) => make("th", {scope: "col", class: style}, head)))),
        this.body)),
      this.measures);
    this.node.classList.add("panel");
    append(replace(this.node.querySelector("h2")), link(hrefOfObject(port.path), port.name));
  }

  show(port) {
    renew(this.facts, badge(port.severity, port.state), " ", [port.speedText, port.card].filter(Boolean).join(", "));
    for (const counter of port.counters) {
      if (!this.rows.has(counter.name)) {
        this.rows.set(counter.name, new CounterRow(port, counter));
        this.body.append(this.rows.get(counter.name).node);
      }
      this.rows.get(counter.name).show(counter, historyOf(port, counter));
    }
    renew(this.measures, port.measures.length ? make("div", {class: "scroll"}, make("table", {class: "measures"},
      make("caption", {}, "Measures of " + port.name), make("tbody", {}, port.measures.map(measureRow)))) : null);
  }
}

function remember(ports, time) {
  for (const port of ports)
    for (const counter of port.counters)
      historyOf(port, counter).add(time, Number(counter.value));
}

function growingErrors(ports) {
  return ports.flatMap((port) => port.counters
    .filter((counter) => counter.grows)
    .map((counter) => make("li", {}, badge("warning", "grows"), " ", counter.label || counter.name, " of ",
      link(hrefOfObject(port.path), port.name))));
}

/** Of ports that are there no more. */
function dropPanels(panels, present) {
  for (const [path, panel] of panels)
    if (!present.has(path)) {
      panel.node.remove();
      panels.delete(path);
    }
}

export async function showPorts(visit) {
  const panels = new Map();
  const place = make("div", {});
  const trouble = make("div", {});
  const empty = make("div", {});
  const errors = make("div", {id: "growing"});
  const unanswered = make("div", {});
  const read = async () => {
    try {
      const {ports, failures} = await ask("ports", {}, visit.signal);
      remember(ports, performance.now());
      replace(trouble);
      const growing = growingErrors(ports);
      renew(unanswered, silent(failures));
      renew(errors, growing.length ? make("ul", {class: "problems"}, growing) : null);
      renew(empty, ports.length + failures.length ? null : make("p", {class: "notice"}, "There are no ports."));
      dropPanels(panels, new Set(ports.map((port) => port.path)));
      for (const port of ports) {
        if (!panels.has(port.path)) {
          panels.set(port.path, new PortPanel(port));
          place.append(panels.get(port.path).node);
        }
        panels.get(port.path).show(port);
      }
      place.dataset.reads = Number(place.dataset.reads ?? 0) + 1;
    } catch (error) {
      if (!visit.over)
        replace(trouble, unread(error));
    }
  };
  const choose = (event) => {
    seconds = Number(event.target.value);
    visit.hurry();
  };
  const choice = make("select", {id: "interval", change: choose},
    intervals.map((each) => make("option", {value: each, selected: each === seconds}, each + " s")));
  place.id = "panels";
  visit.begin("Ports", make("div", {class: "toolbar"}, make("label", {}, "Read every ", choice), button("Read now", () => visit.hurry())),
    trouble, errors, unanswered, empty, place);
  await visit.repeat(read, () => seconds * 1000);
}
