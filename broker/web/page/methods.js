// The methods that can be called, and a form for each.

import {button, link, make, replace, table, tell} from "./dom.js";
import {ask, call, jsonText, session} from "./api.js";
import {attempted, confirmed, mayChange} from "./dialogs.js";
import {Field, Mistake} from "./form.js";
import {classOf, hrefOfClass, hrefOfMethod, hrefOfObject, shortName, spoken} from "./paths.js";
import {section} from "./visit.js";

function listOf(methods) {
  const classes = grouped(methods);
  if (classes.size === 0)
    return make("p", {class: "notice"}, "There are no methods.");
  return [...classes].map(([name, own]) => section(spoken(name),
    table("Methods of " + name, ["Method", "What it does"],
      own.map((method) => [link(hrefOfMethod(name, method.method), method.method), method.description ?? ""]))));
}

function grouped(methods) {
  const groups = new Map();
  for (const method of methods)
    groups.set(method.class, [...(groups.get(method.class) ?? []), method]);
  return groups;
}

/** "Change the WWN" of ChangeWWN; one word is about the object itself. */
function deedOf(method) {
  const words = method.replace(/([a-z\d])([A-Z])/g, "$1 $2").replace(/([A-Z]+)([A-Z][a-z])/g, "$1 $2").split(" ");
  const [verb, ...rest] = words.map((word) => /^[A-Z]{2,}s?$/.test(word) ? word : word.toLowerCase());
  const deed = verb.charAt(0).toUpperCase() + verb.slice(1);
  return rest.length === 0 ? deed : /^(from|to|of|on)$/.test(rest[0]) ? deed + " " + rest.join(" ") : deed + " the " + rest.join(" ");
}

/** What is done to what, as a question. */
function questionOf(method, path, given) {
  const target = given.find(({field}) => field.parameter.type === "reference");
  const object = target ? target.value : path;
  return deedOf(method.name) + " of " + spoken(classOf(object)) + " " + shortName(object) + "?";
}

function isInput(parameter) {
  return parameter.qualifiers.includes("In") || !parameter.qualifiers.includes("Out");
}

function meaningOf(parameter, value) {
  if (parameter?.type === "reference" && typeof value === "string")
    return link(hrefOfObject(value), shortName(value) + " (" + spoken(classOf(value)) + ")");
  const text = value === null ? "none" : typeof value === "object" ? jsonText(value) : String(value);
  const name = parameter?.values?.[text];
  return name ? name + " (" + text + ")" : text;
}

function resultOf(method, answer) {
  const isGood = Number(answer.returnValue) === 0;
  const said = answer.returnText ? answer.returnText + " (" + answer.returnValue + ")" : String(answer.returnValue);
  const out = Object.entries(answer.out ?? {});
  tell(method.name + ": " + said);
  return [make("p", {class: "notice " + (isGood ? "ok" : "critical"), role: "alert", id: "returned"},
    method.name + " returned ", make("strong", {}, said)),
  out.length ? table("What it gave", ["Parameter", "Value"], out.map(([name, value]) =>
    [name, meaningOf(method.parameters.find((parameter) => parameter.name === name), value)])) : null];
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
  constructor(visit, method, instances, chosen) {
    this._method = method;
    this._fields = method.parameters.filter(isInput).map((parameter) => new Field(parameter));
    this._result = make("div", {id: "result"});
    this._why = make("span", {class: "quiet"});
    this._target = this._targetField(instances, chosen);
    this._send = button("Call …", null, {type: "submit", class: "main"});
    const submit = (event) => {
      event.preventDefault();
      this._ask();
    };
    this.node = make("form", {submit, class: "method"}, this._target.node, this._fields.map((field) => field.node),
      make("div", {class: "buttons start"}, this._send,
        this._why), this._result);
    this._tellWhy();
    document.addEventListener("session", () => this._tellWhy(), {signal: visit.signal});
  }

  _tellWhy() { replace(this._why, session.mayChange ? "" : session.whyNot); }

  /** The instance whose method is called: one of those that are known, or a path. */
  _targetField(instances, chosen) {
    if (instances.length === 0 || (chosen && !instances.some((each) => each.path === chosen))) {
      const field = new Field({name: "Instance", type: "reference", class: classOf(chosen), description: "Whose method is called."});
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
    if (!await mayChange() || !await confirmed(questionOf(method, path, given), detailsOf(method, path, given), "Call " + method.name))
      return;
    replace(this._result, make("p", {class: "quiet", "aria-busy": "true"}, method.name + " is at work …"));
    this._send.disabled = true;
    const parameters = Object.fromEntries(given.map(({field, value}) => [field.parameter.name, value]));
    const answer = await attempted(this._result, () => call(path, method.name, parameters));
    this._send.disabled = false;
    if (answer)
      replace(this._result, resultOf(method, answer));
  }
}

async function formOf(visit, className, name, path) {
  const [info, {methods}] = await Promise.all([ask("classes/" + encodeURIComponent(className), {}, visit.signal),
    ask("methods", {}, visit.signal)]);
  const method = info.methods.find((each) => each.name === name);
  if (!method)
    return make("p", {class: "notice critical"}, className + " has no method " + name + ".");
  const instances = methods.find((each) => each.class === className && each.method === name)?.instances ?? [];
  return [make("p", {}, method.description ?? "", " ", link(hrefOfClass(className), className)),
    new MethodForm(visit, method, instances, path).node];
}

export async function showMethods(visit, className = "", name = "", path = "") {
  const place = make("div", {});
  if (!name) {
    visit.begin("Methods", place);
    return visit.fill(place, async () => listOf((await ask("methods", {}, visit.signal)).methods));
  }
  visit.begin(deedOf(name), make("p", {class: "quiet"}, className + "." + name), place);
  return visit.fill(place, () => formOf(visit, className, name, path));
}
