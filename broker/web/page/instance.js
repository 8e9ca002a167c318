// One instance: what it says of itself, and where it leads.

import {append, badge, button, link, make, replace, table} from "./dom.js";
import {ask, jsonText} from "./api.js";
import {classOf, hrefOfClass, hrefOfMethod, hrefOfObject, shortName, spoken} from "./paths.js";
import {section, silentOf, unread} from "./visit.js";

const pageSize = 100;

/** What people read, and the number beside it where that says more. */
function valueCell(property) {
  const {value, text, reference} = property;
  if (reference)
    return link(hrefOfObject(reference), shortName(reference) + " (" + spoken(classOf(reference)) + ")");
  if (value === null)
    return "";
  const raw = typeof value === "number" || typeof value === "bigint" ? String(value) : null;
  const shown = text ?? raw ?? jsonText(value);
  const isSaid = raw === null || shown === raw || shown.startsWith(raw + " ") || shown.includes("(" + raw + ")");
  return isSaid ? shown : [shown, " ", make("span", {class: "quiet"}, raw)];
}

function propertyRow(property) {
  return make("tr", {}, make("th", {scope: "row"}, property.name, property.key ? [" ", badge("quiet", "key")] : null,
    property.description ? make("p", {class: "about"}, property.description) : null),
  make("td", {class: "value"}, valueCell(property)), make("td", {class: "quiet"}, property.type));
}

function propertiesOf(properties) {
  const given = properties.filter((property) => property.value !== null);
  const empty = properties.filter((property) => property.value === null);
  const body = make("tbody", {}, given.map(propertyRow));
  const more = empty.length ? button("Show " + empty.length + " without a value", () => {
    append(body, empty.map(propertyRow));
    more.remove();
  }) : null;
  return section("Properties", make("div", {class: "scroll"}, make("table", {class: "properties"},
    make("thead", {}, make("tr", {}, ["Property", "Value", "Type"].map((head) => make("th", {scope: "col"}, head)))), body)), more);
}

function associationItem(item) {
  return make("li", {}, make("span", {class: "quiet"}, item.role + ": "),
    link(hrefOfObject(item.path), item.name || shortName(item.path)),
    make("span", {class: "quiet"}, " " + spoken(item.class)));
}

/** The other ends by their associations, a page at a time. */
class Associations {
  constructor(visit, path) {
    this._visit = visit;
    this._path = path;
    this._shown = 0;
    this._lists = new Map();
    this._groups = make("div", {class: "groups", id: "associations"});
    this._problem = make("div", {});
    this._more = button("Show more", () => this.next().then(() => replace(this._problem), (error) => {
      if (!visit.over)
        replace(this._problem, unread(error));
    }));
  }

  async next() {
    const answer = await ask("associations", {path: this._path, from: this._shown, count: pageSize}, this._visit.signal);
    for (const item of answer.items)
      this._listOf(item.association).append(associationItem(item));
    this._shown += answer.items.length;
    this._more.hidden = answer.items.length === 0 || this._shown >= answer.total;
    replace(this._more, "Show more (" + this._shown + " of " + answer.total + ")");
    return answer.total ? [this._groups, this._problem, this._more] : make("p", {class: "quiet"}, "Nothing is joined to it.");
  }

  _listOf(association) {
    if (!this._lists.has(association)) {
      const list = make("ul", {class: "plain"});
      this._lists.set(association, list);
      this._groups.append(make("div", {}, make("h3", {}, link(hrefOfClass(association), spoken(association))), list));
    }
    return this._lists.get(association);
  }
}

async function methodsOf(visit, path) {
  const {methods, failures} = await ask("methods", {}, visit.signal);
  const own = methods.filter((method) => method.instances.some((instance) => instance.path === path));
  if (own.length === 0)
    return silentOf(classOf(path), failures) ?? make("p", {class: "quiet"}, "None.");
  return table("Methods", ["Method", "What it does"],
    own.map((method) => [link(hrefOfMethod(method.class, method.method, path), method.method), method.description ?? ""]));
}

export async function showInstance(visit, path = "") {
  const name = classOf(path);
  const facts = make("div", {});
  const joined = make("div", {});
  const methods = make("div", {});
  visit.begin(spoken(name) + " " + shortName(path),
    make("p", {class: "path"}, link(hrefOfClass(name), name), make("code", {}, path)), facts,
    section("Associations", joined), section("Methods", methods));
  const associations = new Associations(visit, path);
  await visit.fill(facts, async () => propertiesOf((await ask("instance", {path}, visit.signal)).properties));
  await Promise.all([visit.fill(joined, () => associations.next()), visit.fill(methods, () => methodsOf(visit, path))]);
}
