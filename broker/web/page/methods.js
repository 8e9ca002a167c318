// The methods that can be called, and a form for each.

import {button, link, make, replace, table, tell} from "./dom.js";
import {ask, call, session} from "./api.js";
import {attempted, confirmed, mayChange} from "./dialogs.js";
import {Field, Mistake} from "./form.js";
import {classOf, hrefOfClass, hrefOfMethod, hrefOfObject, shortName, spoken, wordsOf} from "./paths.js";
import {section, silent, silentOf} from "./visit.js";

function listOf(answer) {
  const classes = grouped(answer.methods);
  const sections = [...classes].map(([name, own]) => section(spoken(name),
    table("Methods of " + name, ["Method", "What it does"],
      own.map((method) => [link(hrefOfMethod(name, method.method), method.method), method.description ?? ""]))));
  return [sections.length + answer.failures.length ? sections : make("p", {class: "notice"}, "There are no methods."),
    silent(answer.failures)];
}

function grouped(methods) {
  const groups = new Map();
  for (const method of methods)
    groups.set(method.class, [...(groups.get(method.class) ?? []), method]);
  return groups;
}

/** "Change the WWN" of ChangeWWN; one word is about the object itself. */
function deedOf(method) {
  const [verb, ...rest] = wordsOf(method).map((word) => /^[A-Z]{2,}s?$/.test(word) ? word : word.toLowerCase());
  const deed = verb.charAt(0).toUpperCase() + verb.slice(1);
  return rest.length === 0 ? deed : /^(from|to|of|on|all)$/.test(rest[0]) ? deed + " " + rest.join(" ") : deed + " the " + rest.join(" ");
}

/** One of the options of an installation has this effect, which its name does not say. */
function andReset(options) {
  return options?.includes(2) ? " and reset it" : "";
}

/**
 * Of methods whose names do not say what happens: of the texts of what was chosen, of the object and of the instance that
 * is called, and of the chosen values.
 */
const questions = {
  DeleteDump: ({object}) => `Delete all dump files of ${object}?`,
  DisableAllPrioLaneLuns: ({InitiatorWWPN, TargetWWPN, Option}) =>
    `Take away all priority lanes between ${InitiatorWWPN} and ${TargetWWPN}, ${Option}?`,
  GetConfigTable: ({object, URI}) => `Write the table of tags of the adapter of ${object} to ${URI}?`,
  InstallFromByteStream: ({object, Image}, {InstallOptions}) =>
    `Install the firmware (${Image}) on the adapter of ${object}${andReset(InstallOptions)}?`,
  InstallFromURI: ({object, URI}, {InstallOptions}) =>
    `Install the firmware ${URI} on the adapter of ${object}${andReset(InstallOptions)}?`,
  RequestStateChange: ({object, RequestedState}) => `Set ${object} to ${RequestedState}?`,
  RunDiagnosticService: ({object, instance}) => `Run ${instance} on ${object}?`,
  SetConfigTable: ({object, URI}) => `Give the adapter of ${object} the table of tags ${URI}?`,
  SetDriverParameter: ({object, strParam, strValue, bGlobal, bPermanent}) =>
    `Set ${strParam} of the driver at ${object} to ${strValue} (${bGlobal}; ${bPermanent})?`,
  SetFECState: ({object, EnableFlag}) => `Set the error correction (FEC) of ${object} to ${EnableFlag}?`,
  SetGlobalFlag: ({object, State}) => `Set the tagging of the adapter of ${object} to ${State}?`,
  SetPortEnabled: ({object, PortEnabled}) => `Set ${object} to ${PortEnabled}?`,
};
const longestWord = 100; // of a question; all of it stands below

function asWord(text) {
  return text.length > longestWord ? text.slice(0, longestWord) + "…" : text;
}

function valuesOf(given) {
  return Object.fromEntries(given.map(({field, value}) => [field.parameter.name, value]));
}

/** What is done to what, as a question. */
function questionOf(method, path, given) {
  const target = given.find(({field}) => field.parameter.type === "reference");
  const objectPath = target ? target.value : path;
  const object = spoken(classOf(objectPath)) + " " + asWord(shortName(objectPath));
  if (!Object.hasOwn(questions, method.name))
    return deedOf(method.name) + " of " + object + "?";
  const texts = method.parameters.map(({name}) => [name, "nothing"])
    .concat(given.map(({field, value}) => [field.parameter.name, asWord(field.text(value))]));
  return questions[method.name]({...Object.fromEntries(texts), object, instance: asWord(shortName(path))}, valuesOf(given));
}

function isInput(parameter) {
  return parameter.qualifiers.includes("In");
}

function meaningOf(parameter, value, text) {
  if (parameter?.type === "reference" && typeof value === "string")
    return link(hrefOfObject(value), shortName(value) + " (" + spoken(classOf(value)) + ")");
  return text ?? "none";
}

function resultOf(method, answer) {
  const isGood = Number(answer.returnValue) === 0;
  const said = answer.returnText ? answer.returnText + " (" + answer.returnValue + ")" : String(answer.returnValue);
  const out = Object.entries(answer.out ?? {});
  tell(method.name + ": " + said);
  return [make("p", {class: "notice " + (isGood ? "ok" : "critical"), role: "alert", id: "returned"},
    method.name + " returned ", make("strong", {}, said)),
  out.length ? table("What it gave", ["Parameter", "Value"], out.map(([name, value]) =>
    [name, meaningOf(method.parameters.find((parameter) => parameter.name === name), value, answer.outText[name])])) : null];
}

/** What is filled in, in the order of the parameters. Throws Mistake. */
async function read(fields) {
  const given = [];
  for (const field of fields) {
    const value = await field.read();
    if (value !== undefined)
      given.push({field, value});
  }
  return given;
}

function detailsOf(method, path, given) {
  return [method.description ? make("p", {}, method.description) : null,
    make("dl", {class: "facts"}, make("dt", {}, "Instance"), make("dd", {}, shortName(path)),
      given.map(({field, value}) => [make("dt", {}, field.parameter.name), make("dd", {}, field.text(value))]))];
}

class MethodForm {
  constructor(visit, className, method, instances, chosen) {
    this._visit = visit;
    this._method = method;
    this._fields = method.parameters.filter(isInput).map((parameter) => new Field(parameter));
    this._result = make("div", {id: "result"});
    this._why = make("span", {class: "quiet"});
    this._target = this._targetField(className, instances, chosen);
    const send = button("Call …", () => this._ask(), {type: "submit", class: "main"}); // clicked by Enter in a field too
    this.node = make("form", {submit: (event) => event.preventDefault(), class: "method"}, this._target.node,
      this._fields.map((field) => field.node), make("div", {class: "buttons start"}, send, this._why), this._result);
    this._tellWhy();
    document.addEventListener("session", () => this._tellWhy(), {signal: visit.signal});
  }

  _tellWhy() { replace(this._why, session.mayChange ? "" : session.whyNot); }

  /** The instance whose method is called: one of those that are known, or a path. */
  _targetField(className, instances, chosen) {
    if (instances.length === 0 || (chosen && !instances.some((each) => each.path === chosen))) {
      const field = new Field({name: "Instance", type: "reference", class: className, description: "Whose method is called.", required: true});
      field.set(chosen);
      return {node: field.node, read: () => field.read()};
    }
    const select = make("select", {id: "instance"}, instances.map((each) =>
      make("option", {value: each.path, selected: each.path === chosen}, each.name || shortName(each.path))));
    return {node: make("div", {class: "field"}, make("label", {for: "instance"}, "Instance"), select), read: async () => select.value};
  }

  async _ask() {
    const method = this._method;
    let path, given;
    try {
      path = await this._target.read();
      given = await read(this._fields);
    } catch (error) {
      if (error instanceof Mistake)
        return;
      throw error;
    }
    if (this._visit.over || !await mayChange() || !await confirmed(questionOf(method, path, given), detailsOf(method, path, given), "Call " + method.name))
      return;
    replace(this._result, make("p", {class: "quiet", "aria-busy": "true"}, method.name + " is at work …"));
    const answer = await attempted(this._result, () => call(path, method.name, valuesOf(given)));
    if (answer)
      replace(this._result, resultOf(method, answer));
  }
}

async function formOf(visit, className, name, path) {
  const [info, {methods, failures}] = await Promise.all([ask("classes/" + encodeURIComponent(className), {}, visit.signal),
    ask("methods", {}, visit.signal)]);
  const method = info.methods.find((each) => each.name === name);
  if (!method)
    return make("p", {class: "notice critical"}, className + " has no method " + name + ".");
  const instances = methods.find((each) => each.class === className && each.method === name)?.instances ?? [];
  return [make("p", {}, method.description ?? "", " ", link(hrefOfClass(className), className)),
    instances.length ? null : silentOf(className, failures),
    new MethodForm(visit, className, method, instances, path).node];
}

export async function showMethods(visit, className = "", name = "", path = "") {
  const place = make("div", {});
  if (!name) {
    visit.begin("Methods", place);
    return visit.fill(place, async () => listOf(await ask("methods", {}, visit.signal)));
  }
  visit.begin(deedOf(name), make("p", {class: "quiet"}, className + "." + name), place);
  return visit.fill(place, () => formOf(visit, className, name, path));
}
