// A change on trial: unless somebody confirms it in time, the former values are written back.
//
// The trial runs in this page. It cannot write where the server cannot be reached; then it goes on trying.

import { h } from "./dom.js";
import { t } from "./texts.js";

const RETRY_MILLISECONDS = 2000;

/** Whether two values have the same effect: nothing, the empty text and the empty list are one. */
export function sameValue(a, b) {
  const list = (value) => (Array.isArray(value) ? value : value === null || value === undefined || value === "" ? [] : [value]);
  return JSON.stringify(list(a)) === JSON.stringify(list(b));
}

/** What is sent for a value that was not there. */
const orEmpty = (value, like) => value ?? (Array.isArray(like) ? [] : "");

export class Trial {
  /** `before` and `after`: the values of the changed properties. `done(text)` is called once, at the end. */
  constructor({ client, path, before, after, seconds, done }) {
    Object.assign(this, { client, path, after, done });
    this.before = Object.fromEntries(Object.keys(after).map((name) => [name, orEmpty(before[name], after[name])]));
    this.ends = Date.now() + seconds * 1000;
    this.text = h("span", { role: "timer", "aria-live": "off" });
    this.keepButton = h("button", { type: "button", class: "primary", onclick: () => this.#end(t("kept")) }, t("keep"));
    const back = h("button", { type: "button", onclick: () => this.rollBack() }, t("rollBack"));
    this.element = h("section", { class: "notice trial", "aria-label": t("confirmWithin") }, this.text,
      h("span", { class: "buttons" }, this.keepButton, back));
    this.onHide = () => this.#writeBack({ keepalive: true }).catch(() => {});
  }

  start() {
    addEventListener("pagehide", this.onHide);
    this.timer = setInterval(() => this.#tick(), 250);
    this.#tick();
    this.keepButton.focus();
  }

  #tick() {
    const left = Math.ceil((this.ends - Date.now()) / 1000);
    this.text.textContent = t("applied", { count: Math.max(0, left) });
    if (left <= 0) this.rollBack();
  }

  /** Writes the former values back, unless somebody else has changed them since. */
  async rollBack() {
    clearInterval(this.timer);
    if (this.isRollingBack) return;
    this.isRollingBack = true;
    try {
      const now = (await this.client.getInstance(this.path)).properties;
      const changed = Object.keys(this.after).find((name) => !sameValue(now[name], this.after[name]));
      if (changed) return this.#end(t("changedMeanwhile", { property: changed }), "warning");
      await this.#writeBack();
      this.#end(t("rolledBack"));
    } catch (error) {
      this.isRollingBack = false;
      if (!error.isLost) return this.#end(t("rollBackFailed", { why: error.message }), "error");
      this.text.textContent = t("rollBackLost");
      setTimeout(() => this.rollBack(), RETRY_MILLISECONDS);
    }
  }

  #writeBack(options) {
    return this.client.modify(this.path, this.before, options);
  }

  #end(text, kind = "info") {
    clearInterval(this.timer);
    removeEventListener("pagehide", this.onHide);
    this.element.remove();
    this.done(text, kind);
  }
}
