// The start: what is wrong with the host, and a picture of it.

import {badge, button, link, make, renew, replace} from "./dom.js";
import {ask} from "./api.js";
import {hrefOfObject} from "./paths.js";
import {section, silent, unread} from "./visit.js";
import {descendants, pictureOf} from "./topology.js";

const interval = 10000; // milliseconds between two looks at the host

function problemItem(problem) {
  const what = [problem.kind, " ", make("span", {class: "name"}, problem.name)];
  return make("li", {}, badge(problem.severity, problem.severity), " ", make("strong", {}, problem.text), " ",
    problem.path ? link(hrefOfObject(problem.path), what) : make("span", {}, what));
}

function noProblem(host) {
  const notice = (title, style, text) => section(title, make("p", {class: "notice " + style, id: "problems"}, text));
  if (host.failures.length > 0)
    return notice("No problem is known", "warning", "Not all of the host could be read.");
  if (descendants(host.root, "FC port").length === 0)
    return notice("No ports", "quiet", "The provider knows no port of this host.");
  return notice("Nothing is wrong", "ok", "All ports are up and all values within their limits.");
}

function problemsOf(host) {
  const {problems} = host;
  return problems.length === 0 ? noProblem(host) : section(problems.length === 1 ? "1 problem" : problems.length + " problems",
    make("ul", {class: "problems", id: "problems"}, problems.map(problemItem)));
}

function factsOf(facts) {
  return make("dl", {class: "facts"}, facts.map(({label, text}) => [make("dt", {}, label), make("dd", {}, text)]));
}

function partsOf(root) {
  const parts = root.children.filter((child) => child.kind !== "Card" && !hasCards(child));
  if (parts.length === 0)
    return null;
  return make("details", {}, make("summary", {}, "Other parts (" + parts.length + ")"),
    make("ul", {class: "plain"}, parts.map((part) => make("li", {}, part.kind, " ",
      part.path ? link(hrefOfObject(part.path), part.name) : part.name,
      make("span", {class: "quiet"}, " " + part.facts.map((fact) => fact.text).join(", "))))));
}

function hasCards(node) {
  return node.children.some((child) => child.kind === "Card" || hasCards(child));
}

/** Fills the places with a host; the picture is made for the width that there is. */
function paint(places, host) {
  renew(places.problems, problemsOf(host));
  renew(places.failures, silent(host.failures));
  const name = host.root.name || "This host";
  renew(places.facts, section(name, factsOf(host.root.facts), partsOf(host.root)));
  renew(places.picture, pictureOf(host, places.picture.clientWidth));
}

export async function showHost(visit) {
  const places = {problems: make("div", {}), failures: make("div", {}), facts: make("div", {}),
    picture: make("div", {class: "picture"})};
  const trouble = make("div", {});
  let host = null;
  const read = async () => {
    try {
      host = await ask("host", {}, visit.signal);
      replace(trouble);
      paint(places, host);
    } catch (error) {
      if (!visit.over)
        replace(trouble, unread(error));
    }
  };
  visit.begin("Host", trouble, places.problems, places.failures,
    section("Topology", places.picture), places.facts,
    make("p", {}, button("Read again", () => visit.hurry())));
  replace(places.problems, section("Looking for problems", make("p", {class: "quiet", "aria-busy": "true"}, "Reading the host …")));
  let width = places.picture.clientWidth;
  const resized = new ResizeObserver(() => {
    if (host && places.picture.clientWidth !== width)
      renew(places.picture, pictureOf(host, width = places.picture.clientWidth));
  });
  resized.observe(places.picture);
  visit.signal.addEventListener("abort", () => resized.disconnect());
  await visit.repeat(read, () => interval);
}
