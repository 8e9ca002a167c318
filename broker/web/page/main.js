// The frame of the page: which view an address names, and who looks at it.

import {button, make, replace, tell} from "./dom.js";
import {logOut, renewSession, session} from "./api.js";
import {askToLogIn} from "./dialogs.js";
import {unread, Visit} from "./visit.js";
import {showHost} from "./host.js";

// A view's module is loaded when it is first looked at; the host's comes with the page.
const views = {
  "": async () => showHost,
  ports: async () => (await import("./ports.js")).showPorts,
  classes: async () => (await import("./classes.js")).showClasses,
  object: async () => (await import("./instance.js")).showInstance,
  logs: async () => (await import("./logs.js")).showLogs,
  diagnostics: async () => (await import("./diagnostics.js")).showDiagnostics,
  methods: async () => (await import("./methods.js")).showMethods,
};

const main = document.getElementById("main");
let visit = null;
let navigated = false;

function partsOf(hash) {
  try {
    return hash.replace(/^#\/?/, "").split("/").map(decodeURIComponent);
  } catch {
    return ["unreadable"];
  }
}

function markCurrent(name) {
  for (const anchor of document.querySelectorAll("#views a")) {
    const isCurrent = anchor.getAttribute("href") === "#/" + (name === "object" ? "classes" : name);
    if (isCurrent)
      anchor.setAttribute("aria-current", "page");
    else
      anchor.removeAttribute("aria-current");
  }
}

async function showCurrent() {
  const [name, ...words] = partsOf(location.hash);
  visit?.end();
  const current = visit = new Visit(main);
  markCurrent(name);
  try {
    if (!Object.hasOwn(views, name)) {
      current.begin("There is no such view");
      return;
    }
    const show = await views[name]();
    if (current.over)
      return;
    const shown = show(current, ...words);
    if (navigated) {
      scrollTo(0, 0);
      main.querySelector("h1")?.focus({preventScroll: true});
    }
    navigated = true;
    await shown;
  } catch (error) {
    if (!current.over)
      main.append(unread(error));
  }
}

/** What could not be read before is read now; a form keeps what stands in it. */
async function enter() {
  if (await askToLogIn() && main.querySelector(".unread"))
    await showCurrent();
}

async function leave() {
  try {
    await logOut();
    tell("Logged out");
  } catch (error) {
    tell(error.message); // nobody may read here without a name
    await showCurrent();
  }
}

/** Where others than the host's own people come to, nobody reads without a name. */
async function begin() {
  try {
    await renewSession();
  } catch (error) {
    if (error.http === 401)
      await enter();
  }
}

function showSession() {
  const place = document.getElementById("session");
  const version = document.getElementById("version");
  replace(version, session.version, session.simulated ? make("span", {class: "badge quiet"}, "simulated") : null);
  const who = session.user ? "Logged in as " + session.user : "Not logged in";
  const act = session.user ? button("Log out", leave) : button("Log in", enter);
  replace(place, make("span", {}, who), act,
    session.mayChange ? null : make("span", {class: "why"}, "Read only" + (session.whyNot ? ": " + session.whyNot : "")));
}

document.addEventListener("session", showSession);
document.getElementById("skip").addEventListener("click", (event) => {
  event.preventDefault();
  main.focus();
});
addEventListener("hashchange", showCurrent);
showCurrent();
begin();
