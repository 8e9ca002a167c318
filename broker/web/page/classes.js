// All classes that are served, and the instances of one.

import {link, make, replace} from "./dom.js";
import {ask} from "./api.js";
import {hrefOfClass, hrefOfMethod, hrefOfObject, shortName} from "./paths.js";
import {Grid} from "./grid.js";

const patience = 250; // milliseconds that a person may pause while he types

/** Calls `act` once the person has stopped typing. */
function whenTyped(act) {
  let timer;
  return () => {
    clearTimeout(timer);
    timer = setTimeout(act, patience);
  };
}

function classRow(each) {
  return make("tr", {}, make("th", {scope: "row"}, link(hrefOfClass(each.name), each.name)),
    make("td", {}, each.description), make("td", {class: "quiet"}, each.association ? "association" : ""));
}

function listOf(classes) {
  const find = make("input", {type: "search", id: "find", spellcheck: "false", placeholder: "part of a name or description"});
  const count = make("span", {class: "quiet", role: "status"});
  const body = make("tbody", {});
  const show = () => {
    const wanted = find.value.toLowerCase();
    const found = classes.filter((each) => (each.name + " " + each.description).toLowerCase().includes(wanted));
    replace(count, found.length + " of " + classes.length + " classes");
    replace(body, found.map(classRow));
  };
  find.addEventListener("input", show);
  show();
  return [make("div", {class: "toolbar"}, make("label", {}, "Find ", find), count),
    make("div", {class: "scroll"}, make("table", {class: "list"},
      make("thead", {}, make("tr", {}, ["Class", "What it stands for", "Kind"].map((head) => make("th", {scope: "col"}, head)))),
      body))];
}

export async function showClasses(visit, name = "", wanted = "") {
  if (name)
    return showInstances(visit, name, wanted);
  const place = make("div", {});
  visit.begin("Classes", place);
  return visit.fill(place, async () => listOf(await ask("classes", {}, visit.signal)));
}

function namespaceChoice(namespaces, changed) {
  if (namespaces.length < 2)
    return null;
  return make("label", {}, "Namespace ", make("select", {change: (event) => changed(event.target.value)},
    namespaces.map((each) => make("option", {value: each}, each))));
}

function methodLinks(methods) {
  if (!methods.length)
    return null;
  return make("p", {}, "Methods: ", methods.map((method, at) =>
    [at ? ", " : "", link(hrefOfMethod(method.class, method.method), method.method)]));
}

/** What the class is, beside its instances, which do not wait for it. */
async function describe(visit, name, place, choice, changed) {
  const [info, {methods}] = await Promise.all([ask("classes/" + encodeURIComponent(name), {}, visit.signal),
    ask("methods", {}, visit.signal)]);
  replace(place, make("p", {}, info.description), methodLinks(methods.filter((method) => method.class === info.name)));
  replace(choice, namespaceChoice(info.namespaces, changed));
}

async function showInstances(visit, name, wanted) {
  let namespace = "";
  const about = make("div", {});
  const choice = make("span", {});
  const trouble = make("div", {});
  const count = make("span", {class: "quiet", id: "count", role: "status"}, "Reading …");
  const find = make("input", {type: "search", id: "find", spellcheck: "false", placeholder: "text of any property",
    value: wanted});
  const read = (from, rows, sort, descending) => ask("classes/" + encodeURIComponent(name) + "/instances",
    {from, count: rows, sort, descending: descending ? 1 : "", find: find.value, namespace}, visit.signal);
  const told = (answer, problem) => {
    replace(trouble, problem);
    replace(count, !answer ? "" : (answer.matching === answer.total ? "" : answer.matching + " of ") + answer.total +
        (answer.total === 1 ? " instance" : " instances"));
  };
  const grid = new Grid("Instances of " + name, read, (row) => ({href: hrefOfObject(row.path), text: shortName(row.path)}), told);
  find.addEventListener("input", whenTyped(() => grid.restart()));
  visit.begin(name, about, make("div", {class: "toolbar"}, make("label", {}, "Find ", find), choice, count), trouble, grid.node);
  await describe(visit, name, about, choice, (chosen) => {
    namespace = chosen;
    grid.restart();
  }).catch(() => {}); // what fails here fails in the table as well, which tells it
}
