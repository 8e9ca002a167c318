// The logs of the provider and of its driver.

import {badge, button, link, make, replace, tell} from "./dom.js";
import {ask, call} from "./api.js";
import {attempted, confirmed, mayChange} from "./dialogs.js";
import {hrefOfMethod} from "./paths.js";
import {unread} from "./visit.js";

const pageSize = 200;

function stateOf(severity) {
  return /crit|err|fatal|emerg|alert/i.test(severity) ? "critical" : /warn/i.test(severity) ? "warning" : "quiet";
}

function entryRow(entry) {
  return make("tr", {}, make("td", {class: "time"}, entry.time ?? ""),
    make("td", {}, entry.severity ? badge(stateOf(entry.severity), entry.severity) : null),
    make("td", {class: "text"}, entry.text));
}

/** The entries of a log, newest first. */
class Entries {
  constructor(visit, id) {
    this._visit = visit;
    this._id = id;
    this._body = make("tbody", {id: "entries"});
    this._count = make("p", {class: "quiet", role: "status", id: "count"});
    this._older = button("Older entries", () => this._add(this._body.children.length));
    this._older.hidden = true;
    this._problem = make("div", {});
    this.node = make("div", {}, this._count, this._problem, make("div", {class: "scroll"}, make("table", {class: "log"},
      make("thead", {}, make("tr", {}, ["Time", "Severity", "Text"].map((head) => make("th", {scope: "col"}, head)))),
      this._body)), this._older);
  }

  /** The newest, in place of what is shown; older ones that are on their way belong to that. */
  read() {
    this._series = {};
    return this._add(0);
  }

  async _add(from) {
    const series = this._series;
    try {
      const answer = await ask("logs/" + this._id, {from, count: pageSize}, this._visit.signal);
      if (series !== this._series)
        return;
      if (from === 0)
        replace(this._body);
      this._body.append(...answer.entries.map(entryRow));
      const shown = this._body.children.length;
      replace(this._problem);
      replace(this._count, answer.total === 0 ? "The log has no entries." : shown + " of " + answer.total + " entries, newest first");
      this._older.hidden = shown >= answer.total || answer.entries.length === 0;
    } catch (error) {
      if (!this._visit.over)
        replace(this._problem, unread(error));
    }
  }
}

async function clear(log, entries, place) {
  if (!await mayChange())
    return;
  const details = make("p", {}, "All its entries are deleted. Nobody can bring them back.");
  if (!await confirmed("Clear the log of the " + log.id + "?", details, "Clear"))
    return;
  replace(place);
  const answer = await attempted(place, () => call(log.path, "ClearLog", {}));
  if (!answer)
    return;
  if (Number(answer.returnValue) === 0)
    tell("The log of the " + log.id + " was cleared");
  else
    replace(place, make("p", {class: "notice critical", role: "alert"},
      "The log was not cleared: " + (answer.returnText ?? answer.returnValue)));
  await entries.read();
}

function tabs(logs, current) {
  return make("nav", {"aria-label": "Logs"}, make("ul", {class: "tabs"}, logs.map((log) => {
    const anchor = link("#/logs/" + log.id, log.id === "provider" ? "Provider" : "Driver");
    if (log.id === current.id)
      anchor.setAttribute("aria-current", "page");
    return make("li", {}, anchor);
  })));
}

/** The form that enables a log. */
function enabling(log, text) {
  return link(hrefOfMethod("TVRHBA_RecordLog", "RequestStateChange", log.path), text);
}

/** A log that is not enabled shows nothing new; the driver's is read when it is enabled, and then alone. */
function stateOfLog(log) {
  if (!log.enabled)
    return make("p", {class: "notice warning", id: "disabled"}, log.id === "driver"
      ? "The driver's log has not been read: that is done when it is enabled. "
      : "The log is not enabled: it shows nothing new. ", enabling(log, "Enable it …"));
  return log.id === "driver"
    ? make("p", {}, "The log is as it was when it was enabled last. ", enabling(log, "Have it read again …")) : null;
}

export async function showLogs(visit, id = "provider") {
  const place = make("div", {});
  visit.begin("Logs", place);
  await visit.fill(place, async () => {
    const logs = (await ask("logs", {}, visit.signal)).sort((a, b) => b.id.localeCompare(a.id)); // the provider's first
    const log = logs.find((each) => each.id === id);
    if (!log)
      return [make("p", {class: "notice"}, "There is no such log."),
        make("ul", {}, logs.map((each) => make("li", {}, link("#/logs/" + each.id, each.name || each.id))))];
    const entries = new Entries(visit, log.id);
    const problem = make("div", {});
    const clearButton = log.path ? button("Clear …", () => clear(log, entries, problem), {class: "danger"}) : null;
    const settings = log.id === "provider" && log.path ? link(hrefOfMethod("TVRHBA_RecordLog", "SetLogParams", log.path), "What is logged …") : null;
    entries.read();
    return [tabs(logs, log), make("div", {class: "toolbar"}, button("Read again", () => entries.read()), clearButton, settings),
      stateOfLog(log), problem, entries.node];
  });
}
