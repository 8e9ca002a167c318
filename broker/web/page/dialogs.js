// Questions that a person must answer before the page goes on. The browser keeps the focus inside, closes them with
// Escape and gives the focus back.

import {append, button, make, replace, tell} from "./dom.js";
import {logIn, Refused, session} from "./api.js";
import {failure} from "./visit.js";

let dialogs = 0;

/**
 * Shows a dialog until `close(result)` is called or it is left, as by going to another view; resolves to the result, null
 * when it was left.
 */
function show(title, build) {
  const id = "dialog-title-" + ++dialogs;
  let before = document.activeElement;
  const dialog = make("dialog", {"aria-labelledby": id}, make("h2", {id}, title));
  return new Promise((resolve) => {
    let result = null;
    const close = (value) => {
      result = value;
      dialog.close();
    };
    append(dialog, build(close));
    const leave = () => {
      before = null; // the other view takes the focus
      dialog.close();
    };
    addEventListener("hashchange", leave, {capture: true}); // before the view, which could not take it
    dialog.addEventListener("close", () => {
      removeEventListener("hashchange", leave, {capture: true});
      dialog.remove();
      if (before?.isConnected)
        before.focus();
      resolve(result);
    });
    document.body.append(dialog);
    dialog.showModal();
    dialog.querySelector("input, [data-first]")?.focus();
  });
}

/** Asks whether to do what changes something; true for yes. */
export async function confirmed(question, details, yes) {
  const answer = await show(question, (close) => [
    details,
    make("div", {class: "buttons"},
      button("Cancel", () => close(false), {"data-first": true}),
      button(yes, () => close(true), {class: "main danger"})),
  ]);
  return answer === true;
}

function field(label, attributes) {
  const input = make("input", {required: true, spellcheck: "false", ...attributes});
  return [input, make("label", {class: "field"}, label, input)];
}

/** Asks for name and password; true when the port knows them. */
export async function askToLogIn(reason = "") {
  const answer = await show("Log in", (close) => {
    const [user, userField] = field("User", {name: "user", autocomplete: "username"});
    const [password, passwordField] = field("Password", {name: "password", type: "password", autocomplete: "current-password"});
    const problem = make("div", {});
    const send = async () => {
      if (!user.form.reportValidity())
        return;
      try {
        await logIn(user.value, password.value);
        tell("Logged in as " + session.user);
        close(true);
      } catch (error) {
        replace(problem, failure(error));
        password.value = "";
        password.focus();
      }
    };
    return make("form", {submit: (event) => event.preventDefault()}, reason ? make("p", {}, reason) : null, userField, passwordField, problem,
      make("p", {class: "quiet"}, "Name and password stay in the memory of this page until it is left."),
      make("div", {class: "buttons"}, button("Cancel", () => close(false)), button("Log in", send, {type: "submit", class: "main"})));
  });
  return answer === true;
}

/** Says why the person may only read; true where he wants to be somebody else. */
function tellReader() {
  return show("Only reading is allowed", (close) => [
    make("p", {}, session.whyNot || "This port lets nobody change anything."),
    make("div", {class: "buttons"}, session.user ? button("Log in as somebody else", () => close(true)) : null,
      button("Close", () => close(false), {class: "main", "data-first": true})),
  ]);
}

/** Sees to it that the person may change something. */
export async function mayChange() {
  if (session.mayChange)
    return true;
  if (session.user) {
    if (!await tellReader() || !await askToLogIn())
      return false;
  } else if (!await askToLogIn(session.whyNot)) {
    return false;
  }
  if (!session.mayChange)
    await tellReader();
  return session.mayChange;
}

/** Runs what changes something; null where it could not be, which the person is told in `place`. */
export async function attempted(place, work) {
  try {
    return await work();
  } catch (error) {
    replace(place, failure(error));
    if (error instanceof Refused)
      tell(error.message);
    return null;
  }
}
