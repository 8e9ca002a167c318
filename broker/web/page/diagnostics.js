// The diagnostic tests: what each port can run, what runs, and what came of it.

import {badge, button, link, make, renew, replace, tell} from "./dom.js";
import {ask, call} from "./api.js";
import {attempted, confirmed, mayChange} from "./dialogs.js";
import {hrefOfMethod, hrefOfObject, parsePath} from "./paths.js";
import {section, silent, unread} from "./visit.js";

const interval = 2000; // milliseconds
const linkTest = "TVR:FCHBA D-Port Test"; // the only one that ends later than its call, and can be cancelled
const terminate = 4; // a state that a job can be asked for

function spokenTest(name) {
  return name.replace(/^TVR:FCHBA /, "");
}

function portsOf(tests) {
  const ports = new Map();
  for (const test of tests)
    for (const port of test.ports) {
      if (!ports.has(port.port))
        ports.set(port.port, {...port, tests: []});
      ports.get(port.port).tests.push(test);
    }
  return [...ports.values()];
}

/** How bad the name of a state of a job or record is. */
function stateOf(name) {
  return /fail|exception|abort|kill|terminat/i.test(name) ? "critical" : /warning|incomplete|stopped/i.test(name) ? "warning"
    : /complet|ok/i.test(name) ? "ok" : "quiet";
}

/** A job may say at its beginning that it has ended: a record, an error or a state that only the end brings tell it. */
function hasEnded(job, records) {
  return records.some((record) => record.id === job.id) || job.error !== null || /^(terminated|failed)/i.test(job.state);
}

/** Why a job could not be cancelled is told in `place`. */
function cancelButton(job, place) {
  const cancel = async () => {
    const what = spokenTest(job.name) + " on port " + job.port;
    const details = make("p", {}, "It leaves no result.");
    if (!await mayChange() || !await confirmed("Cancel the " + what + "?", details, "Cancel the test"))
      return;
    replace(place);
    const answer = await attempted(place, () => call(job.path, "RequestStateChange", {RequestedState: terminate}));
    if (answer)
      tell("The " + what + (Number(answer.returnValue) === 0 ? " is being cancelled"
        : " cannot be cancelled: " + (answer.returnText ?? answer.returnValue)));
  };
  return button("Cancel …", cancel, {"aria-label": "Cancel " + spokenTest(job.name) + " on " + job.port});
}

function jobItem(job, isOver, place) {
  const state = isOver || /^running$/i.test(job.state) ? job.state : "no result yet";
  const percent = Number(job.percent);
  const known = Number.isFinite(percent) && job.percent !== null;
  return make("tr", {}, make("th", {scope: "row"}, link(hrefOfObject(job.path), job.name || job.id)),
    make("td", {}, job.port ?? ""), make("td", {}, badge(stateOf(state), state)),
    make("td", {}, make("progress", {max: 100, value: known ? percent : null, "aria-label": "Progress of " + job.name}),
      known ? " " + percent + " %" : ""),
    make("td", {}, !isOver && job.name === linkTest ? cancelButton(job, place) : null));
}

function recordItem(record) {
  return make("tr", {}, make("td", {class: "time"}, record.time ?? ""),
    make("td", {}, link(hrefOfObject(record.path), spokenTest(record.test || record.id))),
    make("td", {}, record.port ?? ""), make("td", {}, badge(stateOf(record.state), record.state)),
    make("td", {class: "text"}, record.text));
}

function tableOf(heads, rows) {
  return make("div", {class: "scroll"}, make("table", {}, make("thead", {}, make("tr", {},
    heads.map((head) => make("th", {scope: "col"}, head)))), make("tbody", {}, rows)));
}

class Diagnostics {
  constructor(visit) {
    this._visit = visit;
    this.ports = make("div", {});
    this.now = make("div", {id: "jobs"});
    this.refusal = make("div", {});
    this.records = make("div", {id: "records"});
    this.trouble = make("div", {});
    this.unanswered = make("div", {});
    this._offered = "";
  }

  async read() {
    try {
      this._show(await ask("diagnostics", {}, this._visit.signal));
      replace(this.trouble);
    } catch (error) {
      if (!this._visit.over)
        replace(this.trouble, unread(error));
    }
  }

  _show({tests, jobs, records, failures}) {
    const none = (text) => failures.length ? null : make("p", {class: "quiet"}, text);
    renew(this.unanswered, silent(failures));
    if (failures.length === 0 || !this._offered)
      this._offer(tests);
    renew(this.now, jobs.length
      ? tableOf(["Job", "Port", "State", "Progress", ""], jobs.map((job) => jobItem(job, hasEnded(job, records), this.refusal)))
      : none("No job is known."));
    renew(this.records, records.length
      ? tableOf(["Time", "Test", "Port", "Result", "What it came to"], records.map(recordItem))
      : none("No test has left a record."));
  }

  /** The buttons stay as they are while the tests do: one of them may have the focus. */
  _offer(tests) {
    const text = JSON.stringify(tests);
    if (text === this._offered)
      return;
    this._offered = text;
    const ports = portsOf(tests);
    replace(this.ports, ports.length ? ports.map((port) => this._panelOf(port))
      : make("p", {class: "notice"}, "No port can run a test."));
  }

  _panelOf(port) {
    const result = make("div", {"data-port": port.port});
    return make("div", {class: "panel"}, make("h3", {}, link(hrefOfObject(port.path), "Port " + port.port)),
      make("div", {class: "buttons start"}, port.tests.map((test) =>
        button(spokenTest(test.name), () => this._run(test, port, result), {"aria-label": "Run " + spokenTest(test.name) + " on " + port.port}))),
      result);
  }

  async _run(test, port, place) {
    if (!await mayChange())
      return;
    const name = spokenTest(test.name);
    const details = [test.help ? make("p", {}, test.help + ".") : null,
      make("p", {}, "The test runs with its own settings. Some tests take the port from its traffic, and other readers wait meanwhile."),
      make("p", {}, link(hrefOfMethod("TVRHBA_FCHBADiagnosticTest", "RunDiagnosticService", test.path), "Other settings"))];
    if (!await confirmed("Run the " + name + " on port " + port.port + "?", details, "Run"))
      return;
    replace(place, make("p", {role: "status"}, make("progress", {"aria-label": name}), " ", name + " is running …"));
    const answer = await attempted(place, () => call(test.path, "RunDiagnosticService", {ManagedElement: port.path}));
    if (!answer)
      return;
    const [state, text] = await this._outcome(answer);
    replace(place, make("p", {class: "notice " + state, role: "alert"}, name + " " + text + ". ",
      answer.out.Job ? link(hrefOfObject(answer.out.Job), "Its job") : null));
    tell(name + " " + text);
  }

  /** How bad it is and what there is to say, also when the view was left; a test of a link goes on after the call. */
  async _outcome(answer) {
    if (Number(answer.returnValue) !== 0)
      return ["critical", "did not run: " + (answer.returnText ?? answer.returnValue)];
    if (!answer.out.Job)
      return ["critical", "made no job: it cannot run on the port as it is"];
    const id = new Map(parsePath(answer.out.Job).keys).get("InstanceID");
    const unreadable = (why) => ["warning", "ran, but its result could not be read: " + why];
    let found;
    try {
      found = await ask("diagnostics");
    } catch (error) {
      return unreadable(error.message);
    }
    this._show(found);
    const record = found.records.find((each) => each.id === id);
    if (record)
      return [stateOf(record.state), "has ended: " + record.state];
    if (found.failures.length > 0)
      return unreadable(found.failures[0]);
    const job = found.jobs.find((each) => each.id === id);
    return job && !hasEnded(job, found.records) ? ["quiet", "goes on"] : ["warning", "has ended without a result"];
  }
}

export async function showDiagnostics(visit) {
  const diagnostics = new Diagnostics(visit);
  visit.begin("Diagnostics", diagnostics.trouble, diagnostics.unanswered, section("Tests", diagnostics.ports),
    section("Jobs", diagnostics.refusal, diagnostics.now), section("Records", diagnostics.records));
  replace(diagnostics.ports, make("p", {class: "quiet", "aria-busy": "true"}, "Reading …"));
  await visit.repeat(() => diagnostics.read(), () => interval);
}
