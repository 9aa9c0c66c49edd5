// The dialog that changes settings: values, a preview of what would be sent, and then the server's answer.

import { ACCESS_DENIED } from "./cimxml.js";
import { field, h, newId, openDialog } from "./dom.js";
import { domainProblem, listProblem, sameServer, sameSuffix, serverProblem, suffixProblem } from "./rules.js";
import { t } from "./texts.js";
import { Trial, sameValue } from "./trial.js";

const CONFIRM_SECONDS = [30, 60, 120, 300];
const USUAL_SECONDS = 60;

const linesOf = (text) => text.split("\n").map((line) => line.trim()).filter((line) => line !== "");

/** The settings that can be changed, by property: how they are entered, and what is refused. */
const kinds = {
  DNSServerAddresses: { label: "servers", hint: "oneEachLine", isList: true, problem: (texts) => listProblem(texts, serverProblem, sameServer) },
  DNSSuffixesToAppend: { label: "suffixes", hint: "suffixHint", isList: true, problem: (texts) => listProblem(texts, suffixProblem, sameSuffix) },
  DomainName: { label: "domain", hint: "domainHint", isList: false, problem: (text) => (domainProblem(text) ? { text, problem: "notADomain" } : null) },
};

const shown = (value) => {
  const list = Array.isArray(value) ? value : value ? [value] : [];
  return list.length === 0 ? t("none") : list.map((each) => h("div", {}, each));
};

export class ChangeDialog {
  /** `target`: {what, path, properties: [name], origin}. `app` gets the trial and the result. */
  constructor(app, target) {
    Object.assign(this, { app, target });
    const titleId = newId("title");
    this.title = h("h2", { id: titleId }, t("changeOf", { what: target.what }));
    this.content = h("div", {});
    this.problem = h("p", { class: "problem", role: "alert" });
    this.dialog = h("dialog", { "aria-labelledby": titleId }, this.title, this.content, this.problem);
  }

  async open() {
    openDialog(this.dialog);
    try {
      this.before = (await this.app.client.getInstance(this.target.path)).properties;
    } catch (error) {
      this.#tell(error);
      this.content.replaceChildren(this.#buttons());
      return;
    }
    this.#edit(Object.fromEntries(this.target.properties.map((name) => [name, this.before[name]])));
  }

  #buttons(...others) {
    const cancel = h("button", { type: "button", onclick: () => this.dialog.close() }, t("cancel"));
    return h("div", { class: "buttons" }, cancel, ...others);
  }

  #edit(values) {
    this.problem.textContent = "";
    const controls = this.target.properties.map((name) => {
      const kind = kinds[name];
      const control = kind.isList ? h("textarea", { rows: 4, spellcheck: "false", name }) : h("input", { type: "text", spellcheck: "false", name });
      control.value = kind.isList ? (values[name] ?? []).join("\n") : values[name] ?? "";
      return { name, kind, control };
    });
    const choice = (seconds) => h("option", { value: seconds, selected: seconds === (this.seconds ?? USUAL_SECONDS) },
      seconds === 0 ? t("withoutConfirm") : t("seconds", { count: seconds }));
    const seconds = h("select", { name: "confirm" }, [...CONFIRM_SECONDS, 0].map(choice));
    const submit = (event) => {
      event.preventDefault();
      this.seconds = Number(seconds.value);
      this.#preview(controls);
    };
    const form = h("form", { onsubmit: submit, novalidate: true },
      controls.map(({ kind, control }) => field(t(kind.label), control, t(kind.hint))),
      field(t("confirmWithin"), seconds, t("confirmHint")),
      this.#buttons(h("button", { type: "submit", class: "primary" }, t("preview"))));
    this.content.replaceChildren(form);
    controls[0].control.focus();
  }

  #valuesOf(controls) {
    return Object.fromEntries(controls.map(({ name, kind, control }) => [name, kind.isList ? linesOf(control.value) : control.value.trim()]));
  }

  #preview(controls) {
    const values = this.#valuesOf(controls);
    for (const { name, kind, control } of controls) {
      const found = kind.problem(values[name]);
      control.removeAttribute("aria-invalid");
      if (!found) continue;
      this.problem.textContent = t(found.problem, { text: found.text });
      control.setAttribute("aria-invalid", "true");
      control.focus();
      return;
    }
    const changed = Object.fromEntries(Object.entries(values).filter(([name, value]) => !sameValue(value, this.before[name])));
    this.problem.textContent = "";
    this.#showPreview(values, changed);
  }

  #showPreview(values, changed) {
    const names = Object.keys(changed);
    const rows = names.map((name) => h("tr", {}, h("th", { scope: "row" }, name), h("td", { "data-label": t("now") }, shown(this.before[name])),
      h("td", { "data-label": t("after") }, shown(changed[name]))));
    const table = h("table", { class: "preview" },
      h("thead", {}, h("tr", {}, [t("property"), t("now"), t("after")].map((text) => h("th", { scope: "col" }, text)))), h("tbody", {}, rows));
    const { origin } = this.target;
    const warnings = origin.FileName && !origin.File
      ? names.map((name) => h("p", { class: "warning" }, t("fileMissing", { property: name, file: origin.FileName, name: origin.FileName.replace("ifcfg-", "") })))
      : [];
    const path = this.target.path;
    const back = h("button", { type: "button", onclick: () => this.#edit(values) }, t("edit"));
    const apply = h("button", { type: "button", class: "primary", onclick: () => this.#apply(changed, apply) }, t("apply"));
    this.content.replaceChildren(
      names.length === 0 ? h("p", {}, t("nothingChanges")) : h("div", {}, h("h3", {}, t("previewTitle")), table,
        h("p", { class: "object" }, `${path.className}.${path.keys.map(([name, value]) => `${name}="${value}"`).join(",")}`), warnings),
      this.#buttons(back, names.length > 0 && apply));
    (names.length > 0 ? apply : back).focus();
  }

  async #apply(changed, button) {
    button.disabled = true;
    this.problem.textContent = "";
    const { client } = this.app;
    try {
      await client.modify(this.target.path, changed);
    } catch (error) {
      button.disabled = false;
      this.#tell(error);
      if (error.code && error.code !== ACCESS_DENIED) await this.#guardWhatWasStored(changed);
      return;
    }
    const now = (await client.getInstance(this.target.path).catch(() => null))?.properties;
    const lost = now && Object.keys(changed).find((name) => !sameValue(now[name], changed[name]));
    if (lost) {
      button.disabled = false;
      this.problem.textContent = t("notStored", { property: lost, value: [now[lost] ?? t("none")].flat().join(" ") });
      return;
    }
    this.#succeed(changed);
  }

  /** A change that failed may be stored in part, for example if the host did not take it: that can be taken back. */
  async #guardWhatWasStored(changed) {
    const now = (await this.app.client.getInstance(this.target.path).catch(() => null))?.properties;
    const stored = Object.keys(changed).filter((name) => now && !sameValue(now[name], this.before[name]));
    if (stored.length === 0) return;
    this.#startTrial(Object.fromEntries(stored.map((name) => [name, now[name]])));
  }

  #startTrial(after) {
    this.app.startTrial(new Trial({
      client: this.app.client, path: this.target.path, before: this.before, after, seconds: this.seconds || USUAL_SECONDS,
      done: (text, kind) => this.app.trialEnded(text, kind),
    }));
  }

  #succeed(changed) {
    this.dialog.close();
    if (this.seconds > 0) this.#startTrial(changed);
    else this.app.tell(t("stored"));
    this.app.reload();
  }

  #tell(error) {
    if (error.code === ACCESS_DENIED || error.status === 401) this.problem.textContent = t("denied");
    else if (error.isLost) this.problem.textContent = t("lostFirst");
    else this.problem.textContent = t("refused", { why: error.message });
  }
}
