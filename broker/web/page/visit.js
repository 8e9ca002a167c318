// A view while it is looked at: what it started ends with it.

import {append, badge, button, make, replace, visible} from "./dom.js";
import {Refused} from "./api.js";

export class Visit {
  constructor(main) {
    this.main = main;
    this._ending = new AbortController();
  }

  get signal() { return this._ending.signal; }
  get over() { return this.signal.aborted; }

  end() {
    this._ending.abort();
    this.hurry();
  }

  /** Empties the place and writes the heading, which is where keys go on from. */
  begin(title, ...children) {
    document.title = visible(title) + " – Fibre Channel adapters";
    replace(this.main, make("h1", {tabindex: "-1"}, title), children);
  }

  /** Does `work` now and again when `delay()` milliseconds have passed since it ended; nothing while nobody looks, and at
   *  once when somebody looks again. */
  async repeat(work, delay) {
    document.addEventListener("visibilitychange", () => this.hurry(), {signal: this.signal});
    while (!this.over) {
      if (!document.hidden)
        await work();
      if (!this.over)
        await this._pause(delay());
    }
  }

  /** Ends the pause before the next repetition. */
  hurry() { this._wake?.(); }

  _pause(milliseconds) {
    return new Promise((resolve) => {
      const timer = setTimeout(resolve, milliseconds);
      this._wake = () => { clearTimeout(timer); resolve(); };
    });
  }

  /** Fills `place` with what `work` makes, or with why there is none and a way to try again. */
  async fill(place, work, waiting = "Reading …") {
    replace(place, make("p", {class: "quiet", "aria-busy": "true"}, waiting));
    try {
      const made = await work();
      if (!this.over)
        replace(place, made);
    } catch (error) {
      if (this.over)
        return;
      const again = button("Try again", () => this.fill(place, work, waiting));
      replace(place, unread(error), make("p", {}, again));
    }
  }
}

/** What went wrong, for people. */
export function failure(error) {
  if (!(error instanceof Refused))
    console.error(error);
  const status = error.status ? error.status + ": " : "";
  return make("p", {class: "notice critical", role: "alert"}, status + error.message);
}

/** The same of what could not be read: who logs in may be let to. */
export function unread(error) {
  const node = failure(error);
  node.classList.add("unread");
  return node;
}

/** The classes that did not answer, where the rest is shown. */
export function silent(failures) {
  return failures.length === 0 ? null : section("Classes that do not answer", make("ul", {class: "problems failures"},
    failures.map((text) => make("li", {}, badge("warning", "warning"), " ", text))));
}

/** Of one class. */
export function silentOf(className, failures) {
  return silent(failures.filter((text) => text.startsWith(className + ":")));
}

/** A section with a heading. */
export function section(title, ...children) {
  return append(make("section", {}, make("h2", {}, title)), children);
}
