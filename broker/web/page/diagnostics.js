// The diagnostic tests: what each port can run, what runs, and what came of it.

import {badge, button, link, make, replace, tell} from "./dom.js";
import {ask, call} from "./api.js";
import {attempted, confirmed, mayChange} from "./dialogs.js";
import {hrefOfMethod, hrefOfObject, parsePath} from "./paths.js";
import {failure, section} from "./visit.js";

const interval = 2000; // milliseconds

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

function jobItem(job) {
  const percent = Number(job.percent);
  const known = Number.isFinite(percent) && job.percent !== null;
  return make("tr", {}, make("th", {scope: "row"}, link(hrefOfObject(job.path), job.name || job.id)),
    make("td", {}, job.port ?? ""), make("td", {}, badge(stateOf(job.state), job.state)),
    make("td", {}, make("progress", {max: 100, value: known ? percent : null, "aria-label": "Progress of " + job.name}),
      known ? " " + percent + " %" : ""));
}

/** A datetime of CIM as people write it. */
function timeText(time) {
  return (time ?? "").replace(/^(\d{4})(\d\d)(\d\d)(\d\d)(\d\d)(\d\d)\.\d{6}[+-]\d{3}$/, "$1-$2-$3 $4:$5:$6");
}

function recordItem(record) {
  return make("tr", {}, make("td", {class: "time"}, timeText(record.time)),
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
    this._running = new Map(); // by test and port: what waits for its answer
    this.ports = make("div", {});
    this.now = make("div", {id: "jobs"});
    this.records = make("div", {id: "records"});
    this.trouble = make("div", {});
    this._offered = "";
  }

  /** The records, or none where they cannot be read. */
  async read() {
    try {
      const answer = await ask("diagnostics", {}, this._visit.signal);
      replace(this.trouble);
      this._offer(answer.tests);
      replace(this.now, answer.jobs.length ? tableOf(["Job", "Port", "State", "Progress"], answer.jobs.map(jobItem))
        : make("p", {class: "quiet"}, "No job is known."));
      replace(this.records, answer.records.length
        ? tableOf(["Time", "Test", "Port", "Result", "What it came to"], answer.records.map(recordItem))
        : make("p", {class: "quiet"}, "No test has left a record."));
      return answer.records;
    } catch (error) {
      if (!this._visit.over)
        replace(this.trouble, failure(error));
      return [];
    }
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

  /** How bad it is and what there is to say; a test of a link goes on after the call. */
  async _outcome(answer) {
    const records = await this.read();
    if (Number(answer.returnValue) !== 0)
      return ["critical", "did not run: " + (answer.returnText ?? answer.returnValue)];
    if (!answer.out.Job)
      return ["critical", "made no job: it cannot run on the port as it is"];
    const id = new Map(parsePath(answer.out.Job).keys).get("InstanceID");
    const record = records.find((each) => each.id === id);
    return record ? [stateOf(record.state), "has ended: " + record.state] : ["quiet", "goes on"];
  }
}

export async function showDiagnostics(visit) {
  const diagnostics = new Diagnostics(visit);
  visit.begin("Diagnostics", diagnostics.trouble, section("Tests", diagnostics.ports), section("Jobs", diagnostics.now),
    section("Records", diagnostics.records));
  replace(diagnostics.ports, make("p", {class: "quiet", "aria-busy": "true"}, "Reading …"));
  await visit.repeat(() => diagnostics.read(), () => interval);
}
