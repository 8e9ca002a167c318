// Fields for the parameters of methods, by their types, and what stands in them as JSON.

import {button, make, replace} from "./dom.js";
import {ask, jsonText, parse} from "./api.js";
import {classOf, shortName, spoken} from "./paths.js";

const mostBytes = 4 << 20; // as numbers in JSON they are four times as many, and a request has an end
const mostOffered = 200; // instances for a reference
let fields = 0;

export class Mistake extends Error {}

function integerOf(text, type) {
  if (!/^[+-]?\d+$|^0x[\da-f]+$/i.test(text))
    throw new Mistake("'" + text + "' is no integer");
  const value = BigInt(text.replace(/^\+/, ""));
  const bits = BigInt(type.replace(/\D/g, "") || 16);
  const isSigned = type.startsWith("sint");
  const [low, high] = isSigned ? [-(1n << (bits - 1n)), (1n << (bits - 1n)) - 1n] : [0n, (1n << bits) - 1n];
  if (value < low || value > high)
    throw new Mistake("'" + text + "' is not within " + low + " and " + high);
  return Number.isSafeInteger(Number(value)) ? Number(value) : value;
}

function realOf(text) {
  const value = Number(text);
  if (!Number.isFinite(value))
    throw new Mistake("'" + text + "' is no number");
  return value;
}

function scalarOf(text, type) {
  if (/^[us]int|^char16/.test(type))
    return integerOf(text.trim(), type);
  if (type.startsWith("real"))
    return realOf(text.trim());
  if (type === "boolean") {
    if (text !== "true" && text !== "false")
      throw new Mistake("'" + text + "' is neither true nor false");
    return text === "true";
  }
  return text;
}

/** The numbers of a value map that stand alone; of those in ranges a person writes the number. */
function choicesOf(values) {
  return Object.entries(values ?? {}).filter(([key]) => /^-?(\d+|0x[\da-f]+)$/i.test(key));
}

function plainField(parameter, attributes = {}) {
  const input = make("input", {type: "text", spellcheck: "false", autocomplete: "off",
    inputmode: /^[us]int/.test(parameter.type) ? "numeric" : null, ...attributes});
  return {node: input, read: () => input.value === "" ? undefined : scalarOf(input.value, parameter.type)};
}

function nameOf(values, value) {
  const name = values?.[value];
  return name ? name + " (" + value + ")" : String(value);
}

function choiceField(parameter) {
  const choices = choicesOf(parameter.values);
  const isOpen = choices.length < Object.keys(parameter.values).length;
  const other = plainField(parameter, {hidden: true, "aria-label": "Number of " + parameter.name});
  const select = make("select", {change: () => { other.node.hidden = select.value !== "other"; }},
    make("option", {value: ""}, "– none –"),
    choices.map(([key]) => make("option", {value: key}, nameOf(parameter.values, key))),
    isOpen ? make("option", {value: "other"}, "another number …") : null);
  const read = () => select.value === "other" ? other.read() : select.value === "" ? undefined : integerOf(select.value, parameter.type);
  return {node: isOpen ? make("span", {class: "pair"}, select, other.node) : select, labelled: select, read,
    text: () => select.value === "other" ? other.node.value : select.selectedOptions[0].textContent};
}

function booleanField() {
  const select = make("select", {}, [["", "– none –"], ["true", "yes"], ["false", "no"]]
    .map(([value, text]) => make("option", {value}, text)));
  return {node: select, read: () => select.value === "" ? undefined : select.value === "true"};
}

/** What methods mean by a reference to anything, by the parameter. */
const meant = {Target: "TVRHBA_FCPort", ManagedElement: "TVRHBA_PortController"};

async function offer(place, name) {
  const {rows} = await ask("classes/" + encodeURIComponent(name) + "/instances", {count: mostOffered})
    .catch(() => ({rows: []})); // a path can be written all the same
  replace(place, rows.map((row) => make("option", {value: row.path}, spoken(classOf(row.path)) + " " + shortName(row.path))));
}

/** Paths of instances are offered; any other can be written. */
function referenceField(parameter) {
  const id = "offered-" + ++fields;
  const name = (parameter.class === "CIM_ManagedElement" && meant[parameter.name]) || parameter.class;
  const offered = make("datalist", {id});
  const field = plainField(parameter, {list: id, placeholder: "path of " + spoken(name)});
  offer(offered, name);
  return {...field, node: make("span", {class: "pair"}, field.node, offered), labelled: field.node,
    text: () => shortName(field.node.value)};
}

async function bytesOf(file) {
  if (file.size > mostBytes)
    throw new Mistake("the file has more than " + (mostBytes >> 20) + " MiB");
  return Array.from(new Uint8Array(await file.arrayBuffer()));
}

function bytesField(parameter) {
  const file = make("input", {type: "file"});
  const text = plainField({type: "string", name: parameter.name}, {placeholder: "or numbers: 0, 17, 0xFF", "aria-label": parameter.name + " as numbers"});
  return {
    node: make("span", {class: "pair"}, file, text.node), labelled: file,
    read: async () => {
      if (file.files.length)
        return bytesOf(file.files[0]);
      const written = text.read();
      return written === undefined ? undefined : listOf(written, parameter.type);
    },
    text: () => file.files.length ? file.files[0].name + ", " + file.files[0].size + " bytes" : text.node.value,
  };
}

function listOf(text, type) {
  const element = type.replace("[]", "");
  const parts = text.split(/[\s,]+/).filter((part) => part !== "");
  return parts.map((part) => scalarOf(part, element));
}

/** A line each: an empty one is an empty text, for lists that have one value for each of another list. */
function linesOf(text, type) {
  const element = type.replace("[]", "");
  return text.replace(/\n$/, "").split("\n").map((line) => scalarOf(line, element));
}

/** Values with names are offered; others can be written. */
function arrayField(parameter) {
  const isLines = /^(string|reference|datetime)/.test(parameter.type);
  const area = make("textarea", {rows: "3", spellcheck: "false", placeholder: isLines ? "one in a line" : "numbers, with commas"});
  const add = (key) => {
    area.value = [area.value.trim(), key].filter((part) => part !== "").join(", ");
  };
  const offered = choicesOf(parameter.values).map(([key]) => button("+ " + nameOf(parameter.values, key), () => add(key)));
  return {
    node: offered.length ? make("div", {}, area, make("div", {class: "buttons start"}, offered)) : area, labelled: area,
    read: () => area.value === "" ? undefined : (isLines ? linesOf : listOf)(area.value, parameter.type),
    text: (values) => values.map((value) => isLines ? JSON.stringify(value) : nameOf(parameter.values, value)).join(", "),
  };
}

function instanceField(parameter) {
  const area = make("textarea", {rows: "4", spellcheck: "false",
    placeholder: '{"class": "' + (parameter.class ?? "…") + '", "properties": {}}'});
  const read = () => {
    const value = area.value === "" ? undefined : parse(area.value);
    if (value === null)
      throw new Mistake("this is no JSON");
    return value;
  };
  return {node: area, read};
}

function editorOf(parameter) {
  const {type} = parameter;
  if (type === "uint8[]")
    return bytesField(parameter);
  if (type.startsWith("instance"))
    return instanceField(parameter);
  if (type.endsWith("[]"))
    return arrayField(parameter);
  if (type === "boolean")
    return booleanField();
  if (type.startsWith("reference"))
    return referenceField(parameter);
  if (type === "datetime")
    return plainField(parameter, {placeholder: "20260131120000.000000+000, or how long: 00000000001000.000000:000"});
  return choicesOf(parameter.values).length ? choiceField(parameter) : plainField(parameter);
}

/** A labelled field: its node, `read()` for the value or undefined for none, `text()` for people. */
export class Field {
  constructor(parameter) {
    this.parameter = parameter;
    this._editor = editorOf(parameter);
    const id = "field-" + ++fields;
    const input = this._editor.labelled ?? this._editor.node;
    const problemId = id + "-problem";
    this._input = input;
    this._problem = make("p", {class: "mistake", id: problemId, role: "alert"});
    input.id = id;
    input.setAttribute("name", parameter.name);
    input.setAttribute("aria-describedby", problemId);
    this.node = make("div", {class: "field"},
      make("label", {for: id}, parameter.name, " ", make("span", {class: "quiet"}, parameter.type)),
      parameter.description ? make("p", {class: "about"}, parameter.description) : null, this._editor.node, this._problem);
  }

  /** Throws Mistake, which stands beside the field as well. */
  async read() {
    replace(this._problem);
    try {
      const value = await this._editor.read();
      if (value === undefined && this.parameter.required)
        throw new Mistake(this.parameter.name + " is missing");
      return value;
    } catch (error) {
      if (!(error instanceof Mistake))
        throw error;
      replace(this._problem, error.message);
      this._input.focus();
      throw error;
    }
  }

  set(value) { this._input.value = value; }
  text(value) { return this._editor.text?.(value) ?? (typeof value === "object" ? jsonText(value) : String(value)); }
}
