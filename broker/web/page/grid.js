// A table of any number of rows of which the port gives pages: what is on the screen is there, and little more.

import {append, link, make, replace} from "./dom.js";
import {givenByClass} from "./paths.js";
import {unread} from "./visit.js";

const rowHeight = 30; // pixels, as in the style
const pageRows = 100;
const mostPages = 30; // that are kept
const margin = 10; // rows above and below the screen

export class Grid {
  /** `read(from, count, sort, descending)` gives {matching, columns, rows: [{path, values}]}; `open(row)` {href, text}. */
  constructor(caption, read, open, told) {
    this._read = read;
    this._open = open;
    this._told = told;
    this._head = make("tr", {});
    this._body = make("tbody", {});
    this._table = make("table", {class: "grid", "aria-label": caption}, make("thead", {}, this._head), this._body);
    this.node = make("div", {class: "scroll tall", tabindex: "0", role: "region", "aria-label": caption,
      scroll: () => this._paint()}, this._table);
    this._sort = "";
    this._descending = false;
    this.restart();
  }

  /** What was read is no longer what is wanted. */
  async restart() {
    this._pages = new Map();
    this._matching = 0;
    this._columns = null;
    this._series = {};
    this.node.scrollTop = 0;
    await this._load(0);
  }

  async _load(page) {
    const series = this._series;
    this._pages.set(page, null); // on its way
    this.node.setAttribute("aria-busy", "true");
    try {
      const answer = await this._read(page * pageRows, pageRows, this._sort, this._descending);
      if (series !== this._series)
        return;
      this._take(page, answer);
      this._told(answer, null);
    } catch (error) {
      if (error.name === "AbortError" || series !== this._series)
        return;
      this._pages.delete(page);
      this._told(null, unread(error));
    }
    this.node.removeAttribute("aria-busy");
  }

  _take(page, answer) {
    if (!this._columns)
      this._showHeads(answer);
    this._matching = answer.matching;
    this._pages.set(page, answer.rows);
    if (this._pages.size > mostPages)
      this._pages.delete(this._pages.keys().next().value);
    this._table.setAttribute("aria-rowcount", this._matching + 1);
    this._paint();
  }

  /** Columns without a value on the first page, and those that say the same of all, come last. */
  _showHeads({columns, rows}) {
    const isTelling = (at) => rows.some((row) => row.values[at] !== null) && !givenByClass.has(columns[at].toLowerCase());
    const all = [...columns.keys()];
    this._order = [...all.filter(isTelling), ...all.filter((at) => !isTelling(at))];
    this._columns = this._order.map((at) => columns[at]);
    const focused = this._head.contains(document.activeElement) ? document.activeElement.textContent : null;
    replace(this._head, make("th", {scope: "col", class: "opens"}, "Instance"), this._columns.map((column) => {
      const isSorted = column === this._sort;
      const order = isSorted ? (this._descending ? "descending" : "ascending") : "none";
      return make("th", {scope: "col", "aria-sort": order},
        make("button", {type: "button", click: () => this._sortBy(column)}, column));
    }));
    if (focused)
      [...this._head.querySelectorAll("button")].find((each) => each.textContent === focused)?.focus();
  }

  _sortBy(column) {
    this._descending = this._sort === column && !this._descending;
    this._sort = column;
    this.restart();
  }

  _rowAt(index) {
    return this._pages.get(Math.floor(index / pageRows))?.[index % pageRows];
  }

  _missingPages(from, to) {
    const missing = [];
    for (let page = Math.floor(from / pageRows); page * pageRows < to; page++)
      if (!this._pages.has(page))
        missing.push(page);
    return missing;
  }

  /** Shows the rows of the screen between two rows as high as all that are not shown. */
  _paint() {
    const from = Math.max(0, Math.floor(this.node.scrollTop / rowHeight) - margin);
    const to = Math.min(this._matching, from + Math.ceil(innerHeight / rowHeight) + 2 * margin);
    const focused = this._body.contains(document.activeElement) ? document.activeElement.dataset.row : null;
    const rows = [];
    for (let index = from; index < to; index++)
      rows.push(this._rowNode(index));
    replace(this._body, this._spacer(from), rows, this._spacer(this._matching - to));
    if (focused)
      this._body.querySelector(`[data-row="${Number(focused)}"]`)?.focus({preventScroll: true});
    for (const page of this._missingPages(from, to))
      this._load(page);
  }

  _spacer(rows) {
    if (rows <= 0)
      return null;
    const spacer = make("tr", {"aria-hidden": "true"});
    spacer.style.height = rows * rowHeight + "px";
    return spacer;
  }

  _rowNode(index) {
    const row = this._rowAt(index);
    const node = make("tr", {"aria-rowindex": index + 2});
    if (!row)
      return append(node, make("td", {class: "quiet", colspan: this._columns.length + 1}, "…"));
    const {href, text} = this._open(row);
    const anchor = link(href, text);
    anchor.dataset.row = index;
    return append(node, make("th", {scope: "row", class: "opens", title: text}, anchor),
      this._order.map((at) => make("td", {title: row.values[at]}, row.values[at])));
  }
}
