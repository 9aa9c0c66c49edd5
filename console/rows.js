// A table of any number of rows: only those that can be seen are in the document.

import { h } from "./dom.js";

const OVERSCAN = 8; // rows beyond the visible ones, so that the keyboard finds the next one

export class WindowedTable {
  /** `columns`: [{title, className}]; `cells(row)` gives the contents of a row's cells. */
  constructor(caption, columns, cells) {
    this.cells = cells;
    this.columns = columns;
    this.rows = [];
    this.first = 0;
    this.last = 0;
    this.rowHeight = 0;
    this.above = h("div", { class: "filler", role: "presentation" });
    this.below = h("div", { class: "filler", role: "presentation" });
    this.body = h("div", { role: "rowgroup", class: "rows" });
    const heads = columns.map((column) => h("div", { role: "columnheader", class: column.className }, column.title));
    this.element = h("div", { role: "table", class: "table", "aria-label": caption },
      h("div", { role: "rowgroup", class: "head" }, h("div", { role: "row", class: "row", "aria-rowindex": 1 }, heads)),
      this.above, this.body, this.below);
    this.onScroll = () => this.#schedule();
    this.onKey = (event) => this.#move(event);
    this.body.addEventListener("keydown", this.onKey);
  }

  /** Call it when the element is in the document. */
  start() {
    addEventListener("scroll", this.onScroll, { passive: true });
    addEventListener("resize", this.onScroll, { passive: true });
    this.#render(true);
  }

  stop() {
    removeEventListener("scroll", this.onScroll);
    removeEventListener("resize", this.onScroll);
  }

  show(rows) {
    this.rows = rows;
    this.element.setAttribute("aria-rowcount", rows.length + 1);
    if (this.element.isConnected) this.#render(true);
  }

  #schedule() {
    if (this.frame) return;
    this.frame = requestAnimationFrame(() => {
      this.frame = 0;
      this.#render(false);
    });
  }

  #rowElement(index) {
    const contents = this.cells(this.rows[index]);
    const cells = contents.map((content, i) => h("div", { role: i === 0 ? "rowheader" : "cell", class: this.columns[i].className }, content));
    return h("div", { role: "row", class: "row", "aria-rowindex": index + 2, "data-index": index }, cells);
  }

  #measure() {
    if (this.rows.length === 0) return;
    if (this.body.children.length === 0) this.body.append(this.#rowElement(0));
    this.rowHeight = this.body.firstElementChild.getBoundingClientRect().height || this.rowHeight || 40;
  }

  #render(isFresh) {
    if (isFresh) this.body.replaceChildren();
    this.#measure();
    const top = this.above.getBoundingClientRect().top;
    const height = this.rowHeight || 40;
    const begin = Math.max(0, Math.min(this.rows.length, Math.floor(-top / height)) - OVERSCAN);
    const end = Math.min(this.rows.length, Math.max(begin, Math.ceil((innerHeight - top) / height) + OVERSCAN));
    this.above.style.height = `${begin * height}px`;
    this.below.style.height = `${(this.rows.length - end) * height}px`;
    if (!isFresh && begin === this.first && end === this.last) return;
    this.#replace(begin, end, isFresh);
  }

  /** Rows that stay visible stay in the document, with the focus. */
  #replace(begin, end, isFresh) {
    const kept = new Map();
    if (!isFresh) for (const row of this.body.children) kept.set(Number(row.dataset.index), row);
    for (const [index, row] of kept) if (index < begin || index >= end) row.remove();
    if (isFresh) this.body.replaceChildren();
    let next = this.body.firstElementChild;
    for (let index = begin; index < end; index += 1) {
      const own = kept.get(index);
      if (own) next = own.nextElementSibling;
      else this.body.insertBefore(this.#rowElement(index), next);
    }
    this.first = begin;
    this.last = end;
  }

  #move(event) {
    const step = { ArrowDown: 1, ArrowUp: -1 }[event.key];
    const row = event.target.closest("[data-index]");
    if (!step || !row) return;
    const index = Number(row.dataset.index) + step;
    if (index < 0 || index >= this.rows.length) return;
    event.preventDefault();
    const find = () => this.body.querySelector(`[data-index="${index}"] a`);
    if (!find()) this.#render(false);
    find()?.focus();
    find()?.closest("[data-index]").scrollIntoView({ block: "nearest" });
  }
}
