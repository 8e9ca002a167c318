// The start: what is wrong with the host, and a picture of it.

import {badge, button, link, make, replace} from "./dom.js";
import {ask, jsonText} from "./api.js";
import {hrefOfObject} from "./paths.js";
import {failure, section} from "./visit.js";
import {pictureOf} from "./topology.js";

const interval = 10000; // milliseconds between two looks at the host

function problemItem(problem) {
  const what = [problem.kind, " ", make("span", {class: "name"}, problem.name)];
  return make("li", {}, badge(problem.severity, problem.severity), " ", make("strong", {}, problem.text), " ",
    problem.path ? link(hrefOfObject(problem.path), what) : make("span", {}, what));
}

function problemsOf(host) {
  const title = host.problems.length === 0 ? "Nothing is wrong"
    : host.problems.length === 1 ? "1 problem" : host.problems.length + " problems";
  return section(title, host.problems.length
    ? make("ul", {class: "problems", id: "problems"}, host.problems.map(problemItem))
    : make("p", {class: "notice ok", id: "problems"}, "All ports are up and all values within their limits."));
}

export function failuresOf(host) {
  if (!host.failures?.length)
    return null;
  return section("Classes that do not answer", make("ul", {class: "problems"},
    host.failures.map((text) => make("li", {}, badge("warning", "warning"), " ", text))));
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
  replace(places.problems, problemsOf(host));
  replace(places.failures, failuresOf(host));
  const name = host.root.name || "This host";
  replace(places.facts, section(name, factsOf(host.root.facts), partsOf(host.root)));
  replace(places.picture, pictureOf(host, places.picture.clientWidth));
}

export async function showHost(visit) {
  const places = {problems: make("div", {}), failures: make("div", {}), facts: make("div", {}),
    picture: make("div", {class: "picture"})};
  const trouble = make("div", {});
  let host = null;
  let painted = "";
  const read = async () => {
    try {
      host = await ask("host", {}, visit.signal);
      replace(trouble);
      const text = jsonText(host);
      if (text !== painted) // or a link would lose the focus
        paint(places, host);
      painted = text;
    } catch (error) {
      if (!visit.over)
        replace(trouble, failure(error));
    }
  };
  visit.begin("Host", trouble, places.problems,
    section("Topology", places.picture), places.failures, places.facts,
    make("p", {}, button("Read again", () => visit.hurry())));
  replace(places.problems, section("Looking for problems", make("p", {class: "quiet", "aria-busy": "true"}, "Reading the host …")));
  let width = places.picture.clientWidth;
  const resized = new ResizeObserver(() => {
    if (host && places.picture.clientWidth !== width)
      replace(places.picture, pictureOf(host, width = places.picture.clientWidth));
  });
  resized.observe(places.picture);
  visit.signal.addEventListener("abort", () => resized.disconnect());
  await visit.repeat(read, () => interval);
}
